// Find as you type and the chosen order, through real keys and menus on the real window.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "TestSuite.h"
#include "store/CatalogueKeys.h"
#include "store/PlayHistory.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ListFinder.h"
#include "ui/main/frmMain.h"

#include <QAction>
#include <QJsonArray>
#include <QJsonDocument>
#include <QLineEdit>
#include <QMimeData>
#include <QProcess>
#include <QScrollBar>
#include <QTimeZone>
#include <QUrl>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestFindAsYouType : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderFixture> m_program;
    std::unique_ptr<frmMain> m_window;

    SimpleListView* list() const { return m_window->ListView1(); }
    QLineEdit* field() const { return m_window->finder()->field(); }
    void openWindow()
    {
        m_window = OpenFilledWindow<frmMain>();
        m_window->resize(760, 560);
    }
    QStringList shownCaptions() const
    {
        QStringList captions;
        for (int i = 0; i < list()->loadedCount(); ++i) {
            if (list()->isItemShown(i))
                captions.append(list()->labN(i).text());
        }
        return captions;
    }
    void type(const QString& text)
    {
        for (QChar c : text)
            QTest::keyClick(QApplication::focusWidget(), c.toLatin1());
    }
    void drop(const QString& file)
    {
        QMimeData mime;
        mime.setUrls({QUrl::fromLocalFile(file)});
        QDragEnterEvent enter(QPoint(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list(), &enter);
        QDropEvent dropped(QPointF(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list(), &dropped);
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderFixture>(false);
        SetPromptHandler([](const PromptRequest&) { return PromptAnswer::Yes; });
        for (const QString& name : {u"racer"_s, u"rampage"_s, u"chess"_s})
            QVERIFY(WriteFile(m_env->path(u"commonappdata/Brimvault/%1/%1.exe"_s.arg(name))));
        for (int i = 0; i < 80; ++i)
            QVERIFY(WriteFile(m_env->path(u"commonappdata/Brimvault/Puzzle%1/puzzle%1.exe"_s.arg(i))));
        // Games start through a runner that ends at once.
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, u"CompatibilityRunner"_s, u"true"_s));
        openWindow();
    }
    void cleanup()
    {
        m_window.reset();
        m_program.reset();
        m_env.reset();
    }

    void typingNarrowsAndEscapeRestores()
    {
        QScrollBar* bar = list()->vbarWindow();
        QVERIFY(bar->isVisible());
        bar->triggerAction(QAbstractSlider::SliderPageStepAdd);
        const int scrolled = bar->value();
        QTest::mouseClick(list(), Qt::LeftButton, {}, QPoint(list()->width() / 2, list()->height() / 2));
        const int selected = list()->currentIndex();
        QVERIFY(selected > 0);
        list()->setFocus();

        type(u"Ram"_s);
        QVERIFY(field()->isVisible());
        QCOMPARE(field()->text(), u"Ram"_s);
        QCOMPARE(shownCaptions(), QStringList {u"rampage"_s});
        QTest::keyClick(field(), Qt::Key_Backspace);
        QCOMPARE(shownCaptions().size(), 2);
        const QString first = list()->GetCurrentData();
        QTest::keyClick(field(), Qt::Key_Right);
        const QString second = list()->GetCurrentData();
        QVERIFY(first != second);
        // The shown items flow from the first cell.
        QCOMPARE(list()->imgN(list()->currentIndex()).geometry().left(), list()->imgN(0).geometry().left() + 80);

        // Enter starts the selected game; with nothing found it starts nothing.
        QTest::keyClick(field(), Qt::Key_Return);
        QCOMPARE(PlayHistory::Read(second).launches, 1);
        type(u"zz"_s);
        QCOMPARE(shownCaptions(), QStringList());
        QTest::keyClick(field(), Qt::Key_Return);
        QCOMPARE(PlayHistory::ReadAll().size(), 1);

        QTest::keyClick(field(), Qt::Key_Escape);
        QVERIFY(!field()->isVisible());
        QCOMPARE(list()->shownCount(), list()->layoutState().itemCount);
        QCOMPARE(list()->currentIndex(), selected);
        QCOMPARE(bar->value(), scrolled);
        QCOMPARE(QApplication::focusWidget(), list());

        QTest::keyClick(m_window.get(), Qt::Key_F, Qt::ControlModifier);
        QVERIFY(field()->isVisible() && field()->hasFocus());
        // Tab moves between the field and the list; a screen reader names the field.
        QCOMPARE(field()->accessibleName(), u"Find a game"_s);
        QTest::keyClick(field(), Qt::Key_Tab);
        QCOMPARE(QApplication::focusWidget(), list());
        QTest::keyClick(list(), Qt::Key_Backtab, Qt::ShiftModifier);
        QCOMPARE(QApplication::focusWidget(), field());
    }

    void changesWhileNarrowedKeepTheNarrowing()
    {
        list()->setFocus();
        type(u"amp"_s);
        QCOMPARE(shownCaptions(), QStringList {u"rampage"_s});
        SetInputHandler([](const InputRequest&) { return std::optional<QString>(u"Chess Master"_s); });
        m_window->menuItem(u"mnuRenameGame"_s)->trigger();
        QCOMPARE(shownCaptions(), QStringList());
        QCOMPARE(list()->GetCurrentData(), QString());

        const QString camper = m_env->path(u"personal/camper.exe"_s);
        const QString other = m_env->path(u"personal/other.exe"_s);
        QVERIFY(WriteFile(camper) && WriteFile(other));
        const int loaded = list()->loadedCount();
        drop(camper);
        drop(other);
        QCOMPARE(list()->loadedCount(), loaded + 2);
        QCOMPARE(shownCaptions(), QStringList {u"camper"_s});
        QCOMPARE(list()->GetCurrentData(), camper);
        PlayHistory::RecordLaunch(camper, QDateTime::currentDateTimeUtc());
        m_window->menuItem(u"mnuRemoveFile"_s)->trigger();
        QCOMPARE(shownCaptions(), QStringList());
        QCOMPARE(list()->loadedCount(), loaded + 1);
        QVERIFY(PlayHistory::Read(camper).isEmpty());
    }

    void orderSurvivesRestartAndMatchesTheListing()
    {
        m_window->menuItem(u"mnuOrderName"_s)->trigger();
        const QStringList sorted = shownCaptions();
        QVERIFY(sorted.indexOf(u"puzzle79"_s) < sorted.indexOf(u"racer"_s));

        m_window.reset();
        openWindow();
        QCOMPARE(shownCaptions(), sorted);
        QVERIFY(m_window->menuItem(u"mnuOrderName"_s)->isChecked());

        // What the window shows is what scripts read, with the history of a game played for a minute.
        list()->setFocus();
        type(u"zle1"_s);
        const QString played = list()->GetCurrentData();
        PlayHistory::RecordLaunch(played, QDateTime(QDate(2026, 11, 23), QTime(22, 0), QTimeZone::utc()));
        PlayHistory::AddPlayTime(played, 61);
        QProcess listing;
        listing.start(
            QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault"), {u"--list"_s, u"--json"_s, u"--find"_s, u"zle1"_s});
        QVERIFY(listing.waitForFinished(60000));
        const QJsonArray games = QJsonDocument::fromJson(listing.readAllStandardOutput()).array();
        QStringList printed;
        for (const QJsonValue& game : games)
            printed << game[u"caption"_s].toString();
        QCOMPARE(printed.size(), 11);
        QCOMPARE(printed, shownCaptions());
        const auto history = [&](int i) {
            return QVariantList({games[i][u"path"_s].toString(), games[i][u"launches"_s].toInt(),
                games[i][u"playSeconds"_s].toInt(), games[i][u"lastPlayed"_s].toString()});
        };
        QCOMPARE(history(0), QVariantList({played, 1, 61, u"2026-11-23T22:00:00Z"_s}));
        QCOMPARE(history(1).mid(1), QVariantList({0, 0, QString()}));
    }
};

BV_REGISTER_TEST(TestFindAsYouType);
#include "tst_findasyoutype.moc"

// The dialog library's classes as the program uses them: created by ProgID, called by name.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "app/ComponentObjects.h"

#include <QFileDialog>
#include <QLabel>
#include <QMessageBox>
#include <QScreen>
#include <QTest>
#include <QUrl>

#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestQuillet : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_env;

    static QObject* keep(CreatedObject& created, const QString& progId)
    {
        created = CreateObject(progId);
        return created.object.get();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        qunsetenv("BRIMVAULT_DIALOG_ANSWER");
        QVERIFY(RegisterQuillet());
    }
    void cleanup()
    {
        qunsetenv("BRIMVAULT_DIALOG_ANSWER");
        m_env.reset();
    }

    void centerFormCentresTheWindowButKeepsItOnScreen()
    {
        CreatedObject created;
        QObject* funcs = keep(created, u"Quillet.clsFormFuncs"_s);
        QWidget window;
        window.resize(420, 260);
        QVERIFY(CallByName(funcs, u"CenterForm"_s, {QVariant::fromValue<QObject*>(&window)}).ok);
        const QRect area = window.screen()->availableGeometry();
        const QPoint offCentre = window.frameGeometry().center() - area.center();
        QVERIFY(qAbs(offCentre.x()) <= 1 && qAbs(offCentre.y()) <= 1);
        window.resize(4000, 3000);
        CallByName(funcs, u"CenterForm"_s, {QVariant::fromValue<QObject*>(&window)});
        QCOMPARE(window.pos(), area.topLeft());
    }

    void openDialogShowsItsSettingsAndAnswersTheChosenFile()
    {
        const QString folder = m_env->path(u"personal/Games"_s);
        const QString game = folder + u"/chess.exe"_s;
        QVERIFY(WriteFile(game));
        QStringList seen;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            seen << dialog->windowTitle() << dialog->selectedNameFilter() << dialog->directory().absolutePath();
            ChooseInFileDialog(dialog, game);
        });
        CreatedObject created;
        const CallOutcome outcome = CallByName(keep(created, u"Quillet.CComDlg"_s), u"ShowOpenSaveDialog"_s,
            {QVariant::fromValue<QObject*>(nullptr), u"Add game file"_s,
                u"All files (*.exe;*.swf)|*.exe;*.swf|EXE files (*.exe)|*.exe|SWF files (*.swf)|*.swf"_s, 2, folder,
                0x81800, false});
        QVERIFY2(outcome.ok, qPrintable(outcome.error));
        QCOMPARE(outcome.value.toString(), game);
        // The filter list itself is checked where the main window opens the dialog.
        QCOMPARE(seen, QStringList({u"Add game file"_s, u"EXE files (*.exe)"_s, folder}));
    }

    // A cancelled file dialog is seen through the main window's Add game file command.
    void cancelledFolderDialogAnswersEmpty()
    {
        WhenModalShows([](QWidget* modal) { qobject_cast<QDialog*>(modal)->reject(); });
        CreatedObject created;
        const CallOutcome outcome = CallByName(keep(created, u"Quillet.CComDlg"_s), u"BrowseForFolder"_s,
            {QVariant::fromValue<QObject*>(nullptr), u"Add games from folder"_s, m_env->root()});
        QVERIFY(outcome.ok && outcome.value.toString().isEmpty());
    }

    void folderDialogAnswersTheFolderWithoutTrailingSeparator()
    {
        const QString folder = m_env->path(u"personal/More Games"_s);
        QVERIFY(QDir().mkpath(folder));
        QString title;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            title = dialog->windowTitle();
            QVERIFY(dialog->testOption(QFileDialog::ShowDirsOnly));
            ChooseInFileDialog(dialog, folder);
        });
        CreatedObject created;
        const CallOutcome outcome = CallByName(keep(created, u"Quillet.CComDlg"_s), u"BrowseForFolder"_s,
            {QVariant::fromValue<QObject*>(nullptr), u"Add games from folder"_s, m_env->root()});
        QCOMPARE(outcome.value.toString(), folder);
        QCOMPARE(title, u"Add games from folder"_s);
    }

    void unattendedAnswerShowsNoDialog()
    {
        qputenv("BRIMVAULT_DIALOG_ANSWER", "/games/answer.exe");
        CreatedObject created;
        QObject* dialogs = keep(created, u"Quillet.CComDlg"_s);
        const QVariant none = QVariant::fromValue<QObject*>(nullptr);
        QCOMPARE(CallByName(dialogs, u"ShowOpenSaveDialog"_s, {none, QString(), QString(), 1, QString(), 0, false})
                     .value.toString(),
            u"/games/answer.exe"_s);
        qputenv("BRIMVAULT_DIALOG_ANSWER", "");
        QCOMPARE(CallByName(dialogs, u"BrowseForFolder"_s, {none, QString(), QString()}).value.toString(), QString());
        QVERIFY(!QApplication::activeModalWidget());
    }

    void aboutBoxShowsWhatTheCallerSet()
    {
        CreatedObject created;
        QObject* about = keep(created, u"Quillet.clsAbout"_s);
        QVERIFY(about);
        QPixmap iconPicture(32, 32);
        iconPicture.fill(Qt::red);
        QVERIFY(CallByName(about, u"Caption"_s, {u"Brimvault"_s}, CallType::Let).ok);
        QVERIFY(CallByName(about, u"Copyright"_s, {u"(c) Makers"_s}, CallType::Let).ok);
        QVERIFY(CallByName(about, u"Version"_s, {u"Version 1.2.3"_s}, CallType::Let).ok);
        QVERIFY(CallByName(about, u"Icon"_s, {QVariant::fromValue(QIcon(iconPicture))}, CallType::Let).ok);

        QStringList shown;
        bool hasIcon = false;
        WhenModalShows([&](QWidget* modal) {
            shown << modal->windowTitle();
            for (const char* name : {"labCaption", "labVersion", "labCopyright"})
                shown << modal->findChild<QLabel*>(QString::fromLatin1(name))->text();
            hasIcon = !modal->findChild<QLabel*>(u"imgIcon"_s)->pixmap().isNull();
            qobject_cast<QDialog*>(modal)->accept();
        });
        QVERIFY(CallByName(about, u"ShowAbout"_s).ok);
        QCOMPARE(shown, QStringList({u"Brimvault"_s, u"Brimvault"_s, u"Version 1.2.3"_s, u"(c) Makers"_s}));
        QVERIFY(hasIcon);
    }

    void getHelpOpensInTheBrowser_data()
    {
        QTest::addColumn<QString>("argument");
        QTest::addColumn<QUrl>("expected");
        QTest::newRow("help file") << u"HELPFILE"_s << QUrl();
        QTest::newRow("address") << u"https://example.org/help.html"_s << QUrl(u"https://example.org/help.html"_s);
        QTest::newRow("more games, blanks around")
            << u"  BrimvaultMoreGames "_s << QUrl(u"http://127.0.0.1:9/more-games.asp?product=Brimvault"_s);
    }
    void getHelpOpensInTheBrowser()
    {
        QFETCH(QString, argument);
        QFETCH(QUrl, expected);
        if (argument == u"HELPFILE") {
            argument = m_env->path(u"Brimvault_Russian.html"_s);
            QVERIFY(WriteFile(argument, QByteArrayLiteral("<html></html>")));
            expected = QUrl::fromLocalFile(argument);
        }
        UrlCatcher catcher;
        CreatedObject created;
        // ProgIDs and method names are found whatever their letter case.
        const CallOutcome outcome = CallByName(keep(created, u"quillet.CLSGETHELP"_s), u"gethelp"_s, {argument});
        QVERIFY(outcome.value.toBool());
        QCOMPARE(catcher.opened, QList<QUrl> {expected});
    }

    void missingHelpFileIsReported()
    {
        UrlCatcher catcher;
        QString message;
        WhenModalShows([&](QWidget* modal) {
            auto* box = qobject_cast<QMessageBox*>(modal);
            QVERIFY(box);
            message = box->text();
            box->accept();
        });
        const QString missing = m_env->path(u"nowhere.html"_s);
        CreatedObject created;
        const CallOutcome outcome = CallByName(keep(created, u"Quillet.clsGetHelp"_s), u"GetHelp"_s, {missing});
        QVERIFY(outcome.ok);
        QVERIFY(!outcome.value.toBool());
        QVERIFY(catcher.opened.isEmpty());
        QVERIFY2(message.contains(missing), qPrintable(message));
    }
};

BV_REGISTER_TEST(TestQuillet);
#include "tst_quillet.moc"

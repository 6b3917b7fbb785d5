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

using namespace Brimvault;

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

    void methodsCallableByName_data()
    {
        QTest::addColumn<QString>("progId");
        QTest::addColumn<QString>("method");
        QTest::addColumn<int>("argumentCount");
        QTest::newRow("CenterForm") << "Quillet.clsFormFuncs"
                                    << "CenterForm" << 1;
        QTest::newRow("ShowOpenSaveDialog") << "Quillet.CComDlg"
                                            << "ShowOpenSaveDialog" << 7;
        QTest::newRow("BrowseForFolder") << "Quillet.CComDlg"
                                         << "BrowseForFolder" << 3;
        QTest::newRow("ShowAbout") << "Quillet.clsAbout"
                                   << "ShowAbout" << 0;
        QTest::newRow("GetHelp") << "Quillet.clsGetHelp"
                                 << "GetHelp" << 1;
        QTest::newRow("ProgID in other letter case") << "quillet.CLSGETHELP"
                                                     << "gethelp" << 1;
    }
    void methodsCallableByName()
    {
        QFETCH(QString, progId);
        QFETCH(QString, method);
        QFETCH(int, argumentCount);
        CreatedObject created;
        QObject* object = keep(created, progId);
        QVERIFY2(object, qPrintable(created.error));
        // One argument too many reaches the method by name and is refused for its count only.
        QVariantList tooMany;
        for (int i = 0; i <= argumentCount; ++i)
            tooMany.append(QString());
        const CallOutcome outcome = CallByName(object, method, tooMany);
        QVERIFY(!outcome.ok);
        QVERIFY2(outcome.error.startsWith(QStringLiteral("Wrong number of arguments")), qPrintable(outcome.error));
    }

    void centerFormCentresTheWindowOnItsScreen()
    {
        QWidget window;
        window.resize(420, 260);
        window.move(0, 0);
        CreatedObject created;
        QVERIFY(CallByName(keep(created, QStringLiteral("Quillet.clsFormFuncs")), QStringLiteral("CenterForm"),
            {QVariant::fromValue(static_cast<QObject*>(&window))})
                    .ok);
        const QRect area = window.screen()->availableGeometry();
        QVERIFY(qAbs(window.frameGeometry().center().x() - area.center().x()) <= 1);
        QVERIFY(qAbs(window.frameGeometry().center().y() - area.center().y()) <= 1);
    }

    void centerFormKeepsALargeWindowOnScreen()
    {
        QWidget window;
        window.resize(4000, 3000);
        CreatedObject created;
        CallByName(keep(created, QStringLiteral("Quillet.clsFormFuncs")), QStringLiteral("CenterForm"),
            {QVariant::fromValue(static_cast<QObject*>(&window))});
        QCOMPARE(window.pos(), window.screen()->availableGeometry().topLeft());
    }

    void openDialogShowsItsSettingsAndAnswersTheChosenFile()
    {
        const QString folder = m_env->path(QStringLiteral("personal/Games"));
        const QString game = folder + QStringLiteral("/chess.exe");
        QVERIFY(WriteFile(game));
        QString title;
        QStringList filters;
        QString selectedFilter;
        QString directory;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            title = dialog->windowTitle();
            filters = dialog->nameFilters();
            selectedFilter = dialog->selectedNameFilter();
            directory = dialog->directory().absolutePath();
            ChooseInFileDialog(dialog, game);
        });
        CreatedObject created;
        const CallOutcome outcome = CallByName(keep(created, QStringLiteral("Quillet.CComDlg")),
            QStringLiteral("ShowOpenSaveDialog"),
            {QVariant::fromValue<QObject*>(nullptr), QStringLiteral("Add game file"),
                QStringLiteral("All files (*.exe;*.swf)|*.exe;*.swf|EXE files (*.exe)|*.exe|SWF files (*.swf)|*.swf"),
                2, folder, 0x81800, false});
        QVERIFY2(outcome.ok, qPrintable(outcome.error));
        QCOMPARE(outcome.value.toString(), game);
        QCOMPARE(title, QStringLiteral("Add game file"));
        QCOMPARE(filters,
            QStringList({QStringLiteral("All files (*.exe *.swf)"), QStringLiteral("EXE files (*.exe)"),
                QStringLiteral("SWF files (*.swf)")}));
        QCOMPARE(selectedFilter, QStringLiteral("EXE files (*.exe)"));
        QCOMPARE(directory, folder);
    }

    void cancelledDialogsAnswerEmpty_data()
    {
        QTest::addColumn<QString>("method");
        QTest::newRow("open file") << "ShowOpenSaveDialog";
        QTest::newRow("folder") << "BrowseForFolder";
    }
    void cancelledDialogsAnswerEmpty()
    {
        QFETCH(QString, method);
        WhenModalShows([](QWidget* modal) { qobject_cast<QDialog*>(modal)->reject(); });
        CreatedObject created;
        QObject* dialogs = keep(created, QStringLiteral("Quillet.CComDlg"));
        const QVariant none = QVariant::fromValue<QObject*>(nullptr);
        const CallOutcome outcome = method == u"BrowseForFolder"
            ? CallByName(dialogs, method, {none, QStringLiteral("Add games from folder"), m_env->root()})
            : CallByName(
                dialogs, method, {none, QStringLiteral("t"), QStringLiteral("A|*.a"), 1, m_env->root(), 0, false});
        QVERIFY(outcome.ok);
        QVERIFY(outcome.value.toString().isEmpty());
    }

    void folderDialogAnswersTheFolderWithoutTrailingSeparator()
    {
        const QString folder = m_env->path(QStringLiteral("personal/More Games"));
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
        const CallOutcome outcome
            = CallByName(keep(created, QStringLiteral("Quillet.CComDlg")), QStringLiteral("BrowseForFolder"),
                {QVariant::fromValue<QObject*>(nullptr), QStringLiteral("Add games from folder"), m_env->root()});
        QCOMPARE(outcome.value.toString(), folder);
        QCOMPARE(title, QStringLiteral("Add games from folder"));
    }

    void unattendedAnswerShowsNoDialog()
    {
        qputenv("BRIMVAULT_DIALOG_ANSWER", "/games/answer.exe");
        CreatedObject created;
        QObject* dialogs = keep(created, QStringLiteral("Quillet.CComDlg"));
        const QVariant none = QVariant::fromValue<QObject*>(nullptr);
        QCOMPARE(CallByName(dialogs, QStringLiteral("ShowOpenSaveDialog"),
                     {none, QString(), QString(), 1, QString(), 0, false})
                     .value.toString(),
            QStringLiteral("/games/answer.exe"));
        qputenv("BRIMVAULT_DIALOG_ANSWER", "");
        QCOMPARE(CallByName(dialogs, QStringLiteral("BrowseForFolder"), {none, QString(), QString()}).value.toString(),
            QString());
        QVERIFY(!QApplication::activeModalWidget());
    }

    void aboutBoxShowsWhatTheCallerSet()
    {
        CreatedObject created;
        QObject* about = keep(created, QStringLiteral("Quillet.clsAbout"));
        QVERIFY(about);
        QPixmap iconPicture(32, 32);
        iconPicture.fill(Qt::red);
        QVERIFY(CallByName(about, QStringLiteral("Caption"), {QStringLiteral("Brimvault")}, CallType::Let).ok);
        QVERIFY(CallByName(about, QStringLiteral("Copyright"), {QStringLiteral("(c) Makers")}, CallType::Let).ok);
        QVERIFY(CallByName(about, QStringLiteral("Version"), {QStringLiteral("Version 1.2.3")}, CallType::Let).ok);
        QVERIFY(CallByName(about, QStringLiteral("Icon"), {QVariant::fromValue(QIcon(iconPicture))}, CallType::Let).ok);
        QCOMPARE(CallByName(about, QStringLiteral("Version"), {}, CallType::Get).value.toString(),
            QStringLiteral("Version 1.2.3"));

        QStringList shown;
        bool hasIcon = false;
        WhenModalShows([&](QWidget* modal) {
            shown << modal->windowTitle();
            for (const char* name : {"labCaption", "labVersion", "labCopyright"})
                shown << modal->findChild<QLabel*>(QString::fromLatin1(name))->text();
            hasIcon = !modal->findChild<QLabel*>(QStringLiteral("imgIcon"))->pixmap().isNull();
            qobject_cast<QDialog*>(modal)->accept();
        });
        QVERIFY(CallByName(about, QStringLiteral("ShowAbout")).ok);
        QCOMPARE(shown,
            QStringList({QStringLiteral("Brimvault"), QStringLiteral("Brimvault"), QStringLiteral("Version 1.2.3"),
                QStringLiteral("(c) Makers")}));
        QVERIFY(hasIcon);
    }

    void getHelpOpensInTheBrowser_data()
    {
        QTest::addColumn<QString>("argument");
        QTest::addColumn<QUrl>("expected");
        QTest::newRow("help file") << "HELPFILE" << QUrl();
        QTest::newRow("address") << "https://example.org/help.html"
                                 << QUrl(QStringLiteral("https://example.org/help.html"));
        QTest::newRow("more games") << "BrimvaultMoreGames"
                                    << QUrl(QStringLiteral("http://127.0.0.1:9/more-games.asp?product=Brimvault"));
        QTest::newRow("more games, blanks around")
            << "  BrimvaultMoreGames " << QUrl(QStringLiteral("http://127.0.0.1:9/more-games.asp?product=Brimvault"));
    }
    void getHelpOpensInTheBrowser()
    {
        QFETCH(QString, argument);
        QFETCH(QUrl, expected);
        if (argument == u"HELPFILE") {
            argument = m_env->path(QStringLiteral("Brimvault_Russian.html"));
            QVERIFY(WriteFile(argument, QByteArrayLiteral("<html></html>")));
            expected = QUrl::fromLocalFile(argument);
        }
        UrlCatcher catcher;
        CreatedObject created;
        const CallOutcome outcome
            = CallByName(keep(created, QStringLiteral("Quillet.clsGetHelp")), QStringLiteral("GetHelp"), {argument});
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
        const QString missing = m_env->path(QStringLiteral("nowhere.html"));
        CreatedObject created;
        const CallOutcome outcome
            = CallByName(keep(created, QStringLiteral("Quillet.clsGetHelp")), QStringLiteral("GetHelp"), {missing});
        QVERIFY(outcome.ok);
        QVERIFY(!outcome.value.toBool());
        QVERIFY(catcher.opened.isEmpty());
        QVERIFY2(message.contains(missing), qPrintable(message));
    }
};

QTEST_MAIN(TestQuillet)
#include "tst_quillet.moc"

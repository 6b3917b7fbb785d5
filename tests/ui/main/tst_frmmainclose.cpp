// Closing the main window: the advertisement that is due shows, except when the session is ending.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "media/WebEngineStartup.h"
#include "media/frmReclama.h"
#include "store/DataFolders.h"
#include "store/clsFileBag.h"
#include "ui/main/frmMain.h"

#include <QApplication>
#include <QDir>
#include <QImage>
#include <QPointer>
#include <QSessionManager>
#include <QSignalSpy>
#include <QTest>

using namespace Brimvault;

class TestFrmMainClose : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderFixture> m_program;

    static QList<frmReclama*> advertisements()
    {
        QList<frmReclama*> shown;
        for (QWidget* window : QApplication::topLevelWidgets()) {
            if (auto* host = qobject_cast<frmReclama*>(window); host && host->isVisible())
                shown.append(host);
        }
        return shown;
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderFixture>(false);
    }
    void cleanup()
    {
        m_program.reset();
        m_env.reset();
    }

    void advertisementOnClose_data()
    {
        QTest::addColumn<bool>("sessionEnds");
        QTest::addColumn<bool>("shown");
        QTest::newRow("closed by the program") << false << true;
        QTest::newRow("system shutdown") << true << false;
    }
    void advertisementOnClose()
    {
        QFETCH(bool, sessionEnds);
        QFETCH(bool, shown);
        const QDir folder(DataFolders::ReclamaFolder());
        QVERIFY(folder.path().startsWith(m_env->root()));
        QVERIFY(QDir().mkpath(folder.path()));
        QImage picture(200, 100, QImage::Format_RGB32);
        picture.fill(Qt::darkGreen);
        QVERIFY(picture.save(folder.filePath(QStringLiteral("Image_close.png"))));
        clsFileBag bag;
        bag.SetCurrentFileName(folder.filePath(QStringLiteral("Reclama.ifb")));
        const QString record = QStringLiteral("image_close");
        bag.SetRecord(clsFileBag::MakeKey(record, QStringLiteral("URL")), QStringLiteral("http://ads.example/close"));
        bag.SetRecord(clsFileBag::MakeKey(record, QStringLiteral("DateShowFrom")), QStringLiteral("X.X.X"));
        bag.SetRecord(clsFileBag::MakeKey(record, QStringLiteral("DateShowTo")), QStringLiteral("X.X.X"));
        QVERIFY(bag.SaveFile());

        QPointer<frmMain> window = new frmMain;
        window->setAttribute(Qt::WA_DeleteOnClose);
        QSignalSpy rebuilt(window.data(), &frmMain::listRebuilt);
        window->show();
        QVERIFY(rebuilt.wait(10000));
        if (sessionEnds) {
            // The session manager's own request, as the platform delivers it when the user logs out.
            auto* manager = qApp->findChild<QSessionManager*>();
            QVERIFY2(manager, "the application has no session manager");
            Q_EMIT qApp->commitDataRequest(*manager);
        } else {
            window->close();
        }
        QTRY_VERIFY(window.isNull());
        const QList<frmReclama*> shownNow = advertisements();
        QCOMPARE(shownNow.size(), shown ? 1 : 0);
        for (frmReclama* host : shownNow) {
            QCOMPARE(host->ClickAddress(), QStringLiteral("http://ads.example/close"));
            host->close();
        }
    }
};

int main(int argc, char* argv[])
{
    PrepareWebEngine();
    QApplication app(argc, argv);
    TestFrmMainClose test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_frmmainclose.moc"

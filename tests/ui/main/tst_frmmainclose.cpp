// Closing the main window: the advertisement that is due shows, except when the session is ending.
#include "AdvertisingFiles.h"
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "media/MediaHostEntry.h"
#include "media/WebEngineStartup.h"
#include "media/frmReclama.h"
#include "store/DataFolders.h"
#include "ui/main/frmMain.h"

#include <QApplication>
#include <QPointer>
#include <QSessionManager>

using namespace Brimvault;

class TestFrmMainClose : public QObject {
    Q_OBJECT

    TestEnvironment m_env;

private Q_SLOTS:
    void advertisementOnClose_data()
    {
        QTest::addColumn<bool>("sessionEnds");
        QTest::newRow("closed by the program") << false;
        QTest::newRow("system shutdown") << true;
    }
    void advertisementOnClose()
    {
        QFETCH(bool, sessionEnds);
        QVERIFY(
            WriteDueAdvertisement(DataFolders::ReclamaFolder(), QStringLiteral("http://ads.example"), Qt::darkCyan));
        QPointer<frmMain> window = OpenFilledWindow<frmMain>().release();
        window->setAttribute(Qt::WA_DeleteOnClose);
        if (sessionEnds) {
            // The session manager's own request, as the platform delivers it when the user logs out.
            auto* manager = qApp->findChild<QSessionManager*>();
            QVERIFY(manager);
            Q_EMIT qApp->commitDataRequest(*manager);
        } else {
            window->close();
        }
        QTRY_VERIFY(window.isNull());
        QStringList shown;
        for (QWidget* top : QApplication::topLevelWidgets()) {
            if (auto* host = qobject_cast<frmReclama*>(top); host && host->isVisible()) {
                shown << host->ClickAddress();
                host->close();
            }
        }
        QCOMPARE(shown, sessionEnds ? QStringList() : QStringList {QStringLiteral("http://ads.example")});
    }
};

int main(int argc, char* argv[])
{
    PrepareWebEngine();
    QApplication app(argc, argv);
    MediaHost::Provide(MediaHostEntryPoints());
    TestFrmMainClose test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_frmmainclose.moc"

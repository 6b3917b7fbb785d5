#include "LocalHttpServer.h"
#include "TestEnvironment.h"

#include "app/CatalogueServer.h"
#include "app/ConnectionCheck.h"
#include "store/SettingsStore.h"

#include <QRegularExpression>
#include <QTest>

using namespace Brimvault;

class tst_ConnectionCheck : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

private Q_SLOTS:
    void answersOnlyStatus200_data()
    {
        QTest::addColumn<int>("status");
        QTest::addColumn<bool>("connected");
        QTest::newRow("200") << 200 << true;
        QTest::newRow("302 is not followed") << 302 << false;
        QTest::newRow("301") << 301 << false;
        QTest::newRow("304") << 304 << false;
        QTest::newRow("204") << 204 << false;
        QTest::newRow("404") << 404 << false;
        QTest::newRow("500") << 500 << false;
    }

    void answersOnlyStatus200()
    {
        QFETCH(int, status);
        QFETCH(bool, connected);
        LocalHttpServer server;
        QVERIFY(server.isListening());
        server.status = status;
        qputenv("BRIMVAULT_CATALOGUE_ROOT", server.root().toLatin1());

        QCOMPARE(IsConnected(), connected);
        // One request, to the check's page with a random value that keeps caches from answering; a
        // redirect must not lead to a second request.
        QCOMPARE(server.targets.size(), 1);
        static const QRegularExpression target(QStringLiteral("^/GetBrimvaultConnection\\.asp\\?rnd=0\\.\\d{7}$"));
        QVERIFY2(target.match(server.targets.constFirst()).hasMatch(), qPrintable(server.targets.constFirst()));
    }

    void closedPortIsNotConnected()
    {
        quint16 port = 0;
        {
            QTcpServer probe;
            QVERIFY(probe.listen(QHostAddress::LocalHost, 0));
            port = probe.serverPort();
        }
        qputenv("BRIMVAULT_CATALOGUE_ROOT", QStringLiteral("http://127.0.0.1:%1").arg(port).toLatin1());
        QVERIFY(!IsConnected());
    }

    void badRootIsNotConnected()
    {
        qputenv("BRIMVAULT_CATALOGUE_ROOT", "not an address");
        QVERIFY(!IsConnected());
    }

    void requestReportsTheNumericStatus()
    {
        LocalHttpServer server;
        server.status = 302;
        const std::unique_ptr<HttpRequest> request = CreateHttpRequest();
        QVERIFY(request);
        request->Open(QStringLiteral("GET"), server.root() + QStringLiteral("/x"), false);
        QVERIFY(request->Send());
        QCOMPARE(request->Status(), 302);
        QCOMPARE(server.targets, QStringList {QStringLiteral("/x")});
    }

    void rootLookup_data()
    {
        QTest::addColumn<QByteArray>("environment");
        QTest::addColumn<QString>("setting");
        QTest::addColumn<QString>("expected");
        QTest::newRow("default") << QByteArray() << QString() << DefaultCatalogueRoot();
        QTest::newRow("setting") << QByteArray() << "http://games.example/"
                                 << "http://games.example";
        QTest::newRow("environment wins") << QByteArray("http://127.0.0.1:8080//") << "http://games.example"
                                          << "http://127.0.0.1:8080";
        QTest::newRow("blank environment is unset") << QByteArray("  ") << "http://games.example"
                                                    << "http://games.example";
    }

    void rootLookup()
    {
        QFETCH(QByteArray, environment);
        QFETCH(QString, setting);
        QFETCH(QString, expected);
        if (environment.isNull())
            qunsetenv("BRIMVAULT_CATALOGUE_ROOT");
        else
            qputenv("BRIMVAULT_CATALOGUE_ROOT", environment);
        DeleteSetting(AppTitle(), QStringLiteral("Settings"), QStringLiteral("CatalogueRoot"));
        if (!setting.isEmpty())
            QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Settings"), QStringLiteral("CatalogueRoot"), setting));

        QCOMPARE(CatalogueServerRoot(), expected);
        QVERIFY(ConnectionCheckAddress(0.25).startsWith(expected + QStringLiteral("/GetBrimvaultConnection.asp?rnd=")));
        QVERIFY(ConnectionCheckAddress(0.25).endsWith(QStringLiteral("rnd=0.2500000")));
    }
};

QTEST_GUILESS_MAIN(tst_ConnectionCheck)
#include "tst_connectioncheck.moc"

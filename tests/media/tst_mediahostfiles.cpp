#include "TestEnvironment.h"
#include "TestFiles.h"

#include "media/MediaHostFiles.h"

#include <QtTest>

using namespace Brimvault;

class TestMediaHostFiles : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void contentUrl_data();
    void contentUrl();

private:
    TestEnvironment m_env;
};

void TestMediaHostFiles::contentUrl_data()
{
    QTest::addColumn<QString>("given");
    QTest::addColumn<QString>("expected");
    QTest::newRow("address without a scheme") << "www.example.com/offer"
                                              << "http://www.example.com/offer";
    QTest::newRow("address with a scheme") << "https://example.com/a?b=1"
                                           << "https://example.com/a?b=1";
    QTest::newRow("absolute path") << "/no/such/page.html"
                                   << "file:///no/such/page.html";
    // Expected "" stands for the file in the current folder.
    QTest::newRow("existing file in the current folder") << "here.html"
                                                         << "";
}

void TestMediaHostFiles::contentUrl()
{
    QFETCH(QString, given);
    QFETCH(QString, expected);
    QVERIFY(WriteFile(m_env.path(QStringLiteral("here.html"))));
    QVERIFY(QDir::setCurrent(m_env.root()));
    if (expected.isEmpty())
        expected = QStringLiteral("file://") + QDir::currentPath() + QStringLiteral("/here.html");
    QCOMPARE(MediaHostFiles::ContentUrl(given).toString(), expected);
}

QTEST_GUILESS_MAIN(TestMediaHostFiles)
#include "tst_mediahostfiles.moc"

#include "support/SystemFolders.h"

#include "TestEnvironment.h"

#include <QDir>
#include <QStandardPaths>
#include <QTest>

using namespace Brimvault;

class tst_SystemFolders : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();
    void overriddenFolders_data();
    void overriddenFolders();
    void emptyFolderFallsBackToProgramFolder_data();
    void emptyFolderFallsBackToProgramFolder();
    void standardLocationsWithoutOverride();
    void programFilesFromWinePrefix();
    void windowsFolder();
    void winVerOverride_data();
    void winVerOverride();
    void winVerIsCachedAfterFirstCall();

private:
    std::unique_ptr<TestEnvironment> m_env;
    QString programDir() const { return m_env->path(QStringLiteral("program")); }
    QString winePrefix() const { return m_env->path(QStringLiteral("wine")); }
};

void tst_SystemFolders::init()
{
    m_env = std::make_unique<TestEnvironment>();
    QDir().mkpath(programDir());
    qputenv("BRIMVAULT_PROGRAM_DIR", programDir().toLocal8Bit());
    qputenv("WINEPREFIX", winePrefix().toLocal8Bit());
    qunsetenv("BRIMVAULT_WINVER");
}

void tst_SystemFolders::cleanup()
{
    qunsetenv("BRIMVAULT_PROGRAM_DIR");
    qunsetenv("WINEPREFIX");
    m_env.reset();
}

void tst_SystemFolders::overriddenFolders_data()
{
    QTest::addColumn<int>("csidl");
    QTest::addColumn<QString>("suffix");
    QTest::addColumn<QString>("expected");

    QTest::newRow("common appdata, no suffix") << CSIDL_COMMON_APPDATA << QString() << u"commonappdata"_qs;
    QTest::newRow("common appdata, data folder")
        << CSIDL_COMMON_APPDATA << u"\\Brimvault\\"_qs << u"commonappdata/Brimvault/"_qs;
    QTest::newRow("common appdata, icon cache")
        << CSIDL_COMMON_APPDATA << u"\\Brimvault\\Icons\\"_qs << u"commonappdata/Brimvault/Icons/"_qs;
    QTest::newRow("personal") << CSIDL_PERSONAL << QString() << u"personal"_qs;
    QTest::newRow("program files, games")
        << CSIDL_PROGRAM_FILES << u"\\Microsoft Games"_qs << u"programfiles/Microsoft Games"_qs;
    QTest::newRow("forward-slash suffix kept")
        << CSIDL_COMMON_APPDATA << u"/Brimvault/"_qs << u"commonappdata/Brimvault/"_qs;
}

void tst_SystemFolders::overriddenFolders()
{
    QFETCH(int, csidl);
    QFETCH(QString, suffix);
    QFETCH(QString, expected);
    QCOMPARE(GetSpecialFolder(csidl, suffix), m_env->path(expected));
}

void tst_SystemFolders::emptyFolderFallsBackToProgramFolder_data()
{
    QTest::addColumn<int>("csidl");
    QTest::addColumn<QByteArray>("variable");
    QTest::addColumn<QByteArray>("value");

    QTest::newRow("common appdata empty") << CSIDL_COMMON_APPDATA << "BRIMVAULT_COMMON_APPDATA"_qba << QByteArray();
    QTest::newRow("common appdata blank") << CSIDL_COMMON_APPDATA << "BRIMVAULT_COMMON_APPDATA"_qba
                                          << "   "_qba;
    QTest::newRow("personal empty") << CSIDL_PERSONAL << "BRIMVAULT_PERSONAL"_qba << QByteArray();
    QTest::newRow("program files empty") << CSIDL_PROGRAM_FILES << "BRIMVAULT_PROGRAM_FILES"_qba << QByteArray();
    QTest::newRow("unknown code") << 999 << QByteArray() << QByteArray();
}

void tst_SystemFolders::emptyFolderFallsBackToProgramFolder()
{
    QFETCH(int, csidl);
    QFETCH(QByteArray, variable);
    QFETCH(QByteArray, value);
    if (!variable.isEmpty())
        qputenv(variable.constData(), value);

    QVERIFY(SpecialFolderPath(csidl).trimmed().isEmpty());
    // The suffix is dropped with the missing folder.
    QCOMPARE(GetSpecialFolder(csidl, u"\\Brimvault\\"_qs), programDir());
}

void tst_SystemFolders::standardLocationsWithoutOverride()
{
    qunsetenv("BRIMVAULT_COMMON_APPDATA");
    qunsetenv("BRIMVAULT_PERSONAL");
    const QString data = QDir::cleanPath(QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation));
    const QString documents = QDir::cleanPath(QStandardPaths::writableLocation(QStandardPaths::DocumentsLocation));
    QVERIFY(!data.isEmpty());
    QCOMPARE(SpecialFolderPath(CSIDL_COMMON_APPDATA), data);
    QCOMPARE(GetSpecialFolder(CSIDL_COMMON_APPDATA, u"\\Brimvault\\"_qs), data + u"/Brimvault/"_qs);
    QCOMPARE(SpecialFolderPath(CSIDL_PERSONAL), documents);
}

void tst_SystemFolders::programFilesFromWinePrefix()
{
    qunsetenv("BRIMVAULT_PROGRAM_FILES");
    QCOMPARE(SpecialFolderPath(CSIDL_PROGRAM_FILES), QString());
    QCOMPARE(GetSpecialFolder(CSIDL_PROGRAM_FILES, u"\\Microsoft Games"_qs), programDir());

    const QString programFiles = winePrefix() + u"/drive_c/Program Files"_qs;
    QVERIFY(QDir().mkpath(programFiles));
    QCOMPARE(SpecialFolderPath(CSIDL_PROGRAM_FILES), programFiles);
    QCOMPARE(GetSpecialFolder(CSIDL_PROGRAM_FILES, u"\\Microsoft Games"_qs), programFiles + u"/Microsoft Games"_qs);
}

void tst_SystemFolders::windowsFolder()
{
    QCOMPARE(WindowsFolder(), m_env->path(QStringLiteral("windows")));

    qunsetenv("windir");
    QCOMPARE(WindowsFolder(), QString());
    const QString wineWindows = winePrefix() + u"/drive_c/windows"_qs;
    QVERIFY(QDir().mkpath(wineWindows));
    QCOMPARE(WindowsFolder(), wineWindows);
}

void tst_SystemFolders::winVerOverride_data()
{
    QTest::addColumn<QByteArray>("value");
    QTest::addColumn<int>("expected");

    QTest::newRow("unset") << QByteArray() << 10;
    QTest::newRow("XP") << "5"_qba << 5;
    QTest::newRow("Vista") << "6"_qba << 6;
    QTest::newRow("zero") << "0"_qba << 10;
    QTest::newRow("negative") << "-6"_qba << 10;
    QTest::newRow("not a number") << "seven"_qba << 10;
}

void tst_SystemFolders::winVerOverride()
{
    QFETCH(QByteArray, value);
    QFETCH(int, expected);
    if (!value.isNull())
        qputenv("BRIMVAULT_WINVER", value);
    QCOMPARE(ReadMajorWinVerNumber(), expected);
}

void tst_SystemFolders::winVerIsCachedAfterFirstCall()
{
    // The only call of the cached lookup in this process.
    qputenv("BRIMVAULT_WINVER", "5");
    QCOMPARE(GetMajorWinVerNumber(), 5);
    qputenv("BRIMVAULT_WINVER", "6");
    QCOMPARE(ReadMajorWinVerNumber(), 6);
    QCOMPARE(GetMajorWinVerNumber(), 5);
}

QTEST_GUILESS_MAIN(tst_SystemFolders)
#include "tst_systemfolders.moc"

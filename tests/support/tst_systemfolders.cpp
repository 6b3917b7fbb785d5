#include "support/SystemFolders.h"

#include "TestEnvironment.h"
#include "TestSuite.h"

#include <QStandardPaths>

using namespace Brimvault;

class tst_SystemFolders : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // "program" is the fallback, below the tree like the others.
    void specialFolders_data()
    {
        QTest::addColumn<int>("csidl");
        QTest::addColumn<QString>("suffix");
        QTest::addColumn<QString>("expected");
        QTest::newRow("common appdata") << 35 << u"\\Brimvault\\Icons\\"_qs << u"commonappdata/Brimvault/Icons/"_qs;
        QTest::newRow("personal") << 5 << QString() << u"personal"_qs;
        QTest::newRow("program files") << 38 << u"\\Microsoft Games"_qs << u"programfiles/Microsoft Games"_qs;
        QTest::newRow("unknown code") << 999 << u"\\x"_qs << u"program"_qs;
    }
    void specialFolders()
    {
        QFETCH(int, csidl);
        QFETCH(QString, suffix);
        QFETCH(QString, expected);
        TestEnvironment env;
        env.programDir();
        QCOMPARE(GetSpecialFolder(csidl, suffix), env.path(expected));
    }

    // A variable set to blanks stands for a system without that folder; one not set leaves the choice to the
    // desktop's own folders and Wine's.
    void foldersWithoutOverride()
    {
        TestEnvironment env;
        const QString program = env.programDir();
        qputenv("BRIMVAULT_COMMON_APPDATA", "   ");
        QCOMPARE(GetSpecialFolder(35, u"\\Brimvault\\"_qs), program);
        for (const char* variable :
            {"BRIMVAULT_COMMON_APPDATA", "BRIMVAULT_PERSONAL", "BRIMVAULT_PROGRAM_FILES", "windir"})
            qunsetenv(variable);
        qputenv("WINEPREFIX", env.path(u"wine"_qs).toLocal8Bit());
        const QString data = QDir::cleanPath(QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation));
        QCOMPARE(GetSpecialFolder(35, u"\\Brimvault\\"_qs), data + u"/Brimvault/"_qs);
        QCOMPARE(GetSpecialFolder(38, u"\\Microsoft Games"_qs), program);
        QCOMPARE(WindowsFolder(), QString());
        QVERIFY(QDir().mkpath(env.path(u"wine/drive_c/Program Files"_qs)));
        QVERIFY(QDir().mkpath(env.path(u"wine/drive_c/windows"_qs)));
        QCOMPARE(
            GetSpecialFolder(38, u"\\Microsoft Games"_qs), env.path(u"wine/drive_c/Program Files/Microsoft Games"_qs));
        QCOMPARE(WindowsFolder(), env.path(u"wine/drive_c/windows"_qs));
        qunsetenv("WINEPREFIX");
    }
};

BV_REGISTER_TEST(tst_SystemFolders);
#include "tst_systemfolders.moc"

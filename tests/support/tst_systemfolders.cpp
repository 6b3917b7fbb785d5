#include "support/SystemFolders.h"

#include "TestEnvironment.h"
#include "TestSuite.h"

#include <QStandardPaths>
#include <QTest>

using namespace Brimvault;

class tst_SystemFolders : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // A variable set to "" or blanks stands for a system without that folder.
    void specialFolders_data()
    {
        QTest::addColumn<int>("csidl");
        QTest::addColumn<QByteArray>("variable");
        QTest::addColumn<QByteArray>("value");
        QTest::addColumn<QString>("suffix");
        QTest::addColumn<QString>("expected"); // below the tree; "program" is the fallback
        QTest::newRow("common appdata") << 35 << QByteArray() << QByteArray() << u"\\Brimvault\\Icons\\"_qs
                                        << u"commonappdata/Brimvault/Icons/"_qs;
        QTest::newRow("personal") << 5 << QByteArray() << QByteArray() << QString() << u"personal"_qs;
        QTest::newRow("program files") << 38 << QByteArray() << QByteArray() << u"\\Microsoft Games"_qs
                                       << u"programfiles/Microsoft Games"_qs;
        QTest::newRow("common appdata blank") << 35 << "BRIMVAULT_COMMON_APPDATA"_qba
                                              << "   "_qba << u"\\Brimvault\\"_qs << u"program"_qs;
        QTest::newRow("unknown code") << 999 << QByteArray() << QByteArray() << u"\\x"_qs << u"program"_qs;
    }
    void specialFolders()
    {
        QFETCH(int, csidl);
        QFETCH(QByteArray, variable);
        QFETCH(QByteArray, value);
        QFETCH(QString, suffix);
        QFETCH(QString, expected);
        TestEnvironment env;
        env.programDir();
        if (!variable.isEmpty())
            qputenv(variable.constData(), value);
        QCOMPARE(GetSpecialFolder(csidl, suffix), env.path(expected));
    }

    void foldersWithoutOverride()
    {
        TestEnvironment env;
        const QString program = env.programDir();
        qunsetenv("BRIMVAULT_COMMON_APPDATA");
        qunsetenv("BRIMVAULT_PERSONAL");
        qunsetenv("BRIMVAULT_PROGRAM_FILES");
        qunsetenv("windir");
        qputenv("WINEPREFIX", env.path(u"wine"_qs).toLocal8Bit());
        const QString data = QDir::cleanPath(QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation));
        QCOMPARE(GetSpecialFolder(35, u"\\Brimvault\\"_qs), data + u"/Brimvault/"_qs);
        QCOMPARE(
            SpecialFolderPath(5), QDir::cleanPath(QStandardPaths::writableLocation(QStandardPaths::DocumentsLocation)));
        QCOMPARE(GetSpecialFolder(38, u"\\Microsoft Games"_qs), program);
        QCOMPARE(WindowsFolder(), QString());

        QVERIFY(QDir().mkpath(env.path(u"wine/drive_c/Program Files"_qs)));
        QVERIFY(QDir().mkpath(env.path(u"wine/drive_c/windows"_qs)));
        QCOMPARE(
            GetSpecialFolder(38, u"\\Microsoft Games"_qs), env.path(u"wine/drive_c/Program Files/Microsoft Games"_qs));
        QCOMPARE(WindowsFolder(), env.path(u"wine/drive_c/windows"_qs));
        qunsetenv("WINEPREFIX");
    }

    void windowsVersion()
    {
        for (const auto& [value, expected] :
            QList<QPair<QByteArray, int>> {{"", 10}, {"5", 5}, {"0", 10}, {"-6", 10}, {"seven", 10}}) {
            qputenv("BRIMVAULT_WINVER", value);
            QCOMPARE(ReadMajorWinVerNumber(), expected);
        }
        // The only call of the cached lookup in this process.
        qputenv("BRIMVAULT_WINVER", "5");
        QCOMPARE(GetMajorWinVerNumber(), 5);
        qputenv("BRIMVAULT_WINVER", "6");
        QCOMPARE(GetMajorWinVerNumber(), 5);
        qunsetenv("BRIMVAULT_WINVER");
    }
};

BV_REGISTER_TEST(tst_SystemFolders);
#include "tst_systemfolders.moc"

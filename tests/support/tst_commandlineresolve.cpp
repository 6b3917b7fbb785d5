#include "support/CommandLine.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;

class tst_CommandLineResolve : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_savedPath = qgetenv("PATH");
        qputenv("PATH", m_env->path(u"bin"_qs).toLocal8Bit() + ':' + m_savedPath);
        for (const char* program : {"program/BrimvaultService", "program/shadowed", "bin/shadowed", "bin/onpath",
                 "bin/wine", "my games/run game"})
            QVERIFY(WriteExecutable(m_env->path(QString::fromLatin1(program))));
        QVERIFY(WriteFile(m_env->path(u"my games/run"_qs), "not a program"));
        QVERIFY(WriteFile(m_env->path(u"games/game.exe"_qs), QByteArray("MZ\x90\x00", 4)));
        m_env->programDir();
    }

    void cleanup()
    {
        qputenv("PATH", m_savedPath);
        m_env.reset();
    }

    // "{root}" stands for the temporary tree; an empty program means nothing can be started.
    void resolve_data()
    {
        QTest::addColumn<QString>("commandLine");
        QTest::addColumn<QString>("program");
        QTest::addColumn<QStringList>("arguments");
        const QString none;
        QTest::newRow("exe name finds native companion")
            << u"BrimvaultService.exe -I \"{root}/a b.bvxpak\""_qs << u"{root}/program/BrimvaultService"_qs
            << QStringList {u"-I"_qs, u"{root}/a b.bvxpak"_qs};
        QTest::newRow("program folder before PATH") << u"shadowed"_qs << u"{root}/program/shadowed"_qs << QStringList();
        QTest::newRow("PATH") << u"  onpath  x  "_qs << u"{root}/bin/onpath"_qs << QStringList {u"x"_qs};
        QTest::newRow("unquoted path with blanks")
            << u"{root}/my games/run game -a \"b c\""_qs << u"{root}/my games/run game"_qs
            << QStringList {u"-a"_qs, u"b c"_qs};
        QTest::newRow("quoted path") << u"\"{root}/my games/run game\" \"x  y\" z"_qs << u"{root}/my games/run game"_qs
                                     << QStringList {u"x  y"_qs, u"z"_qs};
        QTest::newRow("Windows executable through the runner")
            << u"{root}/games/game.exe -windowed"_qs << u"{root}/bin/wine"_qs
            << QStringList {u"{root}/games/game.exe"_qs, u"-windowed"_qs};
        QTest::newRow("missing program") << u"no-such-program-brimvault -x"_qs << none << QStringList();
        QTest::newRow("not executable") << u"{root}/my games/run"_qs << none << QStringList();
        QTest::newRow("folder") << u"{root}/my games"_qs << none << QStringList();
        QTest::newRow("quoted, blank inside") << u"\"{root}/my games/run game \""_qs << none << QStringList();
        QTest::newRow("empty quotes") << u"\"\" x"_qs << none << QStringList();
    }
    void resolve()
    {
        QFETCH(QString, commandLine);
        QFETCH(QString, program);
        QFETCH(QStringList, arguments);
        const auto resolved = ResolveCommandLine(commandLine.replace(u"{root}"_qs, m_env->root()));
        QCOMPARE(resolved ? resolved->program : QString(), program.replace(u"{root}"_qs, m_env->root()));
        QCOMPARE(
            resolved ? resolved->arguments : QStringList(), arguments.replaceInStrings(u"{root}"_qs, m_env->root()));
    }

    void windowsExecutableWithoutRunner()
    {
        qputenv("PATH", m_env->path(u"program"_qs).toLocal8Bit());
        QVERIFY(!ResolveCommandLine(m_env->path(u"games/game.exe"_qs)));
    }

private:
    std::unique_ptr<TestEnvironment> m_env;
    QByteArray m_savedPath;
};

BV_REGISTER_TEST(tst_CommandLineResolve);
#include "tst_commandlineresolve.moc"

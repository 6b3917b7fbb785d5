#include "support/CommandLine.h"

#include "TestEnvironment.h"

#include <QDir>
#include <QFile>
#include <QTest>

using namespace Brimvault;

class tst_CommandLineResolve : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();
    void resolve_data();
    void resolve();
    void unresolvable_data();
    void unresolvable();
    void windowsExecutableGoesThroughRunner();
    void startWithoutWaiting();

private:
    QString writeFile(const QString& relative, const QByteArray& content, bool executable);
    QString placeholders(QString text) const;

    std::unique_ptr<TestEnvironment> m_env;
    QByteArray m_savedPath;
};

QString tst_CommandLineResolve::writeFile(const QString& relative, const QByteArray& content, bool executable)
{
    const QString path = m_env->path(relative);
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly))
        return QString();
    file.write(content);
    file.close();
    if (executable)
        file.setPermissions(file.permissions() | QFileDevice::ExeOwner | QFileDevice::ExeUser);
    return path;
}

QString tst_CommandLineResolve::placeholders(QString text) const
{
    return text.replace(u"{root}"_qs, m_env->root());
}

void tst_CommandLineResolve::init()
{
    m_env = std::make_unique<TestEnvironment>();
    m_savedPath = qgetenv("PATH");
    qputenv("BRIMVAULT_PROGRAM_DIR", m_env->path(u"program"_qs).toLocal8Bit());
    qputenv("PATH", m_env->path(u"bin"_qs).toLocal8Bit() + ':' + m_savedPath);
    const QByteArray script = "#!/bin/sh\nexit 0\n";
    writeFile(u"program/BrimvaultService"_qs, script, true);
    writeFile(u"program/shadowed"_qs, script, true);
    writeFile(u"bin/shadowed"_qs, script, true);
    writeFile(u"bin/onpath"_qs, script, true);
    writeFile(u"my games/run game"_qs, script, true);
    writeFile(u"my games/run"_qs, "not a program", false);
}

void tst_CommandLineResolve::cleanup()
{
    qputenv("PATH", m_savedPath);
    qunsetenv("BRIMVAULT_PROGRAM_DIR");
    m_env.reset();
}

void tst_CommandLineResolve::resolve_data()
{
    QTest::addColumn<QString>("commandLine");
    QTest::addColumn<QString>("program");
    QTest::addColumn<QStringList>("arguments");

    QTest::newRow("program folder") << u"BrimvaultService -U"_qs << u"{root}/program/BrimvaultService"_qs
                                    << QStringList {u"-U"_qs};
    QTest::newRow("exe name finds native companion")
        << u"BrimvaultService.exe -I \"{root}/a b.bvxpak\""_qs << u"{root}/program/BrimvaultService"_qs
        << QStringList {u"-I"_qs, u"{root}/a b.bvxpak"_qs};
    QTest::newRow("program folder before PATH") << u"shadowed"_qs << u"{root}/program/shadowed"_qs << QStringList();
    QTest::newRow("PATH") << u"  onpath  x  "_qs << u"{root}/bin/onpath"_qs << QStringList {u"x"_qs};
    QTest::newRow("unquoted path with blanks")
        << u"{root}/my games/run game"_qs << u"{root}/my games/run game"_qs << QStringList();
    QTest::newRow("unquoted path with blanks and arguments")
        << u"{root}/my games/run game -a \"b c\""_qs << u"{root}/my games/run game"_qs
        << QStringList {u"-a"_qs, u"b c"_qs};
    QTest::newRow("quoted path") << u"\"{root}/my games/run game\" \"x  y\" z"_qs << u"{root}/my games/run game"_qs
                                 << QStringList {u"x  y"_qs, u"z"_qs};
}

void tst_CommandLineResolve::resolve()
{
    QFETCH(QString, commandLine);
    QFETCH(QString, program);
    QFETCH(QStringList, arguments);
    for (QString& argument : arguments)
        argument = placeholders(argument);

    const auto resolved = ResolveCommandLine(placeholders(commandLine));
    QVERIFY(resolved.has_value());
    QCOMPARE(resolved->program, placeholders(program));
    QCOMPARE(resolved->arguments, arguments);
}

void tst_CommandLineResolve::unresolvable_data()
{
    QTest::addColumn<QString>("commandLine");

    QTest::newRow("blank") << u"   "_qs;
    QTest::newRow("missing program") << u"no-such-program-brimvault -x"_qs;
    QTest::newRow("missing path") << u"{root}/nowhere/game"_qs;
    QTest::newRow("not executable") << u"{root}/my games/run"_qs;
    QTest::newRow("folder") << u"{root}/my games"_qs;
    QTest::newRow("quoted, blank inside") << u"\"{root}/my games/run game \""_qs;
    QTest::newRow("empty quotes") << u"\"\" x"_qs;
}

void tst_CommandLineResolve::unresolvable()
{
    QFETCH(QString, commandLine);
    QVERIFY(!ResolveCommandLine(placeholders(commandLine)).has_value());
}

void tst_CommandLineResolve::windowsExecutableGoesThroughRunner()
{
    const QString game = writeFile(u"games/game.exe"_qs, QByteArray("MZ\x90\x00", 4), false);
    qputenv("PATH", m_env->path(u"bin"_qs).toLocal8Bit());
    QVERIFY(!ResolveCommandLine(game).has_value());

    const QString runner = writeFile(u"bin/wine"_qs, "#!/bin/sh\n", true);
    const auto resolved = ResolveCommandLine(game + u" -windowed"_qs);
    QVERIFY(resolved.has_value());
    QCOMPARE(resolved->program, runner);
    QCOMPARE(resolved->arguments, (QStringList {game, u"-windowed"_qs}));
}

void tst_CommandLineResolve::startWithoutWaiting()
{
    QVERIFY(!StartCommandLine(u"no-such-program-brimvault"_qs, 1).has_value());

    const QString folder = m_env->path(u"my games"_qs);
    const QString saved = QDir::currentPath();
    QVERIFY(QDir::setCurrent(folder));
    const auto pid = StartCommandLine(u"sh -c \"echo $$ $(pwd) > started\""_qs, 1);
    QDir::setCurrent(saved);
    QVERIFY(pid.has_value());

    // It runs in the folder that was current, and the id is its own.
    QFile started(folder + u"/started"_qs);
    QTRY_VERIFY(started.size() > 0);
    QVERIFY(started.open(QIODevice::ReadOnly));
    QCOMPARE(QString::fromLocal8Bit(started.readAll().trimmed()), QString::number(*pid) + u' ' + folder);
}

QTEST_GUILESS_MAIN(tst_CommandLineResolve)
#include "tst_commandlineresolve.moc"

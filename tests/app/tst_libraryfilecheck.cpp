// Component files are checked before the system's loader sees them: a cut-off library would be mapped
// without complaint and kill the program with a bus error once its missing part runs.
#include "TestEnvironment.h"
#include "app/LibraryFileCheck.h"

#include <QDir>
#include <QFile>
#include <QtTest>

using namespace Brimvault;

namespace {

QByteArray realLibrary()
{
    QFile file(QStringLiteral(BRIMVAULT_BIN_DIR "/Velloran.so"));
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

} // namespace

class TestLibraryFileCheck : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase()
    {
#ifndef Q_OF_ELF
        QSKIP("Only ELF libraries are checked");
#endif
        QVERIFY2(realLibrary().size() > 4096, "build the Velloran target");
    }

    void libraryFiles_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<bool>("loadable");

        const QByteArray library = realLibrary();
        QTest::newRow("complete library") << library << true;
        QTest::newRow("empty") << QByteArray() << false;
        QTest::newRow("text") << QByteArray("not a library\n") << false;
        QTest::newRow("ELF magic only") << QByteArray("\x7f"
                                                      "ELF")
                                        << false;
        QTest::newRow("ELF header only") << library.left(64) << false;
        QTest::newRow("cut off at 2%") << library.left(library.size() / 50) << false;
        QTest::newRow("cut off at half") << library.left(library.size() / 2) << false;
        QTest::newRow("cut off one byte short") << library.chopped(1) << false;

        QByteArray otherClass = library;
        otherClass[4] = otherClass[4] == 2 ? 1 : 2; // 32-bit where 64-bit is expected and the reverse
        QTest::newRow("other word size") << otherClass << false;

        QByteArray executable = library;
        executable[16] = 2; // ET_EXEC
        QTest::newRow("an executable, not a library") << executable << false;

        QByteArray farHeaders = library;
        for (int i = 32; i < 40; ++i)
            farHeaders[i] = char(0x7f); // e_phoff far beyond the file
        QTest::newRow("program headers beyond the end") << farHeaders << false;

        QByteArray hugeCount = library;
        hugeCount[56] = char(0xff);
        hugeCount[57] = char(0xff); // e_phnum
        QTest::newRow("more program headers than the file holds") << hugeCount << false;
    }

    void libraryFiles()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(bool, loadable);
        TestEnvironment env;
        const QString path = env.path(QStringLiteral("Velloran.so"));
        QFile file(path);
        QVERIFY(file.open(QIODevice::WriteOnly));
        QCOMPARE(file.write(bytes), bytes.size());
        file.close();

        const std::optional<QString> problem = LibraryFileProblem(path);
        QCOMPARE(!problem.has_value(), loadable);
        if (problem)
            QVERIFY2(problem->contains(path), qPrintable(*problem));
    }

    void notAFile_data()
    {
        QTest::addColumn<QString>("kind");
        QTest::newRow("missing") << QStringLiteral("missing");
        QTest::newRow("folder") << QStringLiteral("folder");
    }

    void notAFile()
    {
        QFETCH(QString, kind);
        TestEnvironment env;
        const QString path = env.path(QStringLiteral("Velloran.so"));
        if (kind == QStringLiteral("folder"))
            QVERIFY(QDir().mkpath(path));
        QVERIFY(LibraryFileProblem(path).has_value());
    }
};

QTEST_GUILESS_MAIN(TestLibraryFileCheck)
#include "tst_libraryfilecheck.moc"

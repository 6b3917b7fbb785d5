// Component files are checked before the system's loader sees them: a cut-off library would be mapped
// without complaint and kill the program with a bus error once its missing part runs.
#include "app/LibraryFileCheck.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QtTest>

using namespace Brimvault;

class TestLibraryFileCheck : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase()
    {
#ifndef Q_OF_ELF
        QSKIP("Only ELF libraries are checked; the Windows loader refuses a damaged DLL itself");
#endif
        m_library = ReadFile(QStringLiteral(BRIMVAULT_BIN_DIR "/Velloran.so"));
        REQUIRE_FIXTURE(m_library.size() > 4096, "Velloran.so (the Velloran target)");
    }

    void libraryFiles_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<bool>("loadable");
        const QByteArray library = m_library;
        QTest::newRow("complete library") << library << true;
        QTest::newRow("empty") << QByteArray() << false;
        QTest::newRow("text") << QByteArray("not a library\n") << false;
        QTest::newRow("ELF magic only") << QByteArray("\x7f"
                                                      "ELF")
                                        << false;
        QTest::newRow("ELF header only") << library.left(64) << false;
        QTest::newRow("cut off at half") << library.left(library.size() / 2) << false;
        QTest::newRow("cut off one byte short") << library.chopped(1) << false;
        // Bytes 4 (word size), 16 (file type), 32 to 39 (program header offset), 56 and 57 (their count).
        QByteArray damaged = library;
        damaged[4] = damaged[4] == 2 ? 1 : 2;
        QTest::newRow("other word size") << damaged << false;
        damaged = library;
        damaged[16] = 2;
        QTest::newRow("an executable, not a library") << damaged << false;
        damaged = library;
        damaged.replace(32, 8, QByteArray(8, '\x7f'));
        QTest::newRow("program headers beyond the end") << damaged << false;
        damaged = library;
        damaged.replace(56, 2, "\xff\xff");
        QTest::newRow("more program headers than the file holds") << damaged << false;
    }
    void libraryFiles()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(bool, loadable);
        TestEnvironment env;
        const QString path = env.path(QStringLiteral("Velloran.so"));
        QVERIFY(WriteFile(path, bytes));
        const std::optional<QString> problem = LibraryFileProblem(path);
        QCOMPARE(!problem.has_value(), loadable);
        if (problem)
            QVERIFY2(problem->contains(path), qPrintable(*problem));
    }

    void notAFile()
    {
        TestEnvironment env;
        QVERIFY(LibraryFileProblem(env.path(QStringLiteral("missing.so"))).has_value());
        QVERIFY(LibraryFileProblem(env.root()).has_value());
    }

private:
    QByteArray m_library;
};

BV_REGISTER_TEST(TestLibraryFileCheck);
#include "tst_libraryfilecheck.moc"

// A cut-off library would be mapped without complaint and kill the program with a bus error once its missing
// part runs, so component files are checked before the system's loader sees them.
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

    // Missing, empty, text, cut-off and folder files are met by the real program in the damaged-environment runs.
    void libraryFiles_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<bool>("loadable");
        QTest::newRow("complete library") << m_library << true;
        QTest::newRow("cut off one byte short") << m_library.chopped(1) << false;
        // Bytes 4 (word size), 16 (file type), 32 to 39 (program header offset), 56 and 57 (their count).
        const auto damaged = [&](qsizetype at, const QByteArray& bytes) {
            return QByteArray(m_library).replace(at, bytes.size(), bytes);
        };
        QTest::newRow("other word size") << damaged(4, QByteArray(1, m_library[4] == 2 ? 1 : 2)) << false;
        QTest::newRow("an executable, not a library") << damaged(16, "\x02") << false;
        QTest::newRow("program headers beyond the end") << damaged(32, QByteArray(8, '\x7f')) << false;
        QTest::newRow("more program headers than the file holds") << damaged(56, "\xff\xff") << false;
    }
    void libraryFiles()
    {
        QFETCH(QByteArray, bytes);
        TestEnvironment env;
        const QString path = env.path(QStringLiteral("Velloran.so"));
        QVERIFY(WriteFile(path, bytes));
        const std::optional<QString> problem = LibraryFileProblem(path);
        QTEST(!problem.has_value(), "loadable");
        QVERIFY(!problem || problem->contains(path));
    }

private:
    QByteArray m_library;
};

BV_REGISTER_TEST(TestLibraryFileCheck);
#include "tst_libraryfilecheck.moc"

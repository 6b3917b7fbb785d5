#include "MovieFiles.h"
#include "RuffleFixture.h"
#include "TestEnvironment.h"
#include "TestFiles.h"

#include "media/WebEngineStartup.h"
#include "media/frmReclama.h"
#include "support/UserPrompt.h"

#include <QApplication>
#include <QDir>
#include <QPointer>
#include <QTest>

using namespace Brimvault;

// Flash that cannot start says so in the media host's own message, whatever broke in Ruffle.
class TestFlashStart : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void brokenRuffleGivesTheMissingControlMessage_data();
    void brokenRuffleGivesTheMissingControlMessage();

private:
    TestEnvironment m_env;
    QList<PromptRequest> m_prompts;
};

void TestFlashStart::initTestCase()
{
    SetPromptHandler([this](const PromptRequest& request) {
        m_prompts.append(request);
        return PromptAnswer::Ok;
    });
}

void TestFlashStart::brokenRuffleGivesTheMissingControlMessage_data()
{
    QTest::addColumn<bool>("keepWasm"); // false: removed; true: kept but damaged
    QTest::newRow("WebAssembly missing") << false;
    QTest::newRow("WebAssembly damaged") << true;
}

void TestFlashStart::brokenRuffleGivesTheMissingControlMessage()
{
    QFETCH(bool, keepWasm);
    REQUIRE_RUFFLE();
    const QString program = m_env.path(QStringLiteral("program-%1").arg(keepWasm ? 1 : 0));
    QVERIFY(CopyRuffleTo(program));
    QDir ruffle(program + QStringLiteral("/ruffle"));
    for (const QString& wasm : ruffle.entryList({QStringLiteral("*.wasm")}, QDir::Files))
        QVERIFY(keepWasm ? WriteFile(ruffle.filePath(wasm), "not WebAssembly") : ruffle.remove(wasm));
    qputenv("BRIMVAULT_PROGRAM_DIR", program.toLocal8Bit());
    m_prompts.clear();

    const QString movie = m_env.path(QStringLiteral("movie.swf"));
    QVERIFY(WriteFile(movie, SwfBuilder(8, 100, 100, 12.0).bytes()));
    QPointer<frmReclama> window = new frmReclama();
    window->RunGame(movie);

    QTRY_COMPARE_WITH_TIMEOUT(m_prompts.size(), 1, 30000);
    QCOMPARE(m_prompts.constFirst().text, QStringLiteral("Macromedia Shockwave Flash Control not installed properly."));
    QCOMPARE(m_prompts.constFirst().icon, PromptIcon::Critical);
    QTRY_VERIFY(window.isNull());
    QCOMPARE(m_prompts.size(), 1);
}

int main(int argc, char* argv[])
{
    PrepareWebEngine();
    QApplication app(argc, argv);
    TestFlashStart test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_flashstart.moc"

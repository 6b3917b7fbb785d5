// The prompt log that lets tests watch the real program's message boxes: every box is written down and
// answered without anyone clicking, never with the button that goes ahead.
#include "TestEnvironment.h"
#include "app/startup/TestHooks.h"
#include "support/UserPrompt.h"

#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>
#include <QtTest>

using namespace Brimvault;

class TestPromptLog : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void cleanup()
    {
        SetPromptHandler({});
        SetInputHandler({});
        qunsetenv("BRIMVAULT_PROMPT_LOG");
    }

    void offWithoutVariable()
    {
        TestEnvironment env;
        qunsetenv("BRIMVAULT_PROMPT_LOG");
        QVERIFY(!TestHooks::InstallPromptLogIfRequested());
    }

    void messagesAreLoggedAndCancelled_data()
    {
        QTest::addColumn<int>("icon");
        QTest::addColumn<int>("buttons");
        QTest::addColumn<int>("answer");
        QTest::addColumn<QString>("iconName");
        QTest::addColumn<QString>("buttonsName");

        QTest::newRow("OK only") << int(PromptIcon::Critical) << int(PromptButtons::Ok) << int(PromptAnswer::Ok)
                                 << QStringLiteral("critical") << QStringLiteral("ok");
        QTest::newRow("OK/Cancel") << int(PromptIcon::Exclamation) << int(PromptButtons::OkCancel)
                                   << int(PromptAnswer::Cancel) << QStringLiteral("exclamation")
                                   << QStringLiteral("okcancel");
        QTest::newRow("Yes/No") << int(PromptIcon::Question) << int(PromptButtons::YesNo) << int(PromptAnswer::No)
                                << QStringLiteral("question") << QStringLiteral("yesno");
        QTest::newRow("Yes/No/Cancel") << int(PromptIcon::None) << int(PromptButtons::YesNoCancel)
                                       << int(PromptAnswer::Cancel) << QStringLiteral("none")
                                       << QStringLiteral("yesnocancel");
    }

    void messagesAreLoggedAndCancelled()
    {
        QFETCH(int, icon);
        QFETCH(int, buttons);
        QFETCH(int, answer);
        QFETCH(QString, iconName);
        QFETCH(QString, buttonsName);

        TestEnvironment env;
        const QString log = env.path(QStringLiteral("prompts.jsonl"));
        qputenv("BRIMVAULT_PROMPT_LOG", log.toLocal8Bit());
        QVERIFY(TestHooks::InstallPromptLogIfRequested());

        const QString text = QStringLiteral("Remove \"Chess\"?\nReally?");
        QCOMPARE(
            int(ShowPrompt({text, QStringLiteral("Brimvault"), PromptIcon(icon), PromptButtons(buttons)})), answer);
        QCOMPARE(
            int(ShowPrompt({QStringLiteral("second"), QString(), PromptIcon(icon), PromptButtons(buttons)})), answer);

        QFile file(log);
        QVERIFY(file.open(QIODevice::ReadOnly));
        const QList<QByteArray> lines = file.readAll().split('\n');
        QCOMPARE(lines.size(), 3); // two entries and the empty rest after the last line end
        const QJsonObject first = QJsonDocument::fromJson(lines.at(0)).object();
        QCOMPARE(first.value(QStringLiteral("kind")).toString(), QStringLiteral("message"));
        QCOMPARE(first.value(QStringLiteral("text")).toString(), text);
        QCOMPARE(first.value(QStringLiteral("title")).toString(), QStringLiteral("Brimvault"));
        QCOMPARE(first.value(QStringLiteral("icon")).toString(), iconName);
        QCOMPARE(first.value(QStringLiteral("buttons")).toString(), buttonsName);
        QCOMPARE(QJsonDocument::fromJson(lines.at(1)).object().value(QStringLiteral("text")).toString(),
            QStringLiteral("second"));
    }

    void inputBoxesAreLoggedAndCancelled()
    {
        TestEnvironment env;
        const QString log = env.path(QStringLiteral("prompts.jsonl"));
        qputenv("BRIMVAULT_PROMPT_LOG", log.toLocal8Bit());
        QVERIFY(TestHooks::InstallPromptLogIfRequested());

        QCOMPARE(AskInput({QStringLiteral("Edit game name"), QStringLiteral("Brimvault"), QStringLiteral("Chess")}),
            std::nullopt);
        QFile file(log);
        QVERIFY(file.open(QIODevice::ReadOnly));
        const QJsonObject entry = QJsonDocument::fromJson(file.readLine()).object();
        QCOMPARE(entry.value(QStringLiteral("kind")).toString(), QStringLiteral("input"));
        QCOMPARE(entry.value(QStringLiteral("text")).toString(), QStringLiteral("Edit game name"));
    }
};

QTEST_GUILESS_MAIN(TestPromptLog)
#include "tst_promptlog.moc"

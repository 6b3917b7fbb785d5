// Message and input boxes: as widgets the user answers, and as the prompt log that lets tests watch the real
// program's boxes (written down and answered without anyone clicking, never with the button that goes ahead).
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include "app/startup/TestHooks.h"
#include "app/startup/WidgetPrompts.h"
#include "support/UserPrompt.h"

#include <QAbstractButton>
#include <QInputDialog>
#include <QJsonDocument>
#include <QJsonObject>
#include <QMessageBox>
#include <QtTest>

using namespace Brimvault;

Q_DECLARE_METATYPE(Brimvault::PromptIcon)
Q_DECLARE_METATYPE(Brimvault::PromptButtons)
Q_DECLARE_METATYPE(Brimvault::PromptAnswer)

namespace {

QList<QJsonObject> logged(const QString& log)
{
    QList<QJsonObject> entries;
    for (const QByteArray& line : ReadFile(log).split('\n')) {
        if (!line.isEmpty())
            entries.append(QJsonDocument::fromJson(line).object());
    }
    return entries;
}

} // namespace

class TestPrompts : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString m_log;

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_log = m_env->path(QStringLiteral("prompts.jsonl"));
    }

    void cleanup()
    {
        SetPromptHandler({});
        SetInputHandler({});
        qunsetenv("BRIMVAULT_PROMPT_LOG");
        m_env.reset();
    }

    void promptLog_data()
    {
        QTest::addColumn<PromptIcon>("icon");
        QTest::addColumn<PromptButtons>("buttons");
        QTest::addColumn<PromptAnswer>("answer");
        QTest::addColumn<QString>("iconName");
        QTest::addColumn<QString>("buttonsName");

        QTest::newRow("OK only") << PromptIcon::Critical << PromptButtons::Ok << PromptAnswer::Ok
                                 << QStringLiteral("critical") << QStringLiteral("ok");
        QTest::newRow("OK/Cancel") << PromptIcon::Exclamation << PromptButtons::OkCancel << PromptAnswer::Cancel
                                   << QStringLiteral("exclamation") << QStringLiteral("okcancel");
        QTest::newRow("Yes/No") << PromptIcon::Question << PromptButtons::YesNo << PromptAnswer::No
                                << QStringLiteral("question") << QStringLiteral("yesno");
        QTest::newRow("Yes/No/Cancel") << PromptIcon::None << PromptButtons::YesNoCancel << PromptAnswer::Cancel
                                       << QStringLiteral("none") << QStringLiteral("yesnocancel");
    }

    void promptLog()
    {
        QFETCH(PromptIcon, icon);
        QFETCH(PromptButtons, buttons);
        QFETCH(PromptAnswer, answer);
        QFETCH(QString, iconName);
        QFETCH(QString, buttonsName);

        QVERIFY(!TestHooks::InstallPromptLogIfRequested());
        qputenv("BRIMVAULT_PROMPT_LOG", m_log.toLocal8Bit());
        QVERIFY(TestHooks::InstallPromptLogIfRequested());

        const QString text = QStringLiteral("Remove \"Chess\"?\nReally?");
        QCOMPARE(ShowPrompt({text, QStringLiteral("Brimvault"), icon, buttons}), answer);
        QCOMPARE(ShowPrompt({QStringLiteral("second"), QString(), icon, buttons}), answer);
        QCOMPARE(AskInput({QStringLiteral("Edit game name"), QStringLiteral("Brimvault"), QStringLiteral("Chess")}),
            std::nullopt);

        const QList<QJsonObject> entries = logged(m_log);
        QCOMPARE(entries.size(), 3);
        QCOMPARE(entries[0].value(QStringLiteral("kind")).toString(), QStringLiteral("message"));
        QCOMPARE(entries[0].value(QStringLiteral("text")).toString(), text);
        QCOMPARE(entries[0].value(QStringLiteral("title")).toString(), QStringLiteral("Brimvault"));
        QCOMPARE(entries[0].value(QStringLiteral("icon")).toString(), iconName);
        QCOMPARE(entries[0].value(QStringLiteral("buttons")).toString(), buttonsName);
        QCOMPARE(entries[1].value(QStringLiteral("text")).toString(), QStringLiteral("second"));
        QCOMPARE(entries[2].value(QStringLiteral("kind")).toString(), QStringLiteral("input"));
        QCOMPARE(entries[2].value(QStringLiteral("text")).toString(), QStringLiteral("Edit game name"));
    }

    void messageBox_data()
    {
        QTest::addColumn<PromptIcon>("icon");
        QTest::addColumn<PromptButtons>("buttons");
        QTest::addColumn<int>("click"); // a QMessageBox::StandardButton, or 0 for Escape
        QTest::addColumn<int>("shownIcon");
        QTest::addColumn<PromptAnswer>("answer");

        QTest::newRow("critical, OK") << PromptIcon::Critical << PromptButtons::Ok << int(QMessageBox::Ok)
                                      << int(QMessageBox::Critical) << PromptAnswer::Ok;
        QTest::newRow("question, yes") << PromptIcon::Question << PromptButtons::YesNo << int(QMessageBox::Yes)
                                       << int(QMessageBox::Question) << PromptAnswer::Yes;
        QTest::newRow("question, escape means no")
            << PromptIcon::Question << PromptButtons::YesNo << 0 << int(QMessageBox::Question) << PromptAnswer::No;
        QTest::newRow("exclamation, cancel")
            << PromptIcon::Exclamation << PromptButtons::OkCancel << int(QMessageBox::Cancel)
            << int(QMessageBox::Warning) << PromptAnswer::Cancel;
        QTest::newRow("information, no of three")
            << PromptIcon::Information << PromptButtons::YesNoCancel << int(QMessageBox::No)
            << int(QMessageBox::Information) << PromptAnswer::No;
        QTest::newRow("escape of three cancels")
            << PromptIcon::None << PromptButtons::YesNoCancel << 0 << int(QMessageBox::NoIcon) << PromptAnswer::Cancel;
    }

    void messageBox()
    {
        QFETCH(PromptIcon, icon);
        QFETCH(PromptButtons, buttons);
        QFETCH(int, click);
        QFETCH(int, shownIcon);
        QFETCH(PromptAnswer, answer);

        InstallWidgetPrompts();
        QStringList seen;
        int seenIcon = -1;
        WhenModalShows([&](QWidget* widget) {
            auto* box = qobject_cast<QMessageBox*>(widget);
            QVERIFY(box);
            seen << box->text() << box->windowTitle();
            seenIcon = int(box->icon());
            if (click == 0)
                QTest::keyClick(box, Qt::Key_Escape);
            else
                box->button(QMessageBox::StandardButton(click))->click();
        });

        QCOMPARE(ShowPrompt({QStringLiteral("Remove the game?"), QStringLiteral("Brimvault"), icon, buttons}), answer);
        QCOMPARE(seen, (QStringList {QStringLiteral("Remove the game?"), QStringLiteral("Brimvault")}));
        QCOMPARE(seenIcon, shownIcon);
    }

    void inputBox_data()
    {
        QTest::addColumn<bool>("accept");
        QTest::addColumn<QString>("typed");
        QTest::newRow("accepted with new text") << true << QStringLiteral("Solitaire");
        QTest::newRow("accepted empty") << true << QString();
        QTest::newRow("cancelled") << false << QStringLiteral("ignored");
    }

    void inputBox()
    {
        QFETCH(bool, accept);
        QFETCH(QString, typed);

        InstallWidgetPrompts();
        QString seenDefault;
        WhenModalShows([&](QWidget* widget) {
            auto* dialog = qobject_cast<QInputDialog*>(widget);
            QVERIFY(dialog);
            seenDefault = dialog->textValue();
            dialog->setTextValue(typed);
            accept ? dialog->accept() : dialog->reject();
        });

        const std::optional<QString> result
            = AskInput({QStringLiteral("New name:"), QStringLiteral("Rename"), QStringLiteral("Old name")});
        QCOMPARE(seenDefault, QStringLiteral("Old name"));
        QCOMPARE(result, accept ? std::optional<QString>(typed) : std::nullopt);
    }
};

BV_REGISTER_TEST(TestPrompts);
#include "tst_prompts.moc"

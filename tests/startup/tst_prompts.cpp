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
using namespace Qt::StringLiterals;

Q_DECLARE_METATYPE(Brimvault::PromptIcon)
Q_DECLARE_METATYPE(Brimvault::PromptButtons)
Q_DECLARE_METATYPE(Brimvault::PromptAnswer)

class TestPrompts : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void cleanup()
    {
        SetPromptHandler({});
        SetInputHandler({});
        qunsetenv("BRIMVAULT_PROMPT_LOG");
    }

    void promptLog_data()
    {
        QTest::addColumn<PromptIcon>("icon");
        QTest::addColumn<PromptButtons>("buttons");
        QTest::addColumn<PromptAnswer>("answer");
        QTest::addColumn<QString>("logged"); // icon and buttons as the log names them
        QTest::newRow("OK only") << PromptIcon::Critical << PromptButtons::Ok << PromptAnswer::Ok << u"critical ok"_s;
        QTest::newRow("OK/Cancel") << PromptIcon::Exclamation << PromptButtons::OkCancel << PromptAnswer::Cancel
                                   << u"exclamation okcancel"_s;
        QTest::newRow("Yes/No") << PromptIcon::Question << PromptButtons::YesNo << PromptAnswer::No
                                << u"question yesno"_s;
        QTest::newRow("Yes/No/Cancel") << PromptIcon::None << PromptButtons::YesNoCancel << PromptAnswer::Cancel
                                       << u"none yesnocancel"_s;
    }
    void promptLog()
    {
        QFETCH(PromptIcon, icon);
        QFETCH(PromptButtons, buttons);
        TestEnvironment env;
        const QString log = env.path(u"prompts.jsonl"_s);
        QVERIFY(!TestHooks::InstallPromptLogIfRequested());
        qputenv("BRIMVAULT_PROMPT_LOG", log.toLocal8Bit());
        QVERIFY(TestHooks::InstallPromptLogIfRequested());

        QTEST(ShowPrompt({u"Remove \"Chess\"?\nReally?"_s, u"Brimvault"_s, icon, buttons}), "answer");
        QCOMPARE(AskInput({u"Edit game name"_s, u"Brimvault"_s, u"Chess"_s}), std::nullopt);

        const QList<QByteArray> lines = ReadFile(log).split('\n');
        QCOMPARE(lines.size(), 3);
        const QJsonObject message = QJsonDocument::fromJson(lines[0]).object();
        const QJsonObject input = QJsonDocument::fromJson(lines[1]).object();
        QCOMPARE(QStringList({message[u"kind"].toString(), message[u"text"].toString(), message[u"title"].toString()}),
            QStringList({u"message"_s, u"Remove \"Chess\"?\nReally?"_s, u"Brimvault"_s}));
        QTEST(QString(message[u"icon"].toString() + u' ' + message[u"buttons"].toString()), "logged");
        QCOMPARE(QStringList({input[u"kind"].toString(), input[u"text"].toString()}),
            QStringList({u"input"_s, u"Edit game name"_s}));
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
        InstallWidgetPrompts();
        QStringList seen;
        WhenModalShows([&](QWidget* widget) {
            auto* box = qobject_cast<QMessageBox*>(widget);
            QVERIFY(box);
            seen << box->text() << box->windowTitle() << QString::number(box->icon());
            if (click == 0)
                QTest::keyClick(box, Qt::Key_Escape);
            else
                box->button(QMessageBox::StandardButton(click))->click();
        });
        QTEST(ShowPrompt({u"Remove the game?"_s, u"Brimvault"_s, icon, buttons}), "answer");
        QFETCH(int, shownIcon);
        QCOMPARE(seen, QStringList({u"Remove the game?"_s, u"Brimvault"_s, QString::number(shownIcon)}));
    }

    void inputBox_data()
    {
        QTest::addColumn<bool>("accept");
        QTest::addColumn<QString>("typed");
        QTest::newRow("accepted with new text") << true << u"Solitaire"_s;
        QTest::newRow("accepted empty") << true << QString();
        QTest::newRow("cancelled") << false << u"ignored"_s;
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
        const std::optional<QString> result = AskInput({u"New name:"_s, u"Rename"_s, u"Old name"_s});
        QCOMPARE(seenDefault, u"Old name"_s);
        QCOMPARE(result, accept ? std::optional<QString>(typed) : std::nullopt);
    }
};

BV_REGISTER_TEST(TestPrompts);
#include "tst_prompts.moc"

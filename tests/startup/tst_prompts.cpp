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

    // Every box is written down and answered with the button that does not go ahead.
    void promptLog()
    {
        TestEnvironment env;
        const QString log = env.path(u"prompts.jsonl"_s);
        QVERIFY(!TestHooks::InstallPromptLogIfRequested());
        qputenv("BRIMVAULT_PROMPT_LOG", log.toLocal8Bit());
        QVERIFY(TestHooks::InstallPromptLogIfRequested());
        const QList<PromptAnswer> answers {
            ShowPrompt({u"Remove Chess?\nReally?"_s, u"Brimvault"_s, PromptIcon::Critical, PromptButtons::Ok}),
            ShowPrompt({u"b"_s, u"t"_s, PromptIcon::Exclamation, PromptButtons::OkCancel}),
            ShowPrompt({u"c"_s, u"t"_s, PromptIcon::Question, PromptButtons::YesNo}),
            ShowPrompt({u"d"_s, u"t"_s, PromptIcon::None, PromptButtons::YesNoCancel})};
        QCOMPARE(answers, QList({PromptAnswer::Ok, PromptAnswer::Cancel, PromptAnswer::No, PromptAnswer::Cancel}));
        QCOMPARE(AskInput({u"Edit game name"_s, u"Brimvault"_s, u"Chess"_s}), std::nullopt);
        // Written with ' for " here.
        const QByteArrayList logged {
            "{'buttons':'ok','icon':'critical','kind':'message','text':'Remove Chess?\\nReally?','title':'Brimvault'}",
            "{'buttons':'okcancel','icon':'exclamation','kind':'message','text':'b','title':'t'}",
            "{'buttons':'yesno','icon':'question','kind':'message','text':'c','title':'t'}",
            "{'buttons':'yesnocancel','icon':'none','kind':'message','text':'d','title':'t'}",
            "{'kind':'input','text':'Edit game name','title':'Brimvault'}"};
        QCOMPARE(ReadFile(log), logged.join('\n').replace('\'', '"') + '\n');
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

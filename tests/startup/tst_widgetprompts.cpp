#include "app/startup/WidgetPrompts.h"
#include "support/UserPrompt.h"

#include "TestEnvironment.h"

#include <QAbstractButton>
#include <QApplication>
#include <QInputDialog>
#include <QLineEdit>
#include <QMessageBox>
#include <QTimer>
#include <QtTest>

using namespace Brimvault;

Q_DECLARE_METATYPE(Brimvault::PromptIcon)
Q_DECLARE_METATYPE(Brimvault::PromptButtons)
Q_DECLARE_METATYPE(Brimvault::PromptAnswer)

namespace {

// Acts on the first modal dialog once it is up, as the user would.
template <typename Dialog, typename Action>
void whenDialogShows(Action action)
{
    auto* timer = new QTimer;
    timer->setInterval(20);
    QObject::connect(timer, &QTimer::timeout, timer, [timer, action] {
        auto* dialog = qobject_cast<Dialog*>(QApplication::activeModalWidget());
        if (!dialog)
            return;
        timer->stop();
        timer->deleteLater();
        action(dialog);
    });
    timer->start();
}

} // namespace

class TestWidgetPrompts : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void cleanupTestCase();
    void messageBox_data();
    void messageBox();
    void inputBox_data();
    void inputBox();
};

void TestWidgetPrompts::initTestCase()
{
    InstallWidgetPrompts();
}

void TestWidgetPrompts::cleanupTestCase()
{
    SetPromptHandler({});
    SetInputHandler({});
}

void TestWidgetPrompts::messageBox_data()
{
    QTest::addColumn<PromptIcon>("icon");
    QTest::addColumn<PromptButtons>("buttons");
    QTest::addColumn<int>("click"); // a QMessageBox::StandardButton, or 0 for Escape
    QTest::addColumn<int>("expectedIcon");
    QTest::addColumn<PromptAnswer>("answer");

    QTest::newRow("critical, OK") << PromptIcon::Critical << PromptButtons::Ok << int(QMessageBox::Ok)
                                  << int(QMessageBox::Critical) << PromptAnswer::Ok;
    QTest::newRow("question, yes") << PromptIcon::Question << PromptButtons::YesNo << int(QMessageBox::Yes)
                                   << int(QMessageBox::Question) << PromptAnswer::Yes;
    QTest::newRow("question, escape means no")
        << PromptIcon::Question << PromptButtons::YesNo << 0 << int(QMessageBox::Question) << PromptAnswer::No;
    QTest::newRow("exclamation, cancel") << PromptIcon::Exclamation << PromptButtons::OkCancel
                                         << int(QMessageBox::Cancel) << int(QMessageBox::Warning)
                                         << PromptAnswer::Cancel;
    QTest::newRow("information, no of three")
        << PromptIcon::Information << PromptButtons::YesNoCancel << int(QMessageBox::No)
        << int(QMessageBox::Information) << PromptAnswer::No;
    QTest::newRow("escape of three cancels")
        << PromptIcon::None << PromptButtons::YesNoCancel << 0 << int(QMessageBox::NoIcon) << PromptAnswer::Cancel;
}

void TestWidgetPrompts::messageBox()
{
    QFETCH(PromptIcon, icon);
    QFETCH(PromptButtons, buttons);
    QFETCH(int, click);
    QFETCH(int, expectedIcon);
    QFETCH(PromptAnswer, answer);

    TestEnvironment env;
    QString seenText;
    QString seenTitle;
    int seenIcon = -1;
    whenDialogShows<QMessageBox>([&](QMessageBox* box) {
        seenText = box->text();
        seenTitle = box->windowTitle();
        seenIcon = int(box->icon());
        if (click == 0)
            QTest::keyClick(box, Qt::Key_Escape);
        else
            box->button(QMessageBox::StandardButton(click))->click();
    });

    const PromptAnswer result
        = ShowPrompt({QStringLiteral("Remove the game?"), QStringLiteral("Brimvault"), icon, buttons});
    QCOMPARE(result, answer);
    QCOMPARE(seenText, QStringLiteral("Remove the game?"));
    QCOMPARE(seenTitle, QStringLiteral("Brimvault"));
    QCOMPARE(seenIcon, expectedIcon);
}

void TestWidgetPrompts::inputBox_data()
{
    QTest::addColumn<bool>("accept");
    QTest::addColumn<QString>("typed");
    QTest::newRow("accepted with new text") << true << QStringLiteral("Solitaire");
    QTest::newRow("accepted empty") << true << QString();
    QTest::newRow("cancelled") << false << QStringLiteral("ignored");
}

void TestWidgetPrompts::inputBox()
{
    QFETCH(bool, accept);
    QFETCH(QString, typed);

    TestEnvironment env;
    QString seenDefault;
    whenDialogShows<QInputDialog>([&](QInputDialog* dialog) {
        seenDefault = dialog->textValue();
        dialog->setTextValue(typed);
        accept ? dialog->accept() : dialog->reject();
    });

    const std::optional<QString> result
        = AskInput({QStringLiteral("New name:"), QStringLiteral("Rename"), QStringLiteral("Old name")});
    QCOMPARE(seenDefault, QStringLiteral("Old name"));
    QCOMPARE(result.has_value(), accept);
    if (accept)
        QCOMPARE(*result, typed);
}

QTEST_MAIN(TestWidgetPrompts)
#include "tst_widgetprompts.moc"

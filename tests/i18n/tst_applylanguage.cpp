#include "LocalizerTestFolder.h"
#include "i18n/ApplyLanguage.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include <QApplication>
#include <QLabel>
#include <QPointer>
#include <QRegularExpression>
#include <QTest>
#include <QVBoxLayout>
#include <memory>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

namespace {

// A window as the program's windows are: its captions come from numbered texts.
class CaptionedWindow : public QWidget {
    Q_OBJECT

public:
    CaptionedWindow()
        : m_label(new QLabel(this))
    {
        auto* layout = new QVBoxLayout(this);
        layout->addWidget(m_label);
    }

    Q_INVOKABLE void ChangeLocalizeCaptions()
    {
        setWindowTitle(Translate(1020));
        m_label->setText(Translate(10));
        ++m_calls;
        if (m_onCaptions)
            m_onCaptions();
    }

    QString labelText() const { return m_label->text(); }
    int calls() const { return m_calls; }
    void setOnCaptions(std::function<void()> onCaptions) { m_onCaptions = std::move(onCaptions); }

private:
    QLabel* m_label;
    int m_calls = 0;
    std::function<void()> m_onCaptions;
};

} // namespace

class tst_ApplyLanguage : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();

    void applyLanguage_data();
    void applyLanguage();
    void windowWithoutCaptionsIsPassedOver();
    void switchLanguageReCaptionsEveryWindow();
    void windowClosedWhileReCaptioning();

private:
    QString writeRussian() const;
    std::unique_ptr<LocalizerTestFolder> m_folder;
};

void tst_ApplyLanguage::init()
{
    m_folder = std::make_unique<LocalizerTestFolder>();
    UseBuiltInLanguage();
}

void tst_ApplyLanguage::cleanup()
{
    m_folder.reset();
}

QString tst_ApplyLanguage::writeRussian() const
{
    return m_folder->writeLanguage(QStringLiteral("Brimvault_Russian.lng"), "\xD0\xF3\xF1\xF1\xEA\xE8\xE9", 204,
        "@10=\xDF\xE7\xFB\xEA \xEF\xF0\xEE\xE3\xF0\xE0\xEC\xEC\xFB\r\n@1020=\xC1\xF0\xE8\xEC\xE2\xEE\xEB\xF2\r\n");
}

void tst_ApplyLanguage::applyLanguage_data()
{
    QTest::addColumn<bool>("fileLanguage");
    QTest::addColumn<bool>("force");
    QTest::addColumn<bool>("captioned");
    QTest::addColumn<QString>("label");

    QTest::newRow("built-in, not forced") << false << false << false << QString();
    QTest::newRow("built-in, forced") << false << true << true << QStringLiteral("Program language");
    QTest::newRow("file, not forced") << true << false << true << QStringLiteral("Язык программы");
    QTest::newRow("file, forced") << true << true << true << QStringLiteral("Язык программы");
}

void tst_ApplyLanguage::applyLanguage()
{
    QFETCH(bool, fileLanguage);
    QFETCH(bool, force);
    QFETCH(bool, captioned);
    QFETCH(QString, label);

    LoadLanguageFile(fileLanguage ? writeRussian() : QString());
    CaptionedWindow window;
    QCOMPARE(ApplyLanguage(&window, force), captioned);
    QCOMPARE(window.calls(), captioned ? 1 : 0);
    QCOMPARE(window.labelText(), label);
}

void tst_ApplyLanguage::windowWithoutCaptionsIsPassedOver()
{
    LoadLanguageFile(writeRussian());
    QTest::failOnWarning(QRegularExpression(QStringLiteral(".*")));
    QWidget plain;
    QVERIFY(!ApplyLanguage(&plain, true));
    QVERIFY(!ApplyLanguage(nullptr, true));
}

void tst_ApplyLanguage::switchLanguageReCaptionsEveryWindow()
{
    const QString russian = writeRussian();
    CaptionedWindow first;
    CaptionedWindow second;
    ApplyLanguage(&first, true);
    ApplyLanguage(&second, true);
    first.show();
    QCOMPARE(first.windowTitle(), QStringLiteral("Brimvault"));

    SwitchLanguage(russian);
    QCOMPARE(first.windowTitle(), QStringLiteral("Бримволт"));
    QCOMPARE(first.labelText(), QStringLiteral("Язык программы"));
    QCOMPARE(second.labelText(), QStringLiteral("Язык программы")); // hidden windows follow too
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName")),
        QStringLiteral("Brimvault_Russian.lng"));
    QCOMPARE(
        GetSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngNik")), QStringLiteral("RUSSIAN"));

    // Back to the built-in language: the captions must return to English as well.
    SwitchLanguage(QString());
    QCOMPARE(first.windowTitle(), QStringLiteral("Brimvault"));
    QCOMPARE(second.labelText(), QStringLiteral("Program language"));
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName")),
        QStringLiteral("English (Default)"));
    QCOMPARE(ShortLanguageName(), QStringLiteral("ENG"));
}

void tst_ApplyLanguage::windowClosedWhileReCaptioning()
{
    auto* first = new CaptionedWindow;
    QPointer<CaptionedWindow> second = new CaptionedWindow;
    first->setOnCaptions([&second] { delete second.data(); });
    auto* third = new CaptionedWindow;
    third->setOnCaptions([&second] { delete second.data(); });

    SwitchLanguage(writeRussian());
    QVERIFY(second.isNull());
    QCOMPARE(first->labelText(), QStringLiteral("Язык программы"));
    QCOMPARE(third->labelText(), QStringLiteral("Язык программы"));
    delete first;
    delete third;
}

QTEST_MAIN(tst_ApplyLanguage)
#include "tst_applylanguage.moc"

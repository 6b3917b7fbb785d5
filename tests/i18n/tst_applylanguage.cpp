#include "i18n/ApplyLanguage.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include "LanguageFiles.h"
#include "TestEnvironment.h"
#include "TestSuite.h"

#include <QLabel>
#include <QPointer>
#include <QRegularExpression>
#include <QTest>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

namespace {

// A window as the program's windows are: its captions come from numbered texts.
class CaptionedWindow : public QLabel {
    Q_OBJECT

public:
    Q_INVOKABLE void ChangeLocalizeCaptions()
    {
        setWindowTitle(Translate(1020));
        setText(Translate(10));
        ++calls;
        if (onCaptions)
            onCaptions();
    }

    int calls = 0;
    std::function<void()> onCaptions;
};

QString storedChoice()
{
    return GetSetting(AppTitle(), u"LocaleSettings"_qs, u"LngFileName"_qs) + u' '
        + GetSetting(AppTitle(), u"LocaleSettings"_qs, u"LngNik"_qs);
}

} // namespace

class tst_ApplyLanguage : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_russian = WriteLanguageFile(m_env->programDir(), u"Brimvault_Russian.lng"_qs, "\xD0\xF3\xF1", 204,
            "@10=\xDF\xE7\xFB\xEA \xEF\xF0\xEE\xE3\xF0\xE0\xEC\xEC\xFB\r\n@1020=\xC1\xF0\xE8\xEC\xE2\xEE\xEB\xF2\r\n");
        UseBuiltInLanguage();
    }
    void cleanup() { m_env.reset(); }

    void applyLanguage_data()
    {
        QTest::addColumn<bool>("fileLanguage");
        QTest::addColumn<bool>("force");
        QTest::addColumn<QString>("label"); // empty: the captions were not set
        QTest::newRow("built-in, not forced") << false << false << QString();
        QTest::newRow("built-in, forced") << false << true << u"Program language"_qs;
        QTest::newRow("file, not forced") << true << false << u"Язык программы"_qs;
    }
    void applyLanguage()
    {
        QFETCH(bool, fileLanguage);
        QFETCH(bool, force);
        QFETCH(QString, label);
        LoadLanguageFile(fileLanguage ? m_russian : QString());
        CaptionedWindow window;
        QCOMPARE(ApplyLanguage(&window, force), !label.isEmpty());
        QCOMPARE(window.calls, label.isEmpty() ? 0 : 1);
        QCOMPARE(window.text(), label);
    }

    void windowWithoutCaptionsIsPassedOver()
    {
        LoadLanguageFile(m_russian);
        QTest::failOnWarning(QRegularExpression(u".*"_qs));
        QWidget plain;
        QVERIFY(!ApplyLanguage(&plain, true));
        QVERIFY(!ApplyLanguage(nullptr, true));
    }

    void switchLanguageReCaptionsEveryWindow()
    {
        CaptionedWindow shown;
        CaptionedWindow hidden;
        shown.show();
        SwitchLanguage(m_russian);
        QCOMPARE(shown.windowTitle(), u"Бримволт"_qs);
        QCOMPARE(hidden.text(), u"Язык программы"_qs);
        QCOMPARE(storedChoice(), u"Brimvault_Russian.lng RUSSIAN"_qs);
        QCOMPARE(ShortLanguageName(), u"RUSSIAN"_qs);
        SwitchLanguage(QString());
        QCOMPARE(shown.windowTitle(), u"Brimvault"_qs);
        QCOMPARE(hidden.text(), u"Program language"_qs);
        QCOMPARE(storedChoice(), u"English (Default) ENG"_qs);
        QCOMPARE(ShortLanguageName(), u"ENG"_qs);
    }

    void windowClosedWhileReCaptioning()
    {
        auto first = std::make_unique<CaptionedWindow>();
        QPointer<CaptionedWindow> second = new CaptionedWindow;
        auto third = std::make_unique<CaptionedWindow>();
        first->onCaptions = [&second] { delete second.data(); };
        third->onCaptions = first->onCaptions;
        SwitchLanguage(m_russian);
        QVERIFY(second.isNull());
        QCOMPARE(first->text(), u"Язык программы"_qs);
        QCOMPARE(third->text(), u"Язык программы"_qs);
    }

private:
    std::unique_ptr<TestEnvironment> m_env;
    QString m_russian;
};

BV_REGISTER_TEST(tst_ApplyLanguage);
#include "tst_applylanguage.moc"

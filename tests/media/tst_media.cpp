// The widget-free media rules: advertising dates and schedule, media kinds, browser-emulation values and the
// connection check.
#include "AdvertisingFiles.h"
#include "LocalHttpServer.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include "app/CatalogueServer.h"
#include "app/ConnectionCheck.h"
#include "media/BrowserEmulation.h"
#include "media/MediaKind.h"
#include "media/ReclamaDate.h"
#include "media/ReclamaSchedule.h"
#include "store/DataFolders.h"
#include "store/IniDocument.h"
#include "store/SettingsStore.h"

#include <QRegularExpression>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestMediaRules : public QObject {
    Q_OBJECT
    TestEnvironment m_env;

private Q_SLOTS:
    void parseDate_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QDate>("expected"); // invalid: not a date
        QTest::newRow("plain") << u"1.12.2026"_s << QDate(2026, 12, 1);
        QTest::newRow("X is today's") << u"X.X.X"_s << QDate(2026, 11, 21);
        QTest::newRow("day rolls over") << u"31.2.2026"_s << QDate(2026, 3, 3);
        QTest::newRow("month rolls over") << u"1.13.2026"_s << QDate(2027, 1, 1);
        QTest::newRow("year 29") << u"5.6.29"_s << QDate(2029, 6, 5);
        QTest::newRow("year 30") << u"5.6.30"_s << QDate(1930, 6, 5);
        QTest::newRow("lower-case x") << u"1.12.x"_s << QDate();
        QTest::newRow("two parts") << u"1.12"_s << QDate();
    }
    void parseDate()
    {
        QFETCH(QString, text);
        QTEST(ReclamaDate::ParseDate(text, QDate(2026, 11, 21)).value_or(QDate()), "expected");
    }

    void isDue()
    {
        const auto winterOn = [](QDate today) { return ReclamaDate::IsDue(u"1.12.X"_s, u"31.1.X"_s, today); };
        QCOMPARE(winterOn(QDate(2026, 12, 1)), std::optional(true));
        QCOMPARE(winterOn(QDate(2027, 1, 31)), std::optional(true));
        QCOMPARE(winterOn(QDate(2027, 2, 1)), std::optional(false));
        QCOMPARE(ReclamaDate::IsDue(u"1.6.2025"_s, u"30.6.2025"_s, QDate(2026, 6, 15)), std::optional(false));
    }

    void dueAdvertisementsOfAFolder()
    {
        const QString folder = m_env.path(u"ads"_s);
        for (const char* name : {"Image_winter.png", "Image_summer.swf", "Image_always.html", "Image_nourl.jpg",
                 "image_lower.png", "Other_always.png", "Image_noextension"})
            QVERIFY(WriteFile(folder + u'/' + QString::fromLatin1(name)));
        QVERIFY(WriteReclamaInfo(folder,
            {{u"image_winter"_s, u"http://ads/winter"_s, u"1.12.X"_s, u"31.1.X"_s},
                {u"image_summer"_s, u"http://ads/summer"_s, u"1.6.X"_s, u"31.8.X"_s},
                {u"image_always"_s, u" http://ads/always "_s, u" X.X.X "_s, u"X.X.X"_s},
                {u"image_nourl"_s, u""_s, u"X.X.X"_s, u"X.X.X"_s},
                {u"image_lower"_s, u"http://ads/lower"_s, u"X.X.X"_s, u"X.X.X"_s},
                {u"other_always"_s, u"http://ads/other"_s, u"X.X.X"_s, u"X.X.X"_s}}));
        QStringList shown;
        const auto due = ReclamaSchedule::DueReclamas(folder, QDate(2026, 12, 20));
        for (const ReclamaSchedule::DueReclama& item : due.value())
            shown << QFileInfo(item.filePath).fileName() + u'=' + item.address;
        QCOMPARE(shown,
            QStringList({u"Image_always.html=http://ads/always"_s, u"image_lower.png=http://ads/lower"_s,
                u"Image_winter.png=http://ads/winter"_s}));

        // One unreadable date abandons the whole schedule; so does a missing information file.
        QVERIFY(WriteReclamaInfo(folder,
            {{u"image_always"_s, u"http://a"_s, u"X.X.X"_s, u"X.X.X"_s},
                {u"image_winter"_s, u"http://b"_s, u"1.12.X"_s, u"31.January.X"_s}}));
        QVERIFY(!ReclamaSchedule::DueReclamas(folder, QDate(2026, 12, 5)));
        QVERIFY(QFile::remove(folder + u"/Reclama.ifb"_s));
        QVERIFY(!ReclamaSchedule::DueReclamas(folder, QDate(2026, 12, 5)));
        QCOMPARE(ReclamaSchedule::DueReclamas(m_env.path(u"none"_s), QDate(2026, 1, 1))->size(), 0);
    }

    void pickIsUniformOverTheDueOnes()
    {
        const QList<ReclamaSchedule::DueReclama> due {{u"0"_s, {}}, {u"1"_s, {}}, {u"2"_s, {}}};
        QCOMPARE(ReclamaSchedule::PickReclama(due, 0.3333)->filePath, u"0"_s);
        QCOMPARE(ReclamaSchedule::PickReclama(due, 1.0 / 3.0 + 1e-9)->filePath, u"1"_s);
        QCOMPARE(ReclamaSchedule::PickReclama(due, 0.999999)->filePath, u"2"_s);
        QVERIFY(!ReclamaSchedule::PickReclama(due, 1.0) && !ReclamaSchedule::PickReclama({}, 0.5));
    }

    void onlyClosingByUserOrProgramShowsAnAdvertisement()
    {
        using enum ReclamaSchedule::UnloadMode;
        QCOMPARE(QDir(DataFolders::ReclamaFolder()), QDir(m_env.path(u"commonappdata/Brimvault/Reclama"_s)));
        QVERIFY(WriteDueAdvertisement(DataFolders::ReclamaFolder(), u"http://ads/today"_s, Qt::green));
        QVERIFY(ReclamaSchedule::ReclamaToShow(FormCode) && ReclamaSchedule::ReclamaToShow(FormControlMenu));
        QVERIFY(!ReclamaSchedule::ReclamaToShow(AppWindows) && !ReclamaSchedule::ReclamaToShow(AppTaskManager));
    }

    void mediaKind_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<MediaKind>("kind");
        QTest::newRow("ASP? upper-case") << u"http://host/LIST.ASP?x=1"_s << MediaKind::WebPage;
        QTest::newRow("php with query is no page") << u"game.php?id=3"_s << MediaKind::StillPicture;
        QTest::newRow("substring ht") << u"a.ht"_s << MediaKind::WebPage;
        QTest::newRow("flash") << u"C:\\Games\\Foo.SWF"_s << MediaKind::FlashMovie;
        QTest::newRow("no extension") << u"C:\\ads\\Image"_s << MediaKind::StillPicture;
    }
    void mediaKind()
    {
        QFETCH(QString, path);
        QTEST(MediaKindOf(path), "kind");
    }

    void browserEmulationValues()
    {
        QCOMPARE(QFileInfo(BrowserEmulationFile()).absolutePath(), m_env.path(u"settings"_s));
        QVERIFY(WriteFile(BrowserEmulationFile(), "; kept by hand\n[Other]\nkeep=1\nthis line is damaged\n"));
        WriteBrowserEmulationValues();
        WriteBrowserEmulationValues();
        QVERIFY(SaveDword(RegistryRoot::LocalMachine, u"SOFTWARE\\Test"_s, u"Brimvault.exe"_s, 11001));
        const QByteArray bytes = ReadFile(BrowserEmulationFile());
        QVERIFY(bytes.contains("; kept by hand") && bytes.contains("this line is damaged"));
        const IniDocument ini = IniDocument::parse(bytes);
        QCOMPARE(ini.value(u"Other"_s, u"keep"_s), u"1"_s);
        QCOMPARE(ini.value(u"HKEY_LOCAL_MACHINE\\SOFTWARE\\Test"_s, u"brimvault.exe"_s), u"dword:00002af9"_s);
        for (const QString& key : {u"Microsoft"_s, u"Wow6432Node\\Microsoft"_s}) {
            const QString section = u"HKEY_CURRENT_USER\\SOFTWARE\\"_s + key
                + u"\\Internet Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION"_s;
            QCOMPARE(ini.sectionPairs(section).size(), 1);
            QCOMPARE(ini.value(section, u"brimvault.exe"_s), u"dword:00000000"_s);
        }
        // A folder where the file should be: nothing written, nothing replaced.
        QVERIFY(QFile::remove(BrowserEmulationFile()) && QDir().mkpath(BrowserEmulationFile()));
        QVERIFY(!SaveDword(RegistryRoot::CurrentUser, u"SOFTWARE"_s, u"x"_s, 1)
            && QFileInfo(BrowserEmulationFile()).isDir());
    }

    void onlyStatus200IsConnected_data()
    {
        QTest::addColumn<int>("status");
        QTest::addColumn<bool>("connected");
        QTest::newRow("200") << 200 << true;
        QTest::newRow("302 is not followed") << 302 << false;
    }
    void onlyStatus200IsConnected()
    {
        QFETCH(int, status);
        LocalHttpServer server;
        server.status = status;
        qputenv("BRIMVAULT_CATALOGUE_ROOT", server.root().toLatin1());
        QTEST(IsConnected(), "connected");
        // One request, with a random value that keeps caches from answering.
        QCOMPARE(server.targets.size(), 1);
        QVERIFY(QRegularExpression(u"^/GetBrimvaultConnection\\.asp\\?rnd=0\\.\\d{7}$"_s)
                    .match(server.targets[0])
                    .hasMatch());
    }

    void catalogueRoot()
    {
        const auto root = [](const QByteArray& environment, const QString& setting) {
            qputenv("BRIMVAULT_CATALOGUE_ROOT", environment);
            SaveSetting(AppTitle(), u"Settings"_s, u"CatalogueRoot"_s, setting);
            return CatalogueServerRoot();
        };
        QCOMPARE(root({}, {}), u"http://www.brimvault.com"_s);
        QCOMPARE(root({}, u"http://games.example/"_s), u"http://games.example"_s);
        QCOMPARE(root("http://127.0.0.1:8080//", u"http://games.example"_s), u"http://127.0.0.1:8080"_s);
        QCOMPARE(root("  ", u"http://games.example"_s), u"http://games.example"_s);
    }
};
BV_REGISTER_TEST(TestMediaRules);
#include "tst_media.moc"

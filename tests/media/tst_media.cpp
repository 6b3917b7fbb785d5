// The widget-free media rules: the advertising schedule, the media kind of a path, the browser-emulation
// values and the online connection check.
#include "AdvertisingFiles.h"
#include "LocalHttpServer.h"
#include "TestEnvironment.h"
#include "TestFiles.h"

#include "app/CatalogueServer.h"
#include "app/ConnectionCheck.h"
#include "media/BrowserEmulation.h"
#include "media/MediaKind.h"
#include "media/ReclamaDate.h"
#include "media/ReclamaSchedule.h"
#include "store/DataFolders.h"
#include "store/IniDocument.h"
#include "store/SettingsStore.h"

#include <QDate>
#include <QDir>
#include <QRegularExpression>
#include <QTcpServer>
#include <QTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class tst_Media : public QObject {
    Q_OBJECT

    TestEnvironment m_env;

    static QString emulationValue(const QString& section)
    {
        return IniDocument::parse(ReadFile(BrowserEmulationFile())).value(section, u"brimvault.exe"_s).value_or(u""_s);
    }

private Q_SLOTS:
    void parseDate_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QDate>("expected"); // invalid: not a date
        QTest::newRow("plain") << u"1.12.2026"_s << QDate(2026, 12, 1);
        QTest::newRow("X.X.X is today") << u"X.X.X"_s << QDate(2026, 11, 21);
        QTest::newRow("X day") << u"X.1.2027"_s << QDate(2027, 1, 21);
        QTest::newRow("day rolls into next month") << u"31.2.2026"_s << QDate(2026, 3, 3);
        QTest::newRow("month rolls into next year") << u"1.13.2026"_s << QDate(2027, 1, 1);
        QTest::newRow("day zero is last of month before") << u"0.3.2024"_s << QDate(2024, 2, 29);
        QTest::newRow("two-digit year") << u"5.6.27"_s << QDate(2027, 6, 5);
        QTest::newRow("two-digit year of last century") << u"5.6.99"_s << QDate(1999, 6, 5);
        QTest::newRow("lower-case x") << u"1.12.x"_s << QDate();
        QTest::newRow("word") << u"first.12.2026"_s << QDate();
        QTest::newRow("two parts") << u"1.12"_s << QDate();
        QTest::newRow("huge number") << u"99999999999.1.2026"_s << QDate();
    }
    void parseDate()
    {
        QFETCH(QString, text);
        QFETCH(QDate, expected);
        const std::optional<QDate> parsed = ReclamaDate::ParseDate(text, QDate(2026, 11, 21));
        QCOMPARE(parsed.value_or(QDate()), expected);
        QCOMPARE(parsed.has_value(), expected.isValid());
    }

    void isDue_data()
    {
        QTest::addColumn<QString>("from");
        QTest::addColumn<QString>("to");
        QTest::addColumn<QDate>("today");
        QTest::addColumn<bool>("due");
        const auto row = [](const char* name, const char* from, const char* to, QDate today, bool due) {
            QTest::newRow(name) << QString::fromLatin1(from) << QString::fromLatin1(to) << today << due;
        };
        row("winter on 1 March", "1.12.X", "31.1.X", QDate(2027, 3, 1), false);
        row("winter on its first day", "1.12.X", "31.1.X", QDate(2026, 12, 1), true);
        row("winter on its last day", "1.12.X", "31.1.X", QDate(2027, 1, 31), true);
        row("winter on 30 November", "1.12.X", "31.1.X", QDate(2026, 11, 30), false);
        row("winter on 1 February", "1.12.X", "31.1.X", QDate(2027, 2, 1), false);
        row("fixed period after", "1.6.2026", "30.6.2026", QDate(2026, 7, 1), false);
        row("fixed period of last year", "1.6.2025", "30.6.2025", QDate(2026, 6, 15), false);
        row("from today on", "X.X.X", "X.X.2099", QDate(2026, 4, 30), true);
    }
    void isDue()
    {
        QFETCH(QString, from);
        QFETCH(QString, to);
        QFETCH(QDate, today);
        QFETCH(bool, due);
        QCOMPARE(ReclamaDate::IsDue(from, to, today), std::optional<bool>(due));
        QVERIFY(!ReclamaDate::IsDue(from, u"end of January"_s, today));
    }

    void dueAdvertisementsOfAFolder()
    {
        const QString folder = m_env.path(u"ads"_s);
        for (const char* name : {"Image_winter.png", "Image_summer.swf", "Image_always.html", "Image_nourl.gif",
                 "Image_norecord.jpg", "image_lower.png", "Other_always.png", "Image_noextension"})
            QVERIFY(WriteFile(folder + u'/' + QString::fromLatin1(name)));
        QVERIFY(WriteReclamaInfo(folder,
            {{u"image_winter"_s, u"http://ads/winter"_s, u"1.12.X"_s, u"31.1.X"_s},
                {u"image_summer"_s, u"http://ads/summer"_s, u"1.6.X"_s, u"31.8.X"_s},
                {u"image_always"_s, u" http://ads/always "_s, u" X.X.X "_s, u"X.X.X"_s},
                {u"image_nourl"_s, u""_s, u"X.X.X"_s, u"X.X.X"_s},
                {u"image_lower"_s, u"http://ads/lower"_s, u"X.X.X"_s, u"X.X.X"_s},
                {u"other_always"_s, u"http://ads/other"_s, u"X.X.X"_s, u"X.X.X"_s}}));
        const auto shownOn = [&](const QDate& today) {
            QStringList shown;
            const auto due = ReclamaSchedule::DueReclamas(folder, today);
            for (const ReclamaSchedule::DueReclama& item : due.value())
                shown << QFileInfo(item.filePath).fileName() + u'=' + item.address;
            return shown;
        };
        QCOMPARE(shownOn(QDate(2026, 12, 20)),
            QStringList({u"Image_always.html=http://ads/always"_s, u"image_lower.png=http://ads/lower"_s,
                u"Image_winter.png=http://ads/winter"_s}));
        QCOMPARE(shownOn(QDate(2026, 7, 1)),
            QStringList({u"Image_always.html=http://ads/always"_s, u"image_lower.png=http://ads/lower"_s,
                u"Image_summer.swf=http://ads/summer"_s}));

        // One unreadable date of a candidate abandons the whole schedule; so does a missing information file.
        QVERIFY(WriteReclamaInfo(folder,
            {{u"image_always"_s, u"http://a"_s, u"X.X.X"_s, u"X.X.X"_s},
                {u"image_winter"_s, u"http://b"_s, u"1.12.X"_s, u"31.January.X"_s}}));
        QVERIFY(!ReclamaSchedule::DueReclamas(folder, QDate(2026, 12, 5)));
        QVERIFY(QFile::remove(folder + u"/Reclama.ifb"_s));
        QVERIFY(!ReclamaSchedule::DueReclamas(folder, QDate(2026, 12, 5)));
        // A folder without advertisements has nothing due.
        QCOMPARE(ReclamaSchedule::DueReclamas(m_env.path(u"none"_s), QDate(2026, 1, 1))->size(), 0);
    }

    void pickIsUniformOverTheDueOnes_data()
    {
        QTest::addColumn<double>("random");
        QTest::addColumn<int>("count");
        QTest::addColumn<int>("expected"); // -1: nothing
        QTest::newRow("just below a third") << 0.3333 << 3 << 0;
        QTest::newRow("a third") << 1.0 / 3.0 + 1e-9 << 3 << 1;
        QTest::newRow("almost one") << 0.999999 << 3 << 2;
        QTest::newRow("none due") << 0.5 << 0 << -1;
        QTest::newRow("one is out of range") << 1.0 << 3 << -1;
    }
    void pickIsUniformOverTheDueOnes()
    {
        QFETCH(double, random);
        QFETCH(int, count);
        QFETCH(int, expected);
        QList<ReclamaSchedule::DueReclama> due;
        for (int i = 0; i < count; ++i)
            due.append({QString::number(i), QString()});
        const auto picked = ReclamaSchedule::PickReclama(due, random);
        QCOMPARE(picked ? picked->filePath.toInt() : -1, expected);
    }

    void onlyClosingByUserOrProgramShowsAnAdvertisement_data()
    {
        QTest::addColumn<int>("mode");
        QTest::addColumn<bool>("shows");
        QTest::newRow("own close command") << 0 << true;
        QTest::newRow("closed by the program") << 1 << true;
        QTest::newRow("system shutdown") << 2 << false;
        QTest::newRow("task manager") << 3 << false;
    }
    void onlyClosingByUserOrProgramShowsAnAdvertisement()
    {
        QFETCH(int, mode);
        QFETCH(bool, shows);
        const QString folder = m_env.path(u"commonappdata/Brimvault/Reclama"_s);
        QCOMPARE(QDir(DataFolders::ReclamaFolder()), QDir(folder));
        QVERIFY(WriteDueAdvertisement(folder, u"http://ads/today"_s, Qt::green));
        const auto shown = ReclamaSchedule::ReclamaToShow(static_cast<ReclamaSchedule::UnloadMode>(mode));
        QCOMPARE(shown.has_value(), shows);
        if (shown)
            QCOMPARE(QStringList({shown->filePath, shown->address}),
                QStringList({folder + u"/Image_summer.png"_s, u"http://ads/today"_s}));
    }

    void mediaKind_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<int>("kind");
        const int picture = int(MediaKind::StillPicture), flash = int(MediaKind::FlashMovie),
                  web = int(MediaKind::WebPage);
        QTest::newRow("asp with query") << u"http://host/list.asp?page=2"_s << web;
        QTest::newRow("ASP? upper-case") << u"http://host/LIST.ASP?x=1"_s << web;
        QTest::newRow("php with query is no page") << u"game.php?id=3"_s << picture;
        QTest::newRow("substring ht") << u"a.ht"_s << web;
        QTest::newRow("substring sp") << u"a.sp"_s << web;
        QTest::newRow("flash") << u"C:\\Games\\Foo.SWF"_s << flash;
        QTest::newRow("png") << u"Image_1.png"_s << picture;
        QTest::newRow("no extension") << u"C:\\ads\\Image"_s << picture;
    }
    void mediaKind()
    {
        QFETCH(QString, path);
        QFETCH(int, kind);
        QCOMPARE(int(MediaKindOf(path)), kind);
    }

    void rightTo_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QString>("separator");
        QTest::addColumn<int>("start");
        QTest::addColumn<bool>("fromEnd");
        QTest::addColumn<QString>("expected");
        QTest::newRow("first") << u"a.b.c"_s << u"."_s << 1 << false << u"b.c"_s;
        QTest::newRow("last") << u"a.b.c"_s << u"."_s << 1 << true << u"c"_s;
        QTest::newRow("absent") << u"abc"_s << u"."_s << 1 << true << u"abc"_s;
        QTest::newRow("at the end") << u"abc."_s << u"."_s << 1 << true << u""_s;
    }
    void rightTo()
    {
        QFETCH(QString, text);
        QFETCH(QString, separator);
        QFETCH(int, start);
        QFETCH(bool, fromEnd);
        QFETCH(QString, expected);
        QCOMPARE(RightTo(text, separator, start, fromEnd), expected);
    }

    void browserEmulationValuesAreDwords_data()
    {
        QTest::addColumn<int>("root");
        QTest::addColumn<quint32>("value");
        QTest::addColumn<QString>("section");
        QTest::addColumn<QString>("stored");
        QTest::newRow("local machine, 11001") << int(RegistryRoot::LocalMachine) << 11001u
                                              << u"HKEY_LOCAL_MACHINE\\SOFTWARE\\Test"_s << u"dword:00002af9"_s;
        QTest::newRow("largest value") << int(RegistryRoot::ClassesRoot) << 0xffffffffu
                                       << u"HKEY_CLASSES_ROOT\\SOFTWARE\\Test"_s << u"dword:ffffffff"_s;
    }
    void browserEmulationValuesAreDwords()
    {
        QFETCH(int, root);
        QFETCH(quint32, value);
        QFETCH(QString, section);
        QFETCH(QString, stored);
        QCOMPARE(QFileInfo(BrowserEmulationFile()).absolutePath(), m_env.path(u"settings"_s));
        QVERIFY(SaveDword(static_cast<RegistryRoot>(root), u"SOFTWARE\\Test"_s, u"Brimvault.exe"_s, value));
        QCOMPARE(emulationValue(section), stored);
    }

    void browserEmulationKeepsWhatElseIsInTheFile()
    {
        QVERIFY(WriteFile(BrowserEmulationFile(), "; kept by hand\n[Other]\nkeep=1\nthis line is damaged\n"));
        WriteBrowserEmulationValues();
        WriteBrowserEmulationValues();
        const QByteArray bytes = ReadFile(BrowserEmulationFile());
        QVERIFY(bytes.contains("; kept by hand") && bytes.contains("this line is damaged"));
        QCOMPARE(IniDocument::parse(bytes).value(u"Other"_s, u"keep"_s).value_or(u""_s), u"1"_s);
        // Both values, as 32-bit numbers 0, once each.
        for (const QString& key : {u"Microsoft"_s, u"Wow6432Node\\Microsoft"_s}) {
            const QString section = u"HKEY_CURRENT_USER\\SOFTWARE\\"_s + key
                + u"\\Internet Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION"_s;
            QCOMPARE(IniDocument::parse(bytes).sectionPairs(section).size(), 1);
            QCOMPARE(emulationValue(section), u"dword:00000000"_s);
        }

        // A folder where the file should be: nothing written, nothing replaced.
        QVERIFY(QFile::remove(BrowserEmulationFile()) && QDir().mkpath(BrowserEmulationFile()));
        QVERIFY(!SaveDword(RegistryRoot::CurrentUser, u"SOFTWARE\\Test"_s, u"x"_s, 1));
        QVERIFY(QFileInfo(BrowserEmulationFile()).isDir());
        QVERIFY(QDir(BrowserEmulationFile()).removeRecursively());
    }

    void onlyStatus200IsConnected_data()
    {
        QTest::addColumn<int>("status");
        QTest::addColumn<bool>("connected");
        QTest::newRow("200") << 200 << true;
        QTest::newRow("302 is not followed") << 302 << false;
        QTest::newRow("404") << 404 << false;
    }
    void onlyStatus200IsConnected()
    {
        QFETCH(int, status);
        QFETCH(bool, connected);
        LocalHttpServer server;
        QVERIFY(server.isListening());
        server.status = status;
        qputenv("BRIMVAULT_CATALOGUE_ROOT", server.root().toLatin1());
        QCOMPARE(IsConnected(), connected);
        // One request, with a random value that keeps caches from answering; no second one for a redirect.
        QCOMPARE(server.targets.size(), 1);
        QVERIFY2(QRegularExpression(u"^/GetBrimvaultConnection\\.asp\\?rnd=0\\.\\d{7}$"_s)
                     .match(server.targets.constFirst())
                     .hasMatch(),
            qPrintable(server.targets.constFirst()));
    }

    void unreachableServerIsNotConnected()
    {
        quint16 closedPort = 0;
        {
            QTcpServer probe;
            QVERIFY(probe.listen(QHostAddress::LocalHost, 0));
            closedPort = probe.serverPort();
        }
        for (const QString& root : {u"http://127.0.0.1:%1"_s.arg(closedPort), u"not an address"_s}) {
            qputenv("BRIMVAULT_CATALOGUE_ROOT", root.toLatin1());
            QVERIFY2(!IsConnected(), qPrintable(root));
        }
    }

    void catalogueRoot_data()
    {
        QTest::addColumn<QByteArray>("environment");
        QTest::addColumn<QString>("setting");
        QTest::addColumn<QString>("expected");
        QTest::newRow("default") << QByteArray() << QString() << u"http://www.brimvault.com"_s;
        QTest::newRow("setting") << QByteArray() << u"http://games.example/"_s << u"http://games.example"_s;
        QTest::newRow("environment wins")
            << QByteArray("http://127.0.0.1:8080//") << u"http://games.example"_s << u"http://127.0.0.1:8080"_s;
        QTest::newRow("blank environment is unset")
            << QByteArray("  ") << u"http://games.example"_s << u"http://games.example"_s;
    }
    void catalogueRoot()
    {
        QFETCH(QByteArray, environment);
        QFETCH(QString, setting);
        QFETCH(QString, expected);
        if (environment.isNull())
            qunsetenv("BRIMVAULT_CATALOGUE_ROOT");
        else
            qputenv("BRIMVAULT_CATALOGUE_ROOT", environment);
        DeleteSetting(AppTitle(), u"Settings"_s, u"CatalogueRoot"_s);
        if (!setting.isEmpty())
            QVERIFY(SaveSetting(AppTitle(), u"Settings"_s, u"CatalogueRoot"_s, setting));
        QCOMPARE(CatalogueServerRoot(), expected);
        QCOMPARE(ConnectionCheckAddress(0.25), expected + u"/GetBrimvaultConnection.asp?rnd=0.2500000"_s);
    }
};

QTEST_GUILESS_MAIN(tst_Media)
#include "tst_media.moc"

#include "TestEnvironment.h"

#include "media/MediaKind.h"
#include "media/ReclamaDate.h"
#include "media/ReclamaSchedule.h"
#include "store/DataFolders.h"
#include "store/clsFileBag.h"

#include <QDate>
#include <QDir>
#include <QFile>
#include <QTest>

using namespace Brimvault;

class tst_ReclamaSchedule : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    static void touch(const QString& path)
    {
        QFile file(path);
        QVERIFY(file.open(QIODevice::WriteOnly));
        file.write("x");
    }

    static void writeInfo(const QString& folder, const QList<QStringList>& records)
    {
        clsFileBag bag;
        bag.SetCurrentFileName(QDir(folder).filePath(QStringLiteral("Reclama.ifb")));
        for (const QStringList& record : records) {
            bag.SetRecord(clsFileBag::MakeKey(record.at(0), QStringLiteral("URL")), record.at(1));
            bag.SetRecord(clsFileBag::MakeKey(record.at(0), QStringLiteral("DateShowFrom")), record.at(2));
            bag.SetRecord(clsFileBag::MakeKey(record.at(0), QStringLiteral("DateShowTo")), record.at(3));
        }
        QVERIFY(bag.SaveFile());
    }

    QString freshFolder(const QString& name)
    {
        const QString folder = m_env.path(name);
        QDir(folder).removeRecursively();
        QDir().mkpath(folder);
        return folder;
    }

private Q_SLOTS:
    void parseDate_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QDate>("today");
        QTest::addColumn<QDate>("expected");

        const QDate today(2026, 11, 21);
        QTest::newRow("plain") << "1.12.2026" << today << QDate(2026, 12, 1);
        QTest::newRow("X year") << "1.12.X" << today << QDate(2026, 12, 1);
        QTest::newRow("X X X is today") << "X.X.X" << today << today;
        QTest::newRow("X day") << "X.1.2027" << today << QDate(2027, 1, 21);
        QTest::newRow("blanks around") << "  31.1.X " << today << QDate(2026, 1, 31);
        QTest::newRow("day rolls into next month") << "31.2.2026" << today << QDate(2026, 3, 3);
        QTest::newRow("month rolls into next year") << "1.13.2026" << today << QDate(2027, 1, 1);
        QTest::newRow("day zero is last of month before") << "0.3.2024" << today << QDate(2024, 2, 29);
        QTest::newRow("two-digit year") << "5.6.27" << today << QDate(2027, 6, 5);
        QTest::newRow("two-digit year of last century") << "5.6.99" << today << QDate(1999, 6, 5);
        QTest::newRow("lower-case x is no number") << "1.12.x" << today << QDate();
        QTest::newRow("word") << "first.12.2026" << today << QDate();
        QTest::newRow("two parts") << "1.12" << today << QDate();
        QTest::newRow("four parts") << "1.12.2026.1" << today << QDate();
        QTest::newRow("empty part") << "1..2026" << today << QDate();
        QTest::newRow("slashes") << "1/12/2026" << today << QDate();
        QTest::newRow("huge number") << "99999999999.1.2026" << today << QDate();
    }

    void parseDate()
    {
        QFETCH(QString, text);
        QFETCH(QDate, today);
        QFETCH(QDate, expected);
        const std::optional<QDate> parsed = ReclamaDate::ParseDate(text, today);
        QCOMPARE(parsed.value_or(QDate()), expected);
        QCOMPARE(parsed.has_value(), expected.isValid());
    }

    void isDue_data()
    {
        QTest::addColumn<QString>("from");
        QTest::addColumn<QString>("to");
        QTest::addColumn<QDate>("today");
        QTest::addColumn<bool>("due");

        QTest::newRow("winter on 20 December") << "1.12.X"
                                               << "31.1.X" << QDate(2026, 12, 20) << true;
        QTest::newRow("winter on 10 January") << "1.12.X"
                                              << "31.1.X" << QDate(2027, 1, 10) << true;
        QTest::newRow("winter on 1 March") << "1.12.X"
                                           << "31.1.X" << QDate(2027, 3, 1) << false;
        QTest::newRow("winter on its first day") << "1.12.X"
                                                 << "31.1.X" << QDate(2026, 12, 1) << true;
        QTest::newRow("winter on its last day") << "1.12.X"
                                                << "31.1.X" << QDate(2027, 1, 31) << true;
        QTest::newRow("winter on 30 November") << "1.12.X"
                                               << "31.1.X" << QDate(2026, 11, 30) << false;
        QTest::newRow("winter on 1 February") << "1.12.X"
                                              << "31.1.X" << QDate(2027, 2, 1) << false;
        QTest::newRow("every day") << "X.X.X"
                                   << "X.X.X" << QDate(2026, 7, 4) << true;
        QTest::newRow("every day, leap day") << "X.X.X"
                                             << "X.X.X" << QDate(2028, 2, 29) << true;
        QTest::newRow("fixed period inside") << "1.6.2026"
                                             << "30.6.2026" << QDate(2026, 6, 15) << true;
        QTest::newRow("fixed period before") << "1.6.2026"
                                             << "30.6.2026" << QDate(2026, 5, 31) << false;
        QTest::newRow("fixed period after") << "1.6.2026"
                                            << "30.6.2026" << QDate(2026, 7, 1) << false;
        QTest::newRow("fixed period of last year") << "1.6.2025"
                                                   << "30.6.2025" << QDate(2026, 6, 15) << false;
        QTest::newRow("single day") << "15.6.X"
                                    << "15.6.X" << QDate(2026, 6, 15) << true;
        QTest::newRow("single day, day after") << "15.6.X"
                                               << "15.6.X" << QDate(2026, 6, 16) << false;
        QTest::newRow("this month") << "1.X.X"
                                    << "31.X.X" << QDate(2026, 4, 30) << true;
        QTest::newRow("from today on for a year") << "X.X.X"
                                                  << "X.X.2099" << QDate(2026, 4, 30) << true;
    }

    void isDue()
    {
        QFETCH(QString, from);
        QFETCH(QString, to);
        QFETCH(QDate, today);
        QFETCH(bool, due);
        const std::optional<bool> result = ReclamaDate::IsDue(from, to, today);
        QVERIFY(result.has_value());
        QCOMPARE(*result, due);
    }

    void unreadableDateIsNoAnswer()
    {
        QVERIFY(!ReclamaDate::IsDue(QStringLiteral("1.12.X"), QStringLiteral("end of January"), QDate(2026, 12, 2)));
    }

    void dueAdvertisementsOfAFolder()
    {
        const QString folder = freshFolder(QStringLiteral("ads"));
        for (const char* name : {"Image_winter.png", "Image_summer.swf", "Image_always.html", "Image_nourl.gif",
                 "Image_norecord.jpg", "image_lower.png", "Other_always.png", "Image_noextension"})
            touch(QDir(folder).filePath(QString::fromLatin1(name)));
        writeInfo(folder,
            {
                {QStringLiteral("image_winter"), QStringLiteral("http://ads.example/winter"), QStringLiteral("1.12.X"),
                    QStringLiteral("31.1.X")},
                {QStringLiteral("image_summer"), QStringLiteral("http://ads.example/summer"), QStringLiteral("1.6.X"),
                    QStringLiteral("31.8.X")},
                {QStringLiteral("image_always"), QStringLiteral(" http://ads.example/always "),
                    QStringLiteral(" X.X.X "), QStringLiteral("X.X.X")},
                {QStringLiteral("image_nourl"), QString(), QStringLiteral("X.X.X"), QStringLiteral("X.X.X")},
                {QStringLiteral("image_lower"), QStringLiteral("http://ads.example/lower"), QStringLiteral("X.X.X"),
                    QStringLiteral("X.X.X")},
                {QStringLiteral("other_always"), QStringLiteral("http://ads.example/other"), QStringLiteral("X.X.X"),
                    QStringLiteral("X.X.X")},
            });

        const auto onDate = [&](const QDate& today) {
            QStringList shown;
            const std::optional<QList<ReclamaSchedule::DueReclama>> due = ReclamaSchedule::DueReclamas(folder, today);
            if (!due)
                return QStringList {QStringLiteral("abandoned")};
            for (const ReclamaSchedule::DueReclama& item : *due)
                shown.append(QFileInfo(item.filePath).fileName() + u'=' + item.address);
            return shown;
        };
        QCOMPARE(onDate(QDate(2026, 12, 20)),
            QStringList({QStringLiteral("Image_always.html=http://ads.example/always"),
                QStringLiteral("image_lower.png=http://ads.example/lower"),
                QStringLiteral("Image_winter.png=http://ads.example/winter")}));
        QCOMPARE(onDate(QDate(2026, 7, 1)),
            QStringList({QStringLiteral("Image_always.html=http://ads.example/always"),
                QStringLiteral("image_lower.png=http://ads.example/lower"),
                QStringLiteral("Image_summer.swf=http://ads.example/summer")}));
    }

    void badDateAbandonsTheSchedule()
    {
        const QString folder = freshFolder(QStringLiteral("bad"));
        touch(QDir(folder).filePath(QStringLiteral("Image_a.png")));
        touch(QDir(folder).filePath(QStringLiteral("Image_b.png")));
        writeInfo(folder,
            {
                {QStringLiteral("image_a"), QStringLiteral("http://a"), QStringLiteral("X.X.X"),
                    QStringLiteral("X.X.X")},
                {QStringLiteral("image_b"), QStringLiteral("http://b"), QStringLiteral("1.12.X"),
                    QStringLiteral("31.January.X")},
            });
        QVERIFY(!ReclamaSchedule::DueReclamas(folder, QDate(2026, 12, 5)).has_value());
    }

    void missingOrUnreadableFolders()
    {
        const QString folder = freshFolder(QStringLiteral("noinfo"));
        touch(QDir(folder).filePath(QStringLiteral("Image_a.png")));
        QVERIFY(!ReclamaSchedule::DueReclamas(folder, QDate(2026, 12, 5)).has_value());

        const auto none = ReclamaSchedule::DueReclamas(m_env.path(QStringLiteral("does-not-exist")), QDate(2026, 1, 1));
        QVERIFY(none.has_value());
        QVERIFY(none->isEmpty());
        QVERIFY(ReclamaSchedule::ReclamaFiles(QString()).isEmpty());
    }

    void pickIsUniformOverTheDueOnes_data()
    {
        QTest::addColumn<double>("random");
        QTest::addColumn<int>("count");
        QTest::addColumn<int>("expected");
        QTest::newRow("zero") << 0.0 << 3 << 0;
        QTest::newRow("just below a third") << 0.3333 << 3 << 0;
        QTest::newRow("a third") << 1.0 / 3.0 + 1e-9 << 3 << 1;
        QTest::newRow("almost one") << 0.999999 << 3 << 2;
        QTest::newRow("only one") << 0.75 << 1 << 0;
        QTest::newRow("none due") << 0.5 << 0 << -1;
        QTest::newRow("one is out of range") << 1.0 << 3 << -1;
        QTest::newRow("negative is out of range") << -0.1 << 3 << -1;
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

    void reclamaToShowReadsTheAdvertisingFolder_data()
    {
        QTest::addColumn<int>("mode");
        QTest::addColumn<bool>("shows");
        QTest::newRow("own close command") << 0 << true;
        QTest::newRow("closed by the program") << 1 << true;
        QTest::newRow("system shutdown") << 2 << false;
        QTest::newRow("task manager") << 3 << false;
        QTest::newRow("parent window") << 4 << false;
    }

    void reclamaToShowReadsTheAdvertisingFolder()
    {
        QFETCH(int, mode);
        QFETCH(bool, shows);
        const QString folder = DataFolders::ReclamaFolder();
        QVERIFY(!folder.isEmpty());
        QVERIFY(folder.startsWith(m_env.root()));
        QDir().mkpath(folder);
        touch(QDir(folder).filePath(QStringLiteral("Image_today.png")));
        writeInfo(folder,
            {{QStringLiteral("image_today"), QStringLiteral("http://ads.example/today"), QStringLiteral("X.X.X"),
                QStringLiteral("X.X.X")}});

        const auto shown = ReclamaSchedule::ReclamaToShow(static_cast<ReclamaSchedule::UnloadMode>(mode));
        QCOMPARE(shown.has_value(), shows);
        if (shown) {
            QCOMPARE(QFileInfo(shown->filePath).fileName(), QStringLiteral("Image_today.png"));
            QCOMPARE(shown->address, QStringLiteral("http://ads.example/today"));
        }
    }

    void mediaKind_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<int>("kind");
        const int picture = int(MediaKind::StillPicture);
        const int flash = int(MediaKind::FlashMovie);
        const int web = int(MediaKind::WebPage);
        QTest::newRow("asp with query") << "http://host/list.asp?page=2" << web;
        QTest::newRow("aspx") << "C:\\ads\\page.aspx" << web;
        QTest::newRow("php with query is no page") << "game.php?id=3" << picture;
        QTest::newRow("upper-case HTM") << "C:\\ads\\Image_1.HTM" << web;
        QTest::newRow("html") << "/ads/Image_1.html" << web;
        QTest::newRow("mht") << "a.mht" << web;
        QTest::newRow("substring ht") << "a.ht" << web;
        QTest::newRow("substring sp") << "a.sp" << web;
        QTest::newRow("flash") << "C:\\Games\\Foo.SWF" << flash;
        QTest::newRow("png") << "Image_1.png" << picture;
        QTest::newRow("no extension") << "C:\\ads\\Image" << picture;
        QTest::newRow("ASP? upper-case") << "http://host/LIST.ASP?x=1" << web;
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
        QTest::newRow("first") << "a.b.c"
                               << "." << 1 << false << "b.c";
        QTest::newRow("last") << "a.b.c"
                              << "." << 1 << true << "c";
        QTest::newRow("from start") << "a.b.c"
                                    << "." << 3 << false << "c";
        QTest::newRow("absent") << "abc"
                                << "." << 1 << false << "abc";
        QTest::newRow("absent from end") << "abc"
                                         << "." << 1 << true << "abc";
        QTest::newRow("long separator") << "key::value"
                                        << "::" << 1 << false << "value";
        QTest::newRow("at the end") << "abc."
                                    << "." << 1 << true << "";
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
};

QTEST_GUILESS_MAIN(tst_ReclamaSchedule)
#include "tst_reclamaschedule.moc"

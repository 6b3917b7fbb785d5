// The listed paths answer "is this a piece of what was listed" exactly as a substring search over the
// tab-joined text does, including the cases the quick table must not turn into a wrong "no".
#include "catalogue/ListedPaths.h"

#include "TestEnvironment.h"

#include <QRandomGenerator>
#include <QtTest>

using namespace Brimvault;

class TestListedPaths : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

private Q_SLOTS:
    void containsPiece_data()
    {
        QTest::addColumn<QStringList>("listed");
        QTest::addColumn<QString>("piece");
        QTest::addColumn<bool>("contained");

        const QStringList two {u"C:\\GAMES\\CHESS\\CHESS.EXE"_qs, u"D:\\ARCADE\\PONG.EXE"_qs};
        QTest::newRow("nothing listed, empty piece") << QStringList() << QString() << true;
        QTest::newRow("nothing listed") << QStringList() << u"C:\\A.EXE"_qs << false;
        QTest::newRow("whole path") << two << u"D:\\ARCADE\\PONG.EXE"_qs << true;
        QTest::newRow("folder of a path") << two << u"C:\\GAMES"_qs << true;
        QTest::newRow("middle of a path") << two << u"CHESS\\CH"_qs << true;
        QTest::newRow("end of one and start of the next") << two << u"EXE\tD:\\AR"_qs << true;
        QTest::newRow("leading tab") << two << u"\tC:\\GAMES"_qs << true;
        QTest::newRow("longer than any path") << two << u"C:\\GAMES\\CHESS\\CHESS.EXE2"_qs << false;
        QTest::newRow("other case") << two << u"c:\\games"_qs << false;
        QTest::newRow("one character") << two << u"P"_qs << true;
        QTest::newRow("three characters, absent") << two << u"XYZ"_qs << false;
        QTest::newRow("every run present, order not") << two << u"GAMESARCADE"_qs << false;
        QTest::newRow("runs across two paths") << two << u".EXED:\\A"_qs << false;
        QTest::newRow("non-Latin") << QStringList {u"C:\\ИГРЫ\\ШАХМАТЫ.EXE"_qs} << u"ИГРЫ\\ШАХ"_qs << true;
        QTest::newRow("non-Latin, absent") << QStringList {u"C:\\ИГРЫ\\ШАХМАТЫ.EXE"_qs} << u"ИГРЫ\\ШАШ"_qs << false;
        QTest::newRow("web address") << QStringList {u"HTTP://GAMES.EXAMPLE/ONLINE-GAMES-CATALOG.ASP"_qs}
                                     << u"EXAMPLE/ONLINE"_qs << true;
    }

    void containsPiece()
    {
        QFETCH(QStringList, listed);
        QFETCH(QString, piece);
        QFETCH(bool, contained);
        ListedPaths paths;
        QString joined;
        for (const QString& path : std::as_const(listed)) {
            paths.append(path);
            joined += u'\t' + path;
        }
        QCOMPARE(paths.text(), joined);
        QCOMPARE(paths.containsPiece(piece), contained);
    }

    // Thousands of generated paths and pieces cut from them, changed by one character, or made up.
    void manyPathsAnswerAsASearchDoes()
    {
        QRandomGenerator random(42);
        const auto word = [&random](int length) {
            QString text;
            for (int i = 0; i < length; ++i)
                text += QChar(u'A' + random.bounded(6));
            return text;
        };
        ListedPaths paths;
        QStringList listed;
        for (int i = 0; i < 3000; ++i) {
            const QString path = u"C:\\"_qs + word(3) + u'\\' + word(4) + u".EXE"_qs;
            paths.append(path);
            listed.append(path);
        }
        const QString joined = u'\t' + listed.join(u'\t');
        int found = 0;
        int missed = 0;
        for (int i = 0; i < 3000; ++i) {
            const QString& source = listed.at(random.bounded(int(listed.size())));
            QString piece = source.mid(random.bounded(int(source.size())), 1 + random.bounded(12));
            if (i % 3 == 1)
                piece[random.bounded(int(piece.size()))] = QChar(u'A' + random.bounded(26));
            else if (i % 3 == 2)
                piece = word(4 + random.bounded(8));
            const bool expected = joined.contains(piece);
            QCOMPARE(paths.containsPiece(piece), expected);
            (expected ? found : missed) += 1;
        }
        // Both answers must have been asked for, or the comparison proved little.
        QVERIFY(found > 100);
        QVERIFY(missed > 100);
    }
};

QTEST_MAIN(TestListedPaths)
#include "tst_listedpaths.moc"

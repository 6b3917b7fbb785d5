// "Is this a piece of what was listed" answers exactly as a substring search over the tab-joined paths does,
// including the cases the quick table must not turn into a wrong "no".
#include "catalogue/ListedPaths.h"

#include "TestSuite.h"

#include <QRandomGenerator>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestListedPaths : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void containsPiece_data()
    {
        QTest::addColumn<QStringList>("listed");
        QTest::addColumn<QString>("piece");
        QTest::addColumn<bool>("contained");
        const QStringList two {u"C:\\GAMES\\CHESS\\CHESS.EXE"_s, u"D:\\ARCADE\\PONG.EXE"_s};
        const QStringList cyrillic {u"C:\\ИГРЫ\\ШАХМАТЫ.EXE"_s};
        QTest::newRow("nothing listed, empty piece") << QStringList() << QString() << true;
        QTest::newRow("nothing listed") << QStringList() << u"C:\\A.EXE"_s << false;
        QTest::newRow("whole path") << two << u"D:\\ARCADE\\PONG.EXE"_s << true;
        QTest::newRow("middle of a path") << two << u"CHESS\\CH"_s << true;
        QTest::newRow("end of one and start of the next") << two << u"EXE\tD:\\AR"_s << true;
        QTest::newRow("leading tab") << two << u"\tC:\\GAMES"_s << true;
        QTest::newRow("longer than any path") << two << u"C:\\GAMES\\CHESS\\CHESS.EXE2"_s << false;
        QTest::newRow("other case") << two << u"c:\\games"_s << false;
        QTest::newRow("one character") << two << u"P"_s << true;
        QTest::newRow("every run present, order not") << two << u"GAMESARCADE"_s << false;
        QTest::newRow("runs across two paths") << two << u".EXED:\\A"_s << false;
        QTest::newRow("non-Latin") << cyrillic << u"ИГРЫ\\ШАХ"_s << true;
        QTest::newRow("non-Latin, absent") << cyrillic << u"ИГРЫ\\ШАШ"_s << false;
    }
    void containsPiece()
    {
        QFETCH(QStringList, listed);
        QFETCH(QString, piece);
        ListedPaths paths;
        for (const QString& path : std::as_const(listed))
            paths.append(path);
        QCOMPARE(paths.text(), listed.isEmpty() ? QString() : u'\t' + listed.join(u'\t'));
        QTEST(paths.containsPiece(piece), "contained");
    }

    // Thousands of generated paths and pieces cut from them, changed by one character, or made up; both
    // answers must come up often, or the comparison proves little.
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
            listed.append(u"C:\\"_s + word(3) + u'\\' + word(4) + u".EXE"_s);
            paths.append(listed.constLast());
        }
        const QString joined = u'\t' + listed.join(u'\t');
        int answers[2] = {0, 0};
        for (int i = 0; i < 3000; ++i) {
            const QString& source = listed.at(random.bounded(int(listed.size())));
            QString piece = source.mid(random.bounded(int(source.size())), 1 + random.bounded(12));
            if (i % 3 == 1)
                piece[random.bounded(int(piece.size()))] = QChar(u'A' + random.bounded(26));
            else if (i % 3 == 2)
                piece = word(4 + random.bounded(8));
            const bool expected = joined.contains(piece);
            QCOMPARE(paths.containsPiece(piece), expected);
            ++answers[expected];
        }
        QVERIFY(answers[0] > 100 && answers[1] > 100);
    }
};
BV_REGISTER_TEST(TestListedPaths);
#include "tst_listedpaths.moc"

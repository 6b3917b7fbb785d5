#include "IconTestSupport.h"
#include "TestEnvironment.h"
#include "icons/cFileIcon.h"

#include <QFile>
#include <QTest>

using namespace Brimvault;

class TestIconsFromExe : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    static void verifyEmpty(const cFileIcon& icon)
    {
        QCOMPARE(icon.ImageCount(), 0);
        QVERIFY(!icon.ResourceID().isValid());
    }

private Q_SLOTS:
    void initTestCase()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("PE fixtures were not built (mingw-w64, icoutils or python3 missing)");
    }

    void mainIcon_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<bool>("found");
        QTest::addColumn<QVariant>("resourceId");
        QTest::addColumn<int>("images");
        for (const QString& arch : {QStringLiteral("32"), QStringLiteral("64")}) {
            const auto row = [&](const char* name) -> QTestData& {
                return QTest::newRow(qPrintable(QString::fromLatin1(name) + arch))
                    << IconTest::peFixture(QString::fromLatin1(name) + arch + QStringLiteral(".exe"));
            };
            row("multi") << true << QVariant(1) << 5;
            row("twogroups") << true << QVariant(QStringLiteral("APPICON")) << 1;
            // Groups 1 to 3 lack an image, disagree on a size, or use an id above 32767: group 4 is the main icon.
            row("broken") << true << QVariant(4) << 1;
            row("badsize") << false << QVariant() << 0;
            row("ver_ru") << false << QVariant() << 0;
            row("nores") << false << QVariant() << 0;
        }
        QTest::newRow("missing file") << m_env.path(QStringLiteral("none.exe")) << false << QVariant() << 0;
        QTest::newRow("not an executable")
            << IconTest::iconInput(QStringLiteral("main.ico")) << false << QVariant() << 0;
    }

    void mainIcon()
    {
        QFETCH(QString, file);
        QFETCH(bool, found);
        QFETCH(QVariant, resourceId);
        QFETCH(int, images);
        cFileIcon icon;
        icon.AddImage(16, 16, 2); // a previous icon is always replaced
        QCOMPARE(icon.LoadMainIconFromEXE(file), found);
        QCOMPARE(icon.Filename(), file);
        QCOMPARE(icon.ResourceID(), resourceId);
        QCOMPARE(icon.ImageCount(), images);
    }

    void groupsOneByOne_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<int>("id");
        QTest::addColumn<QString>("name");
        QTest::addColumn<bool>("loads");
        QTest::addColumn<QVariant>("resourceId");
        const QString broken = IconTest::peFixture(QStringLiteral("broken64.exe"));
        const QString two = IconTest::peFixture(QStringLiteral("twogroups32.exe"));
        QTest::newRow("missing image") << broken << 1 << QString() << false << QVariant();
        QTest::newRow("sizes disagree") << broken << 2 << QString() << false << QVariant();
        QTest::newRow("image id above 32767") << broken << 3 << QString() << false << QVariant();
        QTest::newRow("good id") << broken << 4 << QString() << true << QVariant(4);
        QTest::newRow("good id as #text")
            << broken << 0 << QStringLiteral("#4") << true << QVariant(QStringLiteral("#4"));
        QTest::newRow("name") << two << 0 << QStringLiteral("APPICON") << true << QVariant(QStringLiteral("APPICON"));
        QTest::newRow("name in lower case")
            << two << 0 << QStringLiteral("appicon") << true << QVariant(QStringLiteral("appicon"));
        QTest::newRow("unknown id falls back on the name")
            << two << 99 << QStringLiteral("APPICON") << true << QVariant(QStringLiteral("APPICON"));
        QTest::newRow("id wins over name") << two << 2 << QStringLiteral("APPICON") << true << QVariant(2);
        QTest::newRow("neither") << two << 99 << QStringLiteral("OTHER") << false << QVariant();
    }

    void groupsOneByOne()
    {
        QFETCH(QString, file);
        QFETCH(int, id);
        QFETCH(QString, name);
        QFETCH(bool, loads);
        QFETCH(QVariant, resourceId);
        cFileIcon icon;
        QCOMPARE(icon.LoadIconFromEXE(file, id, name), loads);
        QCOMPARE(icon.ResourceID(), resourceId);
        QCOMPARE(icon.Filename(), file);
        if (!loads)
            verifyEmpty(icon);
    }

    void offsetsArePackedAfterTheDirectory()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIconFromEXE(IconTest::peFixture(QStringLiteral("multi64.exe")), 1, QString()));
        QCOMPARE(icon.ImageCount(), 5);
        QCOMPARE(icon.entry(1).dwImageOffset, 6u + 16u * 5u);
        for (int i = 2; i <= 5; ++i)
            QCOMPARE(icon.entry(i).dwImageOffset, icon.entry(i - 1).dwImageOffset + icon.entry(i - 1).dwBytesInRes);
        for (int i = 1; i <= 5; ++i)
            QCOMPARE(icon.imageBytes(i).size(), icon.ImageSize(i));
        // The same images icotool put into the icon file the resource script named.
        cFileIcon source;
        QVERIFY(source.LoadIcon(IconTest::iconInput(QStringLiteral("main.ico"))));
        QCOMPARE(icon.toIconFile(), source.toIconFile());
    }

    void groupsAgreeWithWrestool_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<int>("id");
        QTest::addColumn<QString>("name");
        for (const QString& arch : {QStringLiteral("32"), QStringLiteral("64")}) {
            const QString multi = IconTest::peFixture(QStringLiteral("multi") + arch + QStringLiteral(".exe"));
            const QString two = IconTest::peFixture(QStringLiteral("twogroups") + arch + QStringLiteral(".exe"));
            const QString broken = IconTest::peFixture(QStringLiteral("broken") + arch + QStringLiteral(".exe"));
            QTest::newRow(qPrintable(QStringLiteral("multi") + arch)) << multi << 1 << QString();
            QTest::newRow(qPrintable(QStringLiteral("twogroups named ") + arch))
                << two << 0 << QStringLiteral("APPICON");
            QTest::newRow(qPrintable(QStringLiteral("twogroups 2 ") + arch)) << two << 2 << QString();
            QTest::newRow(qPrintable(QStringLiteral("broken 4 ") + arch)) << broken << 4 << QString();
        }
    }

    void groupsAgreeWithWrestool()
    {
        QFETCH(QString, file);
        QFETCH(int, id);
        QFETCH(QString, name);
        const auto reference = IconTest::wrestoolGroup(file, id != 0 ? QString::number(id) : name);
        if (!reference)
            QSKIP("wrestool is not installed");
        cFileIcon icon;
        QVERIFY(icon.LoadIconFromEXE(file, id, name));
        const QString saved = m_env.path(QStringLiteral("group.ico"));
        QVERIFY(icon.SaveIcon(saved));
        QFile out(saved);
        QVERIFY(out.open(QIODevice::ReadOnly));
        QCOMPARE(out.readAll(), *reference);
    }

    void truncatedExecutablesNeverLoadPartly_data()
    {
        QTest::addColumn<int>("keep");
        for (int keep : {0, 2, 64, 200, 400, 1024, 4096, 6000, 9000, 12000, 16000})
            QTest::newRow(qPrintable(QString::number(keep))) << keep;
    }

    void truncatedExecutablesNeverLoadPartly()
    {
        QFETCH(int, keep);
        QFile source(IconTest::peFixture(QStringLiteral("multi64.exe")));
        QVERIFY(source.open(QIODevice::ReadOnly));
        const QByteArray whole = source.readAll();
        const QString path = m_env.path(QStringLiteral("cut.exe"));
        QFile cut(path);
        QVERIFY(cut.open(QIODevice::WriteOnly));
        cut.write(whole.left(keep));
        cut.close();
        cFileIcon icon;
        if (icon.LoadMainIconFromEXE(path)) {
            QCOMPARE(icon.ImageCount(), 5);
            QCOMPARE(
                icon.toIconFile().size(), qsizetype(6 + 16 * 5) + [&] {
                    qsizetype sum = 0;
                    for (int i = 1; i <= 5; ++i)
                        sum += icon.ImageSize(i);
                    return sum;
                }());
        } else {
            QCOMPARE(icon.ImageCount(), 0);
        }
    }
};

QTEST_GUILESS_MAIN(TestIconsFromExe)
#include "tst_iconsfromexe.moc"

#include "IconTestSupport.h"
#include "TestEnvironment.h"
#include "app/clsFileVersion.h"
#include "icons/VersionResource.h"

#include <QJsonObject>
#include <QTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestFileVersion : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    static QStringList fields(const clsFileVersion& version)
    {
        return {version.CompanyName(), version.FileDescription(), version.FileVersion(), version.InternalName(),
            version.LegalCopyright(), version.OriginalFileName(), version.ProductName(), version.ProductVersion()};
    }

    // A VS_VERSIONINFO node: header, key, padding, value, padding, children.
    static QByteArray node(
        const QString& key, const QByteArray& value, quint16 type, quint16 valueLength, const QByteArray& children = {})
    {
        QByteArray out(6, '\0');
        out.append(reinterpret_cast<const char*>(key.utf16()), key.size() * 2).append(2, '\0');
        while (out.size() % 4)
            out.append('\0');
        out.append(value);
        while (out.size() % 4)
            out.append('\0');
        out.append(children);
        const quint16 length = quint16(out.size());
        out[0] = char(length & 0xFF);
        out[1] = char(length >> 8);
        out[2] = char(valueLength & 0xFF);
        out[3] = char(valueLength >> 8);
        out[4] = char(type);
        return out;
    }

    static QByteArray text(const QString& value)
    {
        return QByteArray(reinterpret_cast<const char*>(value.utf16()), value.size() * 2).append(2, '\0');
    }

private Q_SLOTS:
    void fixtures_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<QString>("translation");
        QTest::addColumn<QStringList>("expected");
        QTest::newRow("all fields") << "multi64.exe"
                                    << "040904B0"
                                    << QStringList {u"Fixture Works"_s, u"Marble Cascade"_s, u"1.2.3.4"_s, u"marble"_s,
                                           u"(c) Fixture Works"_s, u"marble.exe"_s, u"Marble Cascade Deluxe"_s,
                                           u"1.2"_s};
        QTest::newRow("Russian, code page 1251") << "ver_ru32.exe"
                                                 << "041904E3"
                                                 << QStringList {u"Студия Пример"_s, u"Весёлые шарики"_s, u"2.0.0.1"_s,
                                                        u""_s, u""_s, u""_s, u"Шарики"_s, u""_s};
        QTest::newRow("no description") << "ver_nodesc64.exe"
                                        << "040904E4"
                                        << QStringList {u"Nameless Games"_s, u""_s, u"3.1"_s, u"nodesc"_s, u""_s,
                                               u"nodesc.exe"_s, u"No Description"_s, u"3.1"_s};
    }

    void fixtures()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("PE fixtures were not built");
        QFETCH(QString, file);
        QFETCH(QString, translation);
        QFETCH(QStringList, expected);
        const QString path = IconTest::peFixture(file);
        clsFileVersion version;
        QVERIFY(version.ReadVersion(path));
        QCOMPARE(fields(version), expected);
        QCOMPARE(version.FullFileName(), path);
        QCOMPARE(ReadVersionStrings(path)->translation, translation);

        const auto reference = IconTest::pefileReading(path);
        if (!reference)
            QSKIP("python3-pefile is not installed");
        const QJsonObject pefileVersion = reference->value(QStringLiteral("version")).toObject();
        QCOMPARE(pefileVersion.value(QStringLiteral("translation")).toString(), translation);
        const QJsonObject pefileFields = pefileVersion.value(QStringLiteral("fields")).toObject();
        for (qsizetype i = 0; i < VersionFieldNames().size(); ++i)
            QCOMPARE(fields(version).at(i), pefileFields.value(VersionFieldNames().at(i)).toString());
    }

    void nothingToRead_data()
    {
        QTest::addColumn<QString>("path");
        QTest::newRow("no resources") << IconTest::peFixture(QStringLiteral("nores32.exe"));
        QTest::newRow("icons only") << IconTest::peFixture(QStringLiteral("twogroups64.exe"));
        QTest::newRow("missing file") << m_env.path(QStringLiteral("none.exe"));
        QTest::newRow("not an executable") << QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/icons/CMakeLists.txt");
    }

    void nothingToRead()
    {
        QFETCH(QString, path);
        clsFileVersion version;
        if (IconTest::fixturesBuilt())
            QVERIFY(version.ReadVersion(IconTest::peFixture(QStringLiteral("multi32.exe"))));
        QVERIFY(!version.ReadVersion(path));
        QCOMPARE(fields(version), QStringList(8, QString()));
        QCOMPARE(version.GetAll(), QStringLiteral("; ; ; ; ; ; ; "));
    }

    void getAllHasItsOwnOrder()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("PE fixtures were not built");
        clsFileVersion version;
        QVERIFY(version.ReadVersion(IconTest::peFixture(QStringLiteral("multi32.exe"))));
        QCOMPARE(version.GetAll(),
            QStringLiteral("Marble Cascade Deluxe; 1.2; marble; Marble Cascade; 1.2.3.4; Fixture Works; "
                           "(c) Fixture Works; marble.exe"));
    }

    void blockQueries_data()
    {
        QTest::addColumn<QByteArray>("block");
        QTest::addColumn<QString>("translation");
        QTest::addColumn<QString>("company");

        const QByteArray translation = node(QStringLiteral("Translation"), QByteArray("\x19\x04\xe3\x04", 4), 0, 4);
        const QByteArray vars = node(QStringLiteral("VarFileInfo"), {}, 1, 0, translation);
        const auto strings = [](const QString& table, const QByteArray& value, quint16 valueLength) {
            const QByteArray company = node(QStringLiteral("CompanyName"), value, 1, valueLength);
            return node(QStringLiteral("StringFileInfo"), {}, 1, 0, node(table, {}, 1, 0, company));
        };
        const QByteArray fixed(52, '\0');
        const QByteArray acme = text(QStringLiteral("Acme"));
        QTest::newRow("plain") << node(
            QStringLiteral("VS_VERSION_INFO"), fixed, 0, 52, strings(QStringLiteral("041904E3"), acme, 5) + vars)
                               << "041904E3"
                               << "Acme";
        QTest::newRow("keys in other case") << node(
            QStringLiteral("VS_VERSION_INFO"), fixed, 0, 52, strings(QStringLiteral("041904e3"), acme, 5) + vars)
                                            << "041904E3"
                                            << "Acme";
        QTest::newRow("length in bytes") << node(
            QStringLiteral("VS_VERSION_INFO"), fixed, 0, 52, strings(QStringLiteral("041904E3"), acme, 10) + vars)
                                         << "041904E3"
                                         << "Acme";
        QTest::newRow("text with a NUL inside") << node(QStringLiteral("VS_VERSION_INFO"), fixed, 0, 52,
            strings(QStringLiteral("041904E3"), text(QStringLiteral("Ac")) + text(QStringLiteral("me")), 6) + vars)
                                                << "041904E3"
                                                << "Ac";
        QTest::newRow("table under another name") << node(
            QStringLiteral("VS_VERSION_INFO"), fixed, 0, 52, strings(QStringLiteral("040904B0"), acme, 5) + vars)
                                                  << "041904E3"
                                                  << "";
    }

    void blockQueries()
    {
        QFETCH(QByteArray, block);
        QFETCH(QString, translation);
        QFETCH(QString, company);
        const auto strings = ReadVersionStrings(VersionResource(block));
        QVERIFY(strings);
        QCOMPARE(strings->translation, translation);
        QCOMPARE(strings->values.at(0), company);
    }

    void brokenBlocksReadNothing_data()
    {
        QTest::addColumn<QByteArray>("block");
        const QByteArray vars = node(QStringLiteral("VarFileInfo"), {}, 1, 0,
            node(QStringLiteral("Translation"), QByteArray("\x09\x04", 2), 0, 2));
        QTest::newRow("empty") << QByteArray();
        QTest::newRow("short translation")
            << node(QStringLiteral("VS_VERSION_INFO"), QByteArray(52, '\0'), 0, 52, vars);
        QByteArray zeroLength = node(QStringLiteral("VS_VERSION_INFO"), {}, 0, 0, QByteArray(64, '\0'));
        QTest::newRow("children of length 0") << zeroLength;
        QByteArray tooLong = node(QStringLiteral("VS_VERSION_INFO"), {}, 0, 0, vars);
        tooLong[0] = char(0xFF);
        tooLong[1] = char(0xFF);
        QTest::newRow("length past the end") << tooLong;
    }

    void brokenBlocksReadNothing()
    {
        QFETCH(QByteArray, block);
        QVERIFY(!ReadVersionStrings(VersionResource(block)));
    }
};

QTEST_GUILESS_MAIN(TestFileVersion)
#include "tst_clsfileversion.moc"

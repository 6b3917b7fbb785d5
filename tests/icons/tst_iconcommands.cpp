#include "IconTestSupport.h"
#include "TestEnvironment.h"
#include "icons/IconCommands.h"
#include "icons/PeModule.h"
#include "icons/VersionResource.h"
#include "icons/cFileIcon.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QJsonArray>
#include <QProcess>
#include <QTest>
#include <QTextStream>

using namespace Brimvault;

class TestIconCommands : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    static QByteArray readAll(const QString& path)
    {
        QFile file(path);
        return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
    }

    static QVariant jsonKey(const QJsonValue& value)
    {
        return value.isString() ? QVariant(value.toString()) : QVariant(value.toInt());
    }

    static QString versionText(const QString& file, int* exitCode)
    {
        QString out;
        QString err;
        QTextStream outStream(&out);
        QTextStream errStream(&err);
        *exitCode = IconCommands::PrintVersionInfo(file, outStream, errStream);
        return out;
    }

private Q_SLOTS:
    void extractIcon_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<QString>("group");
        for (const char* name :
            {"multi32.exe", "multi64.exe", "twogroups32.exe", "twogroups64.exe", "broken32.exe", "broken64.exe"})
            QTest::newRow(name) << IconTest::peFixture(QString::fromLatin1(name)) << QString();
        QTest::newRow("badsize64.exe") << IconTest::peFixture(QStringLiteral("badsize64.exe")) << "-";
        QTest::newRow("nores32.exe") << IconTest::peFixture(QStringLiteral("nores32.exe")) << "-";
        QTest::newRow("ver_ru64.exe") << IconTest::peFixture(QStringLiteral("ver_ru64.exe")) << "-";
        QTest::newRow("missing") << m_env.path(QStringLiteral("none.exe")) << "-";
        QTest::newRow("text file") << QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/icons/CMakeLists.txt") << "-";
    }

    void extractIcon()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("PE fixtures were not built");
        QFETCH(QString, file);
        QFETCH(QString, group);
        const QString out = m_env.path(QStringLiteral("out.ico"));
        QFile::remove(out);
        QString err;
        QTextStream errStream(&err);
        const int exitCode = IconCommands::ExtractIcon(file, out, errStream);
        if (group == QLatin1String("-")) {
            QCOMPARE(exitCode, 1);
            QVERIFY(err.endsWith(u'\n'));
            QCOMPARE(err.count(u'\n'), 1);
            QVERIFY(err.size() > 10);
            QVERIFY(!QFile::exists(out));
            return;
        }
        QCOMPARE(exitCode, 0);
        QVERIFY(err.isEmpty());
        cFileIcon icon;
        QVERIFY(icon.LoadMainIconFromEXE(file));
        const auto reference = IconTest::wrestoolGroup(file, icon.ResourceID().toString());
        if (!reference)
            QSKIP("wrestool is not installed");
        QCOMPARE(readAll(out), *reference);
    }

    void unwritableTarget()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("PE fixtures were not built");
        QString err;
        QTextStream errStream(&err);
        QCOMPARE(IconCommands::ExtractIcon(IconTest::peFixture(QStringLiteral("multi32.exe")),
                     m_env.path(QStringLiteral("no/folder/out.ico")), errStream),
            1);
        QVERIFY(err.contains(QStringLiteral("Couldn't open file for writing.")));
    }

    void versionInfo()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("PE fixtures were not built");
        int exitCode = -1;
        QCOMPARE(versionText(IconTest::peFixture(QStringLiteral("ver_nodesc64.exe")), &exitCode),
            QStringLiteral("Translation=040904E4\nCompanyName=Nameless Games\nFileDescription=\nFileVersion=3.1\n"
                           "InternalName=nodesc\nLegalCopyright=\nOriginalFileName=nodesc.exe\n"
                           "ProductName=No Description\nProductVersion=3.1\n"));
        QCOMPARE(exitCode, 0);
        QCOMPARE(versionText(IconTest::peFixture(QStringLiteral("nores64.exe")), &exitCode), QString());
        QCOMPARE(exitCode, 1);
    }

    void theProgramRunsBothCommands()
    {
        const QString program = QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault");
        if (!QFileInfo(program).isExecutable() || !IconTest::fixturesBuilt())
            QSKIP("the program or the fixtures were not built");
        const QString exe = IconTest::peFixture(QStringLiteral("ver_ru32.exe"));
        QProcess process;
        // Qt's own start-up notes would otherwise share standard error with the command's reason.
        const QString runtime = m_env.path(QStringLiteral("runtime"));
        QDir().mkpath(runtime);
        QFile::setPermissions(runtime, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        environment.insert(QStringLiteral("XDG_RUNTIME_DIR"), runtime);
        process.setProcessEnvironment(environment);
        process.start(program, {QStringLiteral("--version-info"), exe});
        QVERIFY(process.waitForFinished(60000));
        QCOMPARE(process.exitCode(), 0);
        const QString out = QString::fromUtf8(process.readAllStandardOutput());
        QVERIFY(out.startsWith(QStringLiteral("Translation=041904E3\nCompanyName=")));
        QVERIFY(out.contains(QStringLiteral("\nFileDescription=Весёлые шарики\n")));

        const QString ico = m_env.path(QStringLiteral("program.ico"));
        process.start(
            program, {QStringLiteral("--extract-icon"), IconTest::peFixture(QStringLiteral("multi64.exe")), ico});
        QVERIFY(process.waitForFinished(60000));
        QCOMPARE(process.exitCode(), 0);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(ico));
        QCOMPARE(icon.ImageCount(), 5);

        process.start(
            program, {QStringLiteral("--extract-icon"), IconTest::peFixture(QStringLiteral("nores64.exe")), ico});
        QVERIFY(process.waitForFinished(60000));
        QCOMPARE(process.exitCode(), 1);
        const QByteArray reason = process.readAllStandardError();
        QCOMPARE(reason.count('\n'), 1);
        QVERIFY(reason.startsWith(QFile::encodeName(IconTest::peFixture(QStringLiteral("nores64.exe")))));
    }

    // Executables that no one here built: whatever packages on this machine installed.
    void realExecutables_data()
    {
        QTest::addColumn<QString>("file");
        const QStringList files = IconTest::realPeFiles(120);
        for (const QString& file : files)
            QTest::newRow(qPrintable(file)) << file;
        if (files.isEmpty())
            QTest::newRow("none found") << QString();
    }

    void realExecutables()
    {
        QFETCH(QString, file);
        if (file.isEmpty())
            QSKIP("no Windows executables on this machine");
        const auto reference = IconTest::pefileReading(file);
        if (!reference)
            QSKIP("python3-pefile is not installed");
        if (reference->contains(QStringLiteral("error")))
            QSKIP("pefile does not read this file");

        // The resource directory, leaf by leaf.
        const auto module = PeModule::fromBytes(readAll(file)).module;
        QVERIFY(module);
        const QJsonArray leaves = reference->value(QStringLiteral("resources")).toArray();
        const QList<ResourceLeaf> ours = module->allResources();
        QCOMPARE(ours.size(), leaves.size());
        QVariant firstGroup;
        for (qsizetype i = 0; i < ours.size(); ++i) {
            const QJsonArray leaf = leaves.at(i).toArray();
            const ResourceLeaf& mine = ours.at(i);
            QCOMPARE(mine.type.named ? QVariant(mine.type.name) : QVariant(int(mine.type.id)), jsonKey(leaf.at(0)));
            QCOMPARE(mine.name.named ? QVariant(mine.name.name) : QVariant(int(mine.name.id)), jsonKey(leaf.at(1)));
            QCOMPARE(qint64(mine.size), qint64(leaf.at(3).toInteger()));
            if (!firstGroup.isValid() && jsonKey(leaf.at(0)) == QVariant(14))
                firstGroup = jsonKey(leaf.at(1));
        }

        // Version information.
        int exitCode = -1;
        const QString text = versionText(file, &exitCode);
        const QJsonValue version = reference->value(QStringLiteral("version"));
        if (version.isNull()) {
            QCOMPARE(exitCode, 1);
        } else {
            QCOMPARE(exitCode, 0);
            const QJsonObject expected = version.toObject();
            QString wanted
                = QStringLiteral("Translation=") + expected.value(QStringLiteral("translation")).toString() + u'\n';
            const QJsonObject fields = expected.value(QStringLiteral("fields")).toObject();
            // Keys match without regard to case, as the platform's version query matches them.
            for (const QString& name : VersionFieldNames()) {
                QString value;
                for (auto it = fields.begin(); it != fields.end(); ++it) {
                    if (it.key().compare(name, Qt::CaseInsensitive) == 0)
                        value = it.value().toString();
                }
                wanted += name + u'=' + value + u'\n';
            }
            QCOMPARE(text, wanted);
        }

        // The main icon: the first group, agreeing with wrestool byte for byte.
        const QString out = m_env.path(QStringLiteral("real.ico"));
        QFile::remove(out);
        QString err;
        QTextStream errStream(&err);
        const int extracted = IconCommands::ExtractIcon(file, out, errStream);
        if (!firstGroup.isValid()) {
            QCOMPARE(extracted, 1);
            return;
        }
        QCOMPARE(extracted, 0);
        cFileIcon icon;
        QVERIFY(icon.LoadMainIconFromEXE(file));
        QCOMPARE(icon.ResourceID().toString(), firstGroup.toString());
        const auto wrestool = IconTest::wrestoolGroup(file, firstGroup.toString());
        if (!wrestool)
            QSKIP("wrestool is not installed");
        QCOMPARE(readAll(out), *wrestool);
    }
};

QTEST_GUILESS_MAIN(TestIconCommands)
#include "tst_iconcommands.moc"

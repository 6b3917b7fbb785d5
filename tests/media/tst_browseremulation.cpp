#include "TestEnvironment.h"

#include "media/BrowserEmulation.h"
#include "store/IniDocument.h"

#include <QDir>
#include <QFile>
#include <QTest>

using namespace Brimvault;

class tst_BrowserEmulation : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    static QByteArray readAll(const QString& path)
    {
        QFile file(path);
        return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
    }

    static void writeAll(const QString& path, const QByteArray& bytes)
    {
        QFile file(path);
        QVERIFY(file.open(QIODevice::WriteOnly));
        file.write(bytes);
    }

private Q_SLOTS:
    void init() { QFile::remove(BrowserEmulationFile()); }

    void fileLiesInTheSettingsFolder()
    {
        QCOMPARE(QFileInfo(BrowserEmulationFile()).absolutePath(),
            QFileInfo(m_env.path(QStringLiteral("settings"))).absoluteFilePath());
    }

    void saveDword_data()
    {
        QTest::addColumn<int>("root");
        QTest::addColumn<quint32>("value");
        QTest::addColumn<QString>("section");
        QTest::addColumn<QString>("stored");
        QTest::newRow("current user, zero")
            << int(RegistryRoot::CurrentUser) << 0u << "HKEY_CURRENT_USER\\SOFTWARE\\Test"
            << "dword:00000000";
        QTest::newRow("local machine, 11001")
            << int(RegistryRoot::LocalMachine) << 11001u << "HKEY_LOCAL_MACHINE\\SOFTWARE\\Test"
            << "dword:00002af9";
        QTest::newRow("largest value") << int(RegistryRoot::ClassesRoot) << 0xffffffffu
                                       << "HKEY_CLASSES_ROOT\\SOFTWARE\\Test"
                                       << "dword:ffffffff";
    }

    void saveDword()
    {
        QFETCH(int, root);
        QFETCH(quint32, value);
        QFETCH(QString, section);
        QFETCH(QString, stored);
        QVERIFY(SaveDword(
            static_cast<RegistryRoot>(root), QStringLiteral("SOFTWARE\\Test"), QStringLiteral("Brimvault.exe"), value));
        const IniDocument document = IniDocument::parse(readAll(BrowserEmulationFile()));
        QCOMPARE(document.value(section, QStringLiteral("brimvault.exe")).value_or(QString()), stored);
    }

    void otherValuesAndDamagedLinesSurvive()
    {
        writeAll(BrowserEmulationFile(), "; kept by hand\n[Other]\nkeep=1\nthis line is damaged\n");
        WriteBrowserEmulationValues();
        WriteBrowserEmulationValues();
        const QByteArray bytes = readAll(BrowserEmulationFile());
        QVERIFY(bytes.contains("; kept by hand"));
        QVERIFY(bytes.contains("this line is damaged"));
        const IniDocument document = IniDocument::parse(bytes);
        QCOMPARE(
            document.value(QStringLiteral("Other"), QStringLiteral("keep")).value_or(QString()), QStringLiteral("1"));
        QCOMPARE(document
                     .sectionPairs(QStringLiteral("HKEY_CURRENT_USER\\SOFTWARE\\Microsoft\\Internet "
                                                  "Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION"))
                     .size(),
            1);
        QCOMPARE(document
                     .sectionPairs(QStringLiteral("HKEY_CURRENT_USER\\SOFTWARE\\Wow6432Node\\Microsoft\\Internet "
                                                  "Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION"))
                     .size(),
            1);
    }

    void unwritablePlaceFailsWithoutHarm()
    {
        // A folder where the file should be: nothing to read, nothing replaced.
        QVERIFY(QDir().mkpath(BrowserEmulationFile()));
        QVERIFY(!SaveDword(RegistryRoot::CurrentUser, QStringLiteral("SOFTWARE\\Test"), QStringLiteral("x"), 1));
        QVERIFY(QFileInfo(BrowserEmulationFile()).isDir());
        QVERIFY(QDir(BrowserEmulationFile()).removeRecursively());
    }
};

QTEST_GUILESS_MAIN(tst_BrowserEmulation)
#include "tst_browseremulation.moc"

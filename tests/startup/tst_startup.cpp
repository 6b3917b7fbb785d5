#include "app/CompanionComponents.h"
#include "app/ComponentRegistry.h"
#include "app/startup/modMain.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"
#include "ui/main/frmMain.h"

#include "TestEnvironment.h"

#include <QApplication>
#include <QProcess>
#include <QtTest>

#ifdef Q_OS_UNIX
#include <sys/stat.h>
#endif

using namespace Brimvault;

namespace {

const QString adminMessage = QStringLiteral("You need to run the program as administrator!");

QString versionKey(const QString& prefix)
{
    return prefix + QStringLiteral("Version");
}

QString savedVersion(const QString& prefix)
{
    return GetSetting(AppTitle(), QStringLiteral("Settings"), versionKey(prefix));
}

bool hasSavedVersion(const QString& prefix)
{
    const auto pairs = GetAllSettings(AppTitle(), QStringLiteral("Settings"));
    return std::any_of(pairs.cbegin(), pairs.cend(),
        [&](const auto& pair) { return pair.first.compare(versionKey(prefix), Qt::CaseInsensitive) == 0; });
}

int visibleMainWindows()
{
    const QWidgetList windows = QApplication::topLevelWidgets();
    return int(std::count_if(windows.cbegin(), windows.cend(),
        [](const QWidget* w) { return qobject_cast<const frmMain*>(w) && w->isVisible(); }));
}

// Everything that tells whether a file was written: its bytes, and where the system can tell, a new inode
// (writers replace the file) or a new time stamp.
struct FileStamp {
    QByteArray bytes;
    qint64 inode = 0;
    qint64 mtimeNs = 0;
    bool operator==(const FileStamp&) const = default;
};

FileStamp stampOf(const QString& path)
{
    FileStamp stamp;
    QFile file(path);
    if (file.open(QIODevice::ReadOnly))
        stamp.bytes = file.readAll();
#ifdef Q_OS_UNIX
    struct stat st { };
    if (::stat(QFile::encodeName(path).constData(), &st) == 0) {
        stamp.inode = qint64(st.st_ino);
        stamp.mtimeNs = qint64(st.st_mtim.tv_sec) * 1000000000 + st.st_mtim.tv_nsec;
    }
#endif
    return stamp;
}

// A program folder of its own for each test, holding copies of the built components or stand-ins for them.
class TempProgramFolder {
public:
    TempProgramFolder() { qputenv("BRIMVAULT_PROGRAM_DIR", m_dir.path().toLocal8Bit()); }
    ~TempProgramFolder() { qunsetenv("BRIMVAULT_PROGRAM_DIR"); }

    QString filePath(const QString& prefix) const { return m_dir.filePath(CompanionComponentFile(prefix)); }

    bool addComponent(const QString& prefix) const
    {
        return QFile::copy(QStringLiteral(BRIMVAULT_BIN_DIR) + u'/' + CompanionComponentFile(prefix), filePath(prefix));
    }

    bool addAllComponentsBut(const QString& skippedPrefix) const
    {
        for (const CompanionComponent& component : CompanionComponents()) {
            if (component.prefix != skippedPrefix && !addComponent(component.prefix))
                return false;
        }
        return true;
    }

    // Fixtures are built under the file name of the component they stand in for.
    bool addFixture(const QString& kind, const QString& prefix) const
    {
        const QString fixture
            = QStringLiteral(BRIMVAULT_FIXTURE_DIR) + u'/' + kind + u'/' + CompanionComponentFile(prefix);
        return QFile::copy(fixture, filePath(prefix));
    }

    bool addGarbage(const QString& prefix) const
    {
        QFile file(filePath(prefix));
        return file.open(QIODevice::WriteOnly) && file.write("MZ this is not a library") > 0;
    }

private:
    QTemporaryDir m_dir;
};

class RecordingPrompts {
public:
    RecordingPrompts()
    {
        SetPromptHandler([this](const PromptRequest& request) {
            m_requests.append(request);
            return PromptAnswer::Ok;
        });
    }
    ~RecordingPrompts() { SetPromptHandler({}); }

    const QList<PromptRequest>& requests() const { return m_requests; }

private:
    QList<PromptRequest> m_requests;
};

} // namespace

class TestStartup : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void cleanup();

    void firstRunRegistersAllAndShowsWindow();
    void failingComponentStopsStartup_data();
    void failingComponentStopsStartup();
    void unwritableRegistryShowsMessage();
    void movedProgramRegistersAgain();
    void versionComparison_data();
    void versionComparison();
    void registerComponent_data();
    void registerComponent();
    void registerComponentRaisesForMissingFiles_data();
    void registerComponentRaisesForMissingFiles();
    void realProgramStartsFromOutside();
};

void TestStartup::cleanup()
{
    qDeleteAll(QApplication::topLevelWidgets());
}

void TestStartup::firstRunRegistersAllAndShowsWindow()
{
    TestEnvironment env;
    TempProgramFolder folder;
    RecordingPrompts prompts;
    QVERIFY(folder.addAllComponentsBut(QString()));

    modMain::Main();

    for (const CompanionComponent& component : CompanionComponents()) {
        QCOMPARE(savedVersion(component.prefix), QStringLiteral(BRIMVAULT_VERSION));
        QCOMPARE(RegisteredLibrary(component.prefix + QStringLiteral(".clsVersion")),
            QFileInfo(folder.filePath(component.prefix)).absoluteFilePath());
    }
    QCOMPARE(GetAllSettings(AppTitle(), QStringLiteral("Settings")).size(), 5);
    QVERIFY(prompts.requests().isEmpty());
    QCOMPARE(visibleMainWindows(), 1);

    // A second call finds the window there and does not make another.
    modMain::Main();
    QCOMPARE(visibleMainWindows(), 1);
}

void TestStartup::failingComponentStopsStartup_data()
{
    QTest::addColumn<QString>("velloran");
    QTest::newRow("file missing") << QString();
    QTest::newRow("registration refused") << QStringLiteral("RegisterFails");
    QTest::newRow("registration registers nothing") << QStringLiteral("RegistersNothing");
    QTest::newRow("version object without GetVersion") << QStringLiteral("NoGetVersion");
    QTest::newRow("no DllRegisterServer") << QStringLiteral("NoEntryPoint");
    QTest::newRow("not a library") << QStringLiteral("garbage");
}

void TestStartup::failingComponentStopsStartup()
{
    QFETCH(QString, velloran);
    TestEnvironment env;
    TempProgramFolder folder;
    RecordingPrompts prompts;
    const QString failing = QStringLiteral("Velloran");
    QVERIFY(folder.addAllComponentsBut(failing));
    if (velloran == QStringLiteral("garbage"))
        QVERIFY(folder.addGarbage(failing));
    else if (!velloran.isEmpty())
        QVERIFY(folder.addFixture(velloran, failing));

    modMain::Main();

    QCOMPARE(prompts.requests().size(), 1);
    const PromptRequest& message = prompts.requests().first();
    QCOMPARE(message.text, adminMessage);
    QCOMPARE(message.title, QStringLiteral("Brimvault"));
    QCOMPARE(message.icon, PromptIcon::Critical);
    QCOMPARE(message.buttons, PromptButtons::Ok);
    QCOMPARE(visibleMainWindows(), 0);

    QCOMPARE(savedVersion(QStringLiteral("Quillet")), QStringLiteral(BRIMVAULT_VERSION));
    QCOMPARE(savedVersion(QStringLiteral("Tamarisk")), QStringLiteral(BRIMVAULT_VERSION));
    for (const char* untouched : {"Velloran", "Ostrane", "Corvelle"})
        QVERIFY2(!hasSavedVersion(QString::fromLatin1(untouched)), untouched);
    // The components after the failing one were never registered, let alone loaded.
    QVERIFY(RegisteredLibrary(QStringLiteral("Ostrane.clsVersion")).isEmpty());
    QVERIFY(RegisteredLibrary(QStringLiteral("Corvelle.clsVersion")).isEmpty());
}

void TestStartup::unwritableRegistryShowsMessage()
{
    TestEnvironment env;
    TempProgramFolder folder;
    RecordingPrompts prompts;
    QVERIFY(folder.addAllComponentsBut(QString()));
    // A folder in the registry file's place defeats even a writer running as root.
    QVERIFY(QDir().mkpath(ComponentRegistryPath()));

    modMain::Main();

    QCOMPARE(prompts.requests().size(), 1);
    QCOMPARE(prompts.requests().first().text, adminMessage);
    QCOMPARE(visibleMainWindows(), 0);
    QVERIFY(GetAllSettings(AppTitle(), QStringLiteral("Settings")).isEmpty());
}

void TestStartup::movedProgramRegistersAgain()
{
    TestEnvironment env;
    RecordingPrompts prompts;
    {
        TempProgramFolder oldFolder;
        QVERIFY(oldFolder.addAllComponentsBut(QString()));
        modMain::Main();
        QCOMPARE(visibleMainWindows(), 1);
        cleanup();
    }
    // The registry now names files that are gone; start-up registers the new ones.
    TempProgramFolder newFolder;
    QVERIFY(newFolder.addAllComponentsBut(QString()));
    modMain::Main();

    QVERIFY(prompts.requests().isEmpty());
    QCOMPARE(visibleMainWindows(), 1);
    for (const CompanionComponent& component : CompanionComponents()) {
        QCOMPARE(RegisteredLibrary(component.prefix + QStringLiteral(".clsVersion")),
            QFileInfo(newFolder.filePath(component.prefix)).absoluteFilePath());
    }
}

void TestStartup::versionComparison_data()
{
    QTest::addColumn<QString>("saved"); // a null text: no value saved
    QTest::addColumn<QString>("installed");
    QTest::addColumn<bool>("written");

    QTest::newRow("unchanged") << QStringLiteral("1.0.0") << QStringLiteral("1.0.0") << false;
    QTest::newRow("differs only in case") << QStringLiteral("2.0.0-beta") << QStringLiteral("2.0.0-Beta") << true;
    QTest::newRow("saved is newer") << QStringLiteral("9.9.9") << QStringLiteral("1.0.0") << true;
    QTest::newRow("saved is older") << QStringLiteral("0.9") << QStringLiteral("1.0.0") << true;
    QTest::newRow("trailing space") << QStringLiteral("1.0.0 ") << QStringLiteral("1.0.0") << true;
    QTest::newRow("never saved") << QString() << QStringLiteral("1.0.0") << true;
    QTest::newRow("empty version, never saved") << QString() << QString() << false;
}

void TestStartup::versionComparison()
{
    QFETCH(QString, saved);
    QFETCH(QString, installed);
    QFETCH(bool, written);

    TestEnvironment env;
    TempProgramFolder folder;
    RecordingPrompts prompts;
    QVERIFY(folder.addAllComponentsBut(QStringLiteral("Quillet")));
    QVERIFY(folder.addFixture(QStringLiteral("EnvVersion"), QStringLiteral("Quillet")));
    qputenv("BRIMVAULT_FIXTURE_VERSION", installed.toUtf8());
    auto restoreVersion = qScopeGuard([] { qunsetenv("BRIMVAULT_FIXTURE_VERSION"); });

    // The first run registers everything, so that the second finds every object at the first attempt.
    modMain::Main();
    QCOMPARE(visibleMainWindows(), 1);
    cleanup();
    if (saved.isNull())
        DeleteSetting(AppTitle(), QStringLiteral("Settings"), versionKey(QStringLiteral("Quillet")));
    else
        QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Settings"), versionKey(QStringLiteral("Quillet")), saved));
    const FileStamp settingsBefore = stampOf(env.settingsFile());
    const FileStamp registryBefore = stampOf(ComponentRegistryPath());

    // The checks alone: localisation, which Main runs next, keeps its own settings.
    for (const CompanionComponent& component : CompanionComponents())
        QVERIFY2(modMain::CheckComponent(component.prefix), qPrintable(component.prefix));

    QVERIFY(prompts.requests().isEmpty());
    QCOMPARE(savedVersion(QStringLiteral("Quillet")), installed);
    QCOMPARE(stampOf(env.settingsFile()) != settingsBefore, written);
    QVERIFY(stampOf(ComponentRegistryPath()) == registryBefore);
}

void TestStartup::registerComponent_data()
{
    QTest::addColumn<QString>("prefix");
    QTest::addColumn<QString>("fixture"); // empty: the real component
    QTest::addColumn<int>("status");
    QTest::addColumn<bool>("registered");

    QTest::newRow("real component") << QStringLiteral("Quillet") << QString() << 0 << true;
    QTest::newRow("prefix matched without case") << QStringLiteral("oSTRANE") << QString() << 0 << true;
    QTest::newRow("refusing component") << QStringLiteral("Velloran") << QStringLiteral("RegisterFails")
                                        << int(0x80070005) << false;
    QTest::newRow("unknown prefix does nothing") << QStringLiteral("Nobody") << QString() << 0 << false;
}

void TestStartup::registerComponent()
{
    QFETCH(QString, prefix);
    QFETCH(QString, fixture);
    QFETCH(int, status);
    QFETCH(bool, registered);

    TestEnvironment env;
    TempProgramFolder folder;
    const QString file = CompanionComponentFile(prefix);
    if (!file.isEmpty()) {
        const QString canonicalPrefix = QFileInfo(file).completeBaseName();
        QVERIFY(fixture.isEmpty() ? folder.addComponent(canonicalPrefix) : folder.addFixture(fixture, canonicalPrefix));
    }

    QCOMPARE(modMain::RegisterComponent(prefix), status);
    const QString registeredPath = RegisteredLibrary(prefix + QStringLiteral(".clsVersion"));
    QCOMPARE(!registeredPath.isEmpty(), registered);
    if (registered)
        QCOMPARE(registeredPath, QFileInfo(folder.filePath(prefix)).absoluteFilePath());
    if (file.isEmpty())
        QVERIFY(!QFileInfo::exists(ComponentRegistryPath()));
}

void TestStartup::registerComponentRaisesForMissingFiles_data()
{
    QTest::addColumn<QString>("fixture");
    QTest::newRow("file missing") << QString();
    QTest::newRow("no DllRegisterServer") << QStringLiteral("NoEntryPoint");
}

void TestStartup::registerComponentRaisesForMissingFiles()
{
    QFETCH(QString, fixture);
    TestEnvironment env;
    TempProgramFolder folder;
    if (!fixture.isEmpty())
        QVERIFY(folder.addFixture(fixture, QStringLiteral("Velloran")));
    QVERIFY_THROWS_EXCEPTION(modMain::ComponentFileError, modMain::RegisterComponent(QStringLiteral("Velloran")));
}

void TestStartup::realProgramStartsFromOutside()
{
    TestEnvironment env;
    qunsetenv("BRIMVAULT_PROGRAM_DIR");
    QProcess program;
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    program.setProcessEnvironment(environment);
    program.start(QStringLiteral(BRIMVAULT_BIN_DIR) + QStringLiteral("/brimvault"), {});
    QVERIFY2(program.waitForStarted(10000), qPrintable(program.errorString()));
    auto stop = qScopeGuard([&program] {
        program.terminate();
        if (!program.waitForFinished(5000)) {
            program.kill();
            program.waitForFinished(5000);
        }
    });

    const QList<CompanionComponent> components = CompanionComponents();
    QTRY_VERIFY_WITH_TIMEOUT(std::all_of(components.cbegin(), components.cend(),
                                 [](const CompanionComponent& c) { return hasSavedVersion(c.prefix); }),
        30000);
    for (const CompanionComponent& component : components)
        QCOMPARE(savedVersion(component.prefix), QStringLiteral(BRIMVAULT_VERSION));
    // With the window open the program keeps running.
    QTest::qWait(500);
    QCOMPARE(program.state(), QProcess::Running);
}

QTEST_MAIN(TestStartup)
#include "tst_startup.moc"

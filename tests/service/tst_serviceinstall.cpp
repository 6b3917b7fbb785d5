// The real service installing, packing and tidying up in a temporary tree; slot holders (slotholder.cpp) stand
// for installs that run or were killed. The install in-process where the user can cancel it.
#include "GameInstaller.h"
#include "PackageLimits.h"
#include "ProgressWindow.h"
#include "StagingArea.h"

#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/InfoFiles.h"
#include "store/SettingsStore.h"

#include "ProgramRun.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QDialogButtonBox>
#include <QLabel>
#include <QProcess>
#include <QProgressBar>
#include <QPushButton>
#include <QScopeGuard>

#include <list>

#include <sys/stat.h>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestServiceInstall : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString m_games;
    QString m_packages;
    std::list<QProcess> m_holders;

    static QString signal()
    {
        return GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"0"_s);
    }
    // A hand-made package, good or hostile, of one of the kinds craft_package.py writes.
    static bool craftPackage(const QString& kind, const QString& out)
    {
        const QString script = QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/service/craft_package.py");
        return QProcess::execute(u"python3"_s, {script, kind, out}) == 0;
    }
    // A game folder "name" of the given files, packed by the service; "" when it refused.
    QString packGame(const QString& name, const QList<QPair<QString, QByteArray>>& files) const
    {
        const QString folder = m_env->path(u"sources/"_s + QString::number(qHash(files.first().second))) + u'/' + name;
        for (const auto& [relative, bytes] : files)
            relative.endsWith(u'/') ? QDir().mkpath(folder + u'/' + relative)
                                    : WriteFile(folder + u'/' + relative, bytes);
        const QString package = folder + u".bvxpak"_s;
        return RunService({u"--pack"_s, folder, package}, nullptr) == 0 ? package : QString();
    }
    // The folder of an install slot held by a new process, which also holds the games folder lock if asked.
    QString holdSlot(bool holdGamesLock = false)
    {
        QProcess& holder = m_holders.emplace_back();
        holder.start(
            QStringLiteral(SLOT_HOLDER), holdGamesLock ? QStringList {m_games, u"lock"_s} : QStringList {m_games});
        return holder.waitForReadyRead(30000) ? QString::fromLocal8Bit(holder.readLine()).trimmed() : QString();
    }
    void killAll()
    {
        for (QProcess& holder : m_holders)
            holder.kill(), holder.waitForFinished();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_games = QDir::cleanPath(DataFolders::GamesFolder());
        m_packages = m_env->path(u"packages"_s);
        QVERIFY(QDir().mkpath(m_packages) && WriteFile(m_games + u"/Existing/Existing.exe"_s, "MZ existing"));
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"0"_s));
    }
    void cleanup()
    {
        killAll();
        m_holders.clear();
        m_env.reset();
    }

    // Refused before anything is written, the games folder included (or where a file blocks it); the name rules
    // are the validator's table.
    void refused_data()
    {
        QTest::addColumn<QString>("kind");
        QTest::addColumn<QStringList>("settings"); // key, value, ...
        QTest::addColumn<QString>("reason");
        const QStringList none;
        QTest::newRow("symbolic link") << u"symlink"_s << none << u"symbolic link"_s;
        QTest::newRow("device") << u"device"_s << none << u"special file"_s;
        QTest::newRow("not enough space") << u"huge"_s
                                          << QStringList {PackageLimitKeys::MaxUnpackedMegabytes, u"1000000000000"_s,
                                                 PackageLimitKeys::MaxCompressionRatio, u"1000000000000000"_s}
                                          << u"MB are free"_s;
        QTest::newRow("not a zip") << u"notzip"_s << none << u"not a game package"_s;
        QTest::newRow("truncated") << u"truncated"_s << none << u"damaged"_s;
        QTest::newRow("bad checksum") << u"corrupt"_s << none << u"CRC"_s;
        QTest::newRow("size header lies") << u"liar"_s << none << u"larger than its header says"_s;
        QTest::newRow("missing package") << QString() << none << u"cannot be found"_s;
        QTest::newRow("games folder is a file") << u"good"_s << none << u"cannot be created"_s;
    }
    void refused()
    {
        QFETCH(QString, kind);
        QFETCH(QStringList, settings);
        QFETCH(QString, reason);
        for (qsizetype i = 0; i + 1 < settings.size(); i += 2)
            QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, settings.at(i), settings.at(i + 1)));
        const QString package = m_packages + u"/package.bvxpak"_s;
        const bool blocked = reason == u"cannot be created";
        QVERIFY2(QDir(m_games).removeRecursively() && (!blocked || WriteFile(m_games))
                && (kind.isEmpty() || craftPackage(kind, package)),
            "needs python3");
        const auto before = SnapshotTree(m_env->root());
        QString output;
        QCOMPARE(RunService({u"-I"_s, package}, &output), 1);
        QVERIFY2(output.contains(reason), qPrintable(output));
        QCOMPARE(SnapshotTree(m_env->root()), before);
    }

    // libarchive reads a ZIP member marked as a pipe as a plain file; it must never become a pipe on disk.
    void pipeEntryLandsAsPlainFile()
    {
        QVERIFY2(craftPackage(u"fifo"_s, m_packages + u"/pipe.bvxpak"_s), "needs python3");
        QCOMPARE(RunService({u"-I"_s, m_packages + u"/pipe.bvxpak"_s}, nullptr), 0);
        struct stat status { };
        QCOMPARE(::lstat(QFile::encodeName(m_games + u"/Game/pipe"_s).constData(), &status), 0);
        QVERIFY(S_ISREG(status.st_mode));
    }

    // One of them reinstalls "Existing" under another letter case, which replaces the folder it had.
    void concurrentInstallsBothLand()
    {
        const QStringList names {u"EXISTING"_s, u"South"_s};
        QStringList packages;
        for (const QString& name : names)
            packages << packGame(name,
                {{name + u".exe"_s, "MZ"}, {u"a.dat"_s, RandomBytes(12 << 20, packages.size())},
                    {u"b.dat"_s, RandomBytes(12 << 20, 2 + packages.size())}, {u"Données/empty.txt"_s, QByteArray()},
                    {u"saves/"_s, QByteArray()}});
        QProcess services[2];
        for (int i = 0; i < 2; ++i)
            services[i].start(ServicePath(), {u"-I"_s, packages.at(i)});
        for (int i = 0; i < 2; ++i) {
            QVERIFY(services[i].waitForFinished(120000));
            QCOMPARE(services[i].exitCode(), 0);
            // Large packages report their progress on standard error when there is no display.
            const QString errors = QString::fromLocal8Bit(services[i].readAllStandardError());
            QVERIFY2(errors.startsWith(u"Installing \"%1\" (24 MB)...\n"_s.arg(names.at(i)))
                    && errors.contains(u"Unpacking: 50%\nUnpacking: 60%\n")
                    && errors.endsWith(
                        u"Unpacking: 100%\nFinishing the installation of \"%1\"...\n"_s.arg(names.at(i))),
                qPrintable(errors));
            QCOMPARE(SnapshotTree(m_games + u'/' + names.at(i)), SnapshotTree(packages.at(i).chopped(7)));
        }
        QCOMPARE(QDir(m_games).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot), names);
        QCOMPARE(signal(), u"1"_s);
    }

    void packRefused_data()
    {
        QTest::addColumn<QStringList>("files"); // below the game folder; none: the folder is missing
        QTest::addColumn<bool>("packageInside");
        QTest::addColumn<QString>("reason");
        QTest::newRow("missing folder") << QStringList() << false << u"does not exist"_s;
        QTest::newRow("no game file") << QStringList {u"readme.txt"_s} << false << u"no .exe or .swf"_s;
        QTest::newRow("symbolic link") << QStringList {u"Game.exe"_s, u"settings.ini"_s} << false
                                       << u"link or special file"_s;
        QTest::newRow("package inside the folder")
            << QStringList {u"Game.exe"_s} << true << u"inside the game folder"_s;
    }
    void packRefused()
    {
        QFETCH(QStringList, files);
        QFETCH(bool, packageInside);
        QFETCH(QString, reason);
        const QString folder = m_env->path(u"sources/Game"_s);
        for (const QString& file : files)
            QVERIFY(file == u"settings.ini" ? QFile::link(m_env->settingsFile(), folder + u'/' + file)
                                            : WriteFile(folder + u'/' + file));
        const QString package = (packageInside ? folder : m_packages) + u"/out.bvxpak"_s;
        QString output;
        QCOMPARE(RunService({u"--pack"_s, folder, package}, &output), 1);
        QVERIFY2(output.contains(reason), qPrintable(output));
        QVERIFY(!QFileInfo::exists(package)
            && QDir(m_packages).isEmpty(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot));
    }

    // The games folder on a small file system of its own, with room in bytes but not in files: the disk fills
    // while unpacking.
    void diskFillsWhileUnpacking()
    {
        const QString source = m_env->path(u"source/Big Game"_s);
        for (int i = 0; i < 40; ++i)
            QVERIFY(WriteFile(source + u"/part%1.exe"_s.arg(i), RandomBytes(1024, quint32(i))));
        QCOMPARE(RunService({u"--pack"_s, source, m_packages + u"/big.bvxpak"_s}, nullptr), 0);
        const QString disk = m_env->path(u"commonappdata"_s);
        const QStringList mount {u"-t"_s, u"tmpfs"_s, u"-o"_s, u"size=64m,nr_inodes=16"_s, u"bv-test"_s, disk};
        QVERIFY2(QProcess::execute(u"mount"_s, mount) == 0, "a tmpfs could not be mounted: the test must run as root");
        const auto unmount = qScopeGuard([&] { QProcess::execute(u"umount"_s, {u"-l"_s, disk}); });
        QVERIFY(WriteFile(m_games + u"/Existing/Existing.exe"_s, "MZ existing"));
        const auto before = SnapshotTree(m_games);
        QString output;
        QCOMPARE(RunService({u"-I"_s, m_packages + u"/big.bvxpak"_s}, &output), 1);
        QVERIFY2(output.contains(u"not enough free space"), qPrintable(output));
        QCOMPARE(SnapshotTree(m_games), before);
        QCOMPARE(signal(), u"0"_s);
    }

    // Silently: what killed installs left goes, a running one stays.
    void tidy()
    {
        const auto clean = SnapshotTree(m_games);
        const QString running = holdSlot();
        const QString killed = holdSlot();
        // Killed while it held the games folder lock, as during a final rename.
        const QString locking = holdSlot(true);
        QVERIFY(!running.isEmpty() && !killed.isEmpty() && !locking.isEmpty());
        // A hidden name is not enough on every system: the stop mark keeps the folder walk out.
        const QString staging = QFileInfo(running).absolutePath();
        QCOMPARE(QFileInfo(staging).absolutePath(), m_games);
        QVERIFY(QFileInfo(staging).fileName().startsWith(u'.') && InfoFiles::IsStopFolder(staging));
        for (auto holder = std::next(m_holders.begin()); holder != m_holders.end(); ++holder)
            holder->kill(), holder->waitForFinished();
        QVERIFY(QFileInfo::exists(killed + u"/Half/data/part.bin"_s)
            && QFileInfo::exists(m_games + u"/.bvxinstall.lock"_s));
        // A slot whose lock file never got written is a leftover too.
        QVERIFY(QFile::remove(locking + u".lock"_s));
        const auto runningBefore = SnapshotTree(running);
        QString output;
        QCOMPARE(RunService({u"-U"_s}, &output), 0);
        QCOMPARE(output, QString());
        QCOMPARE(SnapshotTree(running), runningBefore);
        QVERIFY(QFileInfo::exists(running + u".lock"_s) && !QFileInfo::exists(killed) && !QFileInfo::exists(locking));
        QVERIFY(!QFileInfo::exists(m_games + u"/.bvxinstall.lock"_s));
        killAll();
        QCOMPARE(RunService({u"-R"_s}, nullptr), 0);
        QCOMPARE(SnapshotTree(m_games), clean);
    }

    // In-process, where the user can cancel. A cancel, a file where the game's folder goes or a staging folder
    // that is a link elsewhere: nothing anywhere changes, nor does tidying up after it or a wrong command line.
    void nothingChanges_data()
    {
        QTest::addColumn<QString>("obstacle"); // "link": the staging folder
        QTest::addColumn<bool>("cancel");
        QTest::newRow("cancel a new game") << QString() << true;
        QTest::newRow("cancel a reinstall") << u"Game/Game.exe"_s << true;
        QTest::newRow("game folder is a file") << u"Game"_s << false;
        QTest::newRow("staging folder is a link") << u"link"_s << false;
    }
    void nothingChanges()
    {
        QFETCH(QString, obstacle);
        QFETCH(bool, cancel);
        const QString elsewhere = m_env->path(u"elsewhere"_s);
        QVERIFY(obstacle.isEmpty()
            || (obstacle == u"link" ? WriteFile(elsewhere + u"/install-1-a/keep.txt"_s, "not ours")
                        && QFile::link(elsewhere, StagingFolderPath(m_games))
                                    : WriteFile(m_games + u'/' + obstacle, "MZ old")));
        const QString package = packGame(u"Game"_s, {{u"Game.exe"_s, "MZ new"}, {u"a.bin"_s, RandomBytes(4 << 20, 9)}});
        const auto before = SnapshotTree(m_env->root());
        int calls = 0;
        const InstallResult result
            = InstallPackage(package, [&](qint64 done, qint64 total) { return ++calls, !cancel || done < total / 2; });
        QCOMPARE(result.cancelled, cancel);
        QVERIFY(!result.succeeded() && !result.signalled && (!cancel || calls > 1));
        QVERIFY(obstacle != u"Game" || result.problem.contains(u"not a game folder"));
        QString output;
        QVERIFY(RunService({u"-U"_s}, &output) == 0 && output.isEmpty());
        QVERIFY(RunService({u"-X"_s}, &output) == 2 && output.contains(u"Usage"));
        QCOMPARE(SnapshotTree(m_env->root()), before);
    }

    // Finishing cannot be cancelled; before it, the Cancel button or closing the window stops the install, and
    // the window stays until the unpacking has stopped and cleaned up behind itself.
    void progressWindow()
    {
        ProgressWindow window;
        window.setGame(u"Space Rocks"_s);
        window.show();
        QVERIFY(QTest::qWaitForWindowExposed(&window) && window.findChild<QLabel*>()->text().contains(u"Space Rocks"));
        auto* bar = window.findChild<QProgressBar*>();
        QTRY_VERIFY_WITH_TIMEOUT((window.showProgress(250, 1000), bar->value() == bar->maximum() / 4), 2000);
        QTRY_VERIFY_WITH_TIMEOUT((window.showProgress(1000, 1000), bar->value() == bar->maximum()), 2000);
        auto* buttons = window.findChild<QDialogButtonBox*>();
        QTest::mouseClick(buttons->button(QDialogButtonBox::Cancel), Qt::LeftButton);
        QVERIFY(window.cancelled() && window.isVisible() && !window.showProgress(2, 10));
        window.setFinishing();
        QVERIFY(!buttons->isEnabled());
        ProgressWindow closed;
        closed.show();
        closed.close();
        QVERIFY(closed.cancelled() && closed.isVisible());
    }
};
BV_REGISTER_TEST(TestServiceInstall);
#include "tst_serviceinstall.moc"

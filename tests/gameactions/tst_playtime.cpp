// The play time of a started game: counted when its process ends, without the launch waiting for it.
#include "gameactions/GameLauncher.h"
#include "gameactions/PlayTimeWatcher.h"
#include "store/CatalogueKeys.h"
#include "store/PlayHistory.h"
#include "store/SettingsStore.h"

#include "LaunchRecords.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QSignalSpy>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestPlayTime : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void processTimeIsAddedWhenItEnds()
    {
        TestEnvironment env;
        const QString savedFolder = QDir::currentPath();
        const QString recorder = env.path(u"bin/recorder"_s);
        QVERIFY(InstallRecorder(QStringLiteral(LAUNCH_RECORDER), recorder));
        qputenv("BV_LAUNCH_RECORD", env.root().toLocal8Bit());
        qputenv("BRIMVAULT_PROGRAM_DIR", env.path(u"program"_s).toLocal8Bit());
        // A runner that records how it was started and then plays for a moment.
        const QString runner = env.path(u"bin/runner"_s);
        QVERIFY(WriteFile(runner, "#!/bin/sh\n\"" + recorder.toLocal8Bit() + "\" \"$@\"\nsleep 2\n"));
        QVERIFY(QFile::setPermissions(runner, QFile::permissions(runner) | QFileDevice::ExeOwner));
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, u"CompatibilityRunner"_s, runner));
        const QString game = env.path(u"games/Chess/chess.exe"_s);
        QVERIFY(WriteFile(game, QByteArray("MZ\x90\x00", 4)));

        GameLauncher launcher;
        QSignalSpy ended(launcher.playTime(), &PlayTimeWatcher::ended);
        launcher.launchItem(game.toUpper(), QString());
        QDir::setCurrent(savedFolder);
        const PlayRecord started = PlayHistory::Read(game);
        QCOMPARE(started.launches, 1);
        QCOMPARE(started.playSeconds, 0);
        QVERIFY(started.lastPlayed.isValid());
        QTRY_COMPARE(ReadLaunchRecords(env.root(), u"recorder"_s).size(), 1);

        QVERIFY(ended.wait(20000));
        const qint64 seconds = ended.first().at(1).toLongLong();
        QVERIFY2(seconds >= 2 && seconds < 20, qPrintable(QString::number(seconds)));
        QCOMPARE(PlayHistory::Read(game).playSeconds, seconds);
        QCOMPARE(PlayHistory::Read(game).launches, 1);
    }
};

BV_REGISTER_TEST(TestPlayTime);
#include "tst_playtime.moc"

#pragma once

#include <QJsonObject>
#include <QList>
#include <QMap>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>

#include <optional>

class TestEnvironment;

// A program folder of its own (BRIMVAULT_PROGRAM_DIR) holding copies of what ships beside the program: the
// five components, the service and the language files, so that a test may damage any of them.
class ProgramFolderCopy {
public:
    ProgramFolderCopy();

    bool isValid() const { return m_valid; }
    QString path() const { return m_dir.path(); }
    QString filePath(const QString& name) const { return m_dir.filePath(name); }

private:
    QTemporaryDir m_dir;
    bool m_valid = false;
};

// What one run of the real program did.
struct ProgramOutcome {
    bool finished = false; // ended by itself within the time limit
    bool crashed = false;
    int exitCode = -1;
    QString standardError;
    QList<QJsonObject> prompts; // the message and input boxes, in order
    std::optional<QJsonObject> window; // what the main window showed once filled; nothing when none opened

    QStringList promptTexts() const;
    QStringList captions() const;
    QStringList itemData() const;
    // The kind of picture ("picture", "no-icon", "none") of the item whose data is the path; empty if absent.
    QString pictureOf(const QString& data) const;
    // Everything worth printing when a check fails.
    QString describe() const;
};

struct ProgramRunOptions {
    QMap<QString, QString> setEnvironment;
    QStringList unsetEnvironment;
    int timeoutMs = 60000;
};

// Starts build/bin/brimvault without arguments in the test's environment, offscreen, with the prompt log
// and the window report switched on, and waits for it to end (killing it after the time limit).
ProgramOutcome RunProgram(
    const TestEnvironment& environment, const QString& programFolder, const ProgramRunOptions& options = {});

// Starts the real service with the arguments and waits for it; the exit code, or -1 when it did not end.
int RunService(const QStringList& arguments, QString* output, int timeoutMs = 60000);

// Every entry below root (and root itself, as "."): folders as "<dir>", named pipes as "<fifo>", links as
// "<link>" + target, files by their bytes. Tells whether anything was written, removed or replaced.
QMap<QString, QByteArray> SnapshotTree(const QString& root);

// Makes a named pipe at path.
bool MakeNamedPipe(const QString& path);

bool WriteBytes(const QString& path, const QByteArray& bytes);
QByteArray ReadBytes(const QString& path);

#pragma once

#include <QJsonObject>
#include <QList>
#include <QMap>
#include <QString>
#include <QTemporaryDir>

#include <optional>

class TestEnvironment;

inline QString ProgramPath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault");
}
inline QString ServicePath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/BrimvaultService");
}

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

    // The window opened visible, nothing was asked, and the program ended normally.
    bool showedWindow() const;
    // Start-up's one message, critical with OK and titled "Brimvault"; no window; exit code 1.
    bool stoppedWithAdminMessage() const;
    // One field ("caption", "data", "picture") of every list item, in list order.
    QStringList items(const QString& field) const;
    // Everything worth printing when a check fails.
    QString describe() const;
};

// Starts the real program without arguments in the test's environment, offscreen, with the prompt log and the
// window report switched on, and waits a minute for it to end. Without a program folder it looks beside itself;
// a null value in changes removes that variable.
ProgramOutcome RunProgram(
    const TestEnvironment& environment, const QString& programFolder, const QMap<QString, QString>& changes = {});

// Starts the real service with the arguments in the calling process's environment and waits a minute for it;
// the exit code, or -1 when it did not end. Standard output and error, merged, go to output.
int RunService(const QStringList& arguments, QString* output);

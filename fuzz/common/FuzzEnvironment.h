#pragma once

#include <QByteArray>
#include <QString>

// A private temporary tree for one fuzzer process: every location the program reads or writes (settings,
// data folders, the program's own folder) points into it, so that no run touches the real user's files.
// Lies in memory where the system offers it and is removed when the process ends.
class FuzzEnvironment {
public:
    // The process-wide tree, made on first use.
    static FuzzEnvironment& instance();

    QString root() const { return m_root; }
    QString path(const QString& relative) const;
    QString settingsFile() const;

    // Writes the bytes to the file below the root, replacing what was there; creates missing folders.
    bool writeFile(const QString& relative, const QByteArray& bytes) const;
    void removeFile(const QString& relative) const;

private:
    FuzzEnvironment();
    QString m_root;
};

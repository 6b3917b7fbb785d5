#pragma once

#include <QByteArray>
#include <QString>

#include <memory>

namespace Brimvault {

// A folder held open while many files in it are read: each is then opened by its name alone, so the system
// walks one path part instead of the whole path (the list reads ten thousand icons from one folder).
class OpenFolder {
public:
    // A folder that cannot be opened still serves: its files are then opened by their whole paths.
    explicit OpenFolder(const QString& path);
    ~OpenFolder();
    OpenFolder(const OpenFolder&) = delete;
    OpenFolder& operator=(const OpenFolder&) = delete;

    const QString& path() const { return m_path; }

private:
    friend class ReadOnlyFile;
    QString m_path;
#ifndef Q_OS_WIN
    int m_descriptor = -1;
#endif
};

// A file opened for reading with as few system calls as a plain read takes: the list reads an info file and
// an icon for every game, so each look-up saved is saved ten thousand times. Anything but a regular file (a
// folder, a named pipe, a device) is refused without being waited on.
class ReadOnlyFile {
public:
    enum class State {
        Missing, // nothing of that name
        NotReadable, // there, but not a regular file, or not ours to read
        Open,
    };

    explicit ReadOnlyFile(const QString& path);
    // The same, opened by name within `folder` when the path lies directly in it.
    ReadOnlyFile(const QString& path, const OpenFolder& folder);
    ~ReadOnlyFile();
    ReadOnlyFile(const ReadOnlyFile&) = delete;
    ReadOnlyFile& operator=(const ReadOnlyFile&) = delete;

    State state() const { return m_state; }
    bool isOpen() const { return m_state == State::Open; }
    // The size when opened.
    qint64 size() const { return m_size; }
    // Up to `count` bytes from `offset`; fewer at the end of the file, none after an error.
    QByteArray readAt(qint64 offset, qint64 count);
    bool failed() const { return m_failed; }

private:
#ifdef Q_OS_WIN
    struct Handle;
    std::unique_ptr<Handle> m_handle;
#else
    void take(int descriptor);
    int m_descriptor = -1; // a plain descriptor: no allocation for each of the list's many files
#endif
    State m_state = State::Missing;
    qint64 m_size = 0;
    bool m_failed = false;
};

} // namespace Brimvault

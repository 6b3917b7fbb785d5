#pragma once

#include <QString>

// A file system of its own, small on purpose: a tmpfs mounted on an existing (empty) folder for as long as
// the object lives. Mounting needs root (CI runs as root); error() says what failed.
class SmallFileSystem {
public:
    // options as for mount -o: "size=8m", "size=64m,nr_inodes=16", ...
    SmallFileSystem(const QString& folder, const QString& options);
    ~SmallFileSystem();
    SmallFileSystem(const SmallFileSystem&) = delete;
    SmallFileSystem& operator=(const SmallFileSystem&) = delete;

    bool isMounted() const { return m_mounted; }
    QString error() const { return m_error; }

private:
    QString m_folder;
    bool m_mounted = false;
    QString m_error;
};

#pragma once

#include <QDir>
#include <QString>
#include <QTemporaryDir>
#include <QtGlobal>

// Points every location the program reads or writes at a fresh temporary tree, so that a test never touches
// the real user's settings or folders. Create one before anything reads a location.
class TestEnvironment {
public:
    TestEnvironment()
    {
        Q_ASSERT(m_root.isValid());
        m_root.setAutoRemove(true);
        for (const char* sub : {"settings", "commonappdata", "personal", "programfiles", "windows"})
            QDir(m_root.path()).mkpath(QString::fromLatin1(sub));
        qputenv("BRIMVAULT_SETTINGS_DIR", path(QStringLiteral("settings")).toLocal8Bit());
        qputenv("BRIMVAULT_COMMON_APPDATA", path(QStringLiteral("commonappdata")).toLocal8Bit());
        qputenv("BRIMVAULT_PERSONAL", path(QStringLiteral("personal")).toLocal8Bit());
        qputenv("BRIMVAULT_PROGRAM_FILES", path(QStringLiteral("programfiles")).toLocal8Bit());
        qputenv("windir", path(QStringLiteral("windows")).toLocal8Bit());
        qputenv("BRIMVAULT_CATALOGUE_ROOT", "http://127.0.0.1:9");
    }

    ~TestEnvironment()
    {
        if (m_programDir)
            qunsetenv("BRIMVAULT_PROGRAM_DIR");
        if (m_locale)
            qunsetenv("BRIMVAULT_LOCALE");
    }
    TestEnvironment(const TestEnvironment&) = delete;
    TestEnvironment& operator=(const TestEnvironment&) = delete;

    // A program folder of the test's own (BRIMVAULT_PROGRAM_DIR) inside the tree, made on first use.
    QString programDir()
    {
        const QString dir = path(QStringLiteral("program"));
        QDir().mkpath(dir);
        qputenv("BRIMVAULT_PROGRAM_DIR", dir.toLocal8Bit());
        m_programDir = true;
        return dir;
    }
    // The user's locale as the program sees it (BRIMVAULT_LOCALE, e.g. "ru_RU").
    void setLocale(const QByteArray& name)
    {
        qputenv("BRIMVAULT_LOCALE", name);
        m_locale = true;
    }

    QString root() const { return m_root.path(); }
    QString path(const QString& relative) const { return m_root.path() + u'/' + relative; }
    QString settingsFile() const { return path(QStringLiteral("settings/Brimvault.ini")); }

private:
    QTemporaryDir m_root;
    bool m_programDir = false;
    bool m_locale = false;
};

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
        for (const auto& [sub, variable] : {std::pair {"settings", "BRIMVAULT_SETTINGS_DIR"},
                 {"commonappdata", "BRIMVAULT_COMMON_APPDATA"}, {"personal", "BRIMVAULT_PERSONAL"},
                 {"programfiles", "BRIMVAULT_PROGRAM_FILES"}, {"windows", "windir"}}) {
            QDir(m_root.path()).mkpath(QLatin1String(sub));
            qputenv(variable, path(QLatin1String(sub)).toLocal8Bit());
        }
        qputenv("BRIMVAULT_CATALOGUE_ROOT", "http://127.0.0.1:9");
    }

    // Only what this one set: an outer environment's program folder and locale stay.
    ~TestEnvironment()
    {
        for (const char* variable : m_set)
            qunsetenv(variable);
    }
    TestEnvironment(const TestEnvironment&) = delete;
    TestEnvironment& operator=(const TestEnvironment&) = delete;

    // A program folder of the test's own (BRIMVAULT_PROGRAM_DIR) inside the tree, made on first use.
    QString programDir()
    {
        const QString dir = path(QStringLiteral("program"));
        QDir().mkpath(dir);
        set("BRIMVAULT_PROGRAM_DIR", dir.toLocal8Bit());
        return dir;
    }
    // The user's locale as the program sees it (BRIMVAULT_LOCALE, e.g. "ru_RU").
    void setLocale(const QByteArray& name) { set("BRIMVAULT_LOCALE", name); }

    QString root() const { return m_root.path(); }
    QString path(const QString& relative) const { return m_root.path() + u'/' + relative; }
    QString settingsFile() const { return path(QStringLiteral("settings/Brimvault.ini")); }

private:
    void set(const char* variable, const QByteArray& value)
    {
        qputenv(variable, value);
        m_set.append(variable);
    }

    QTemporaryDir m_root;
    QList<const char*> m_set;
};

#pragma once

#include "TestEnvironment.h"

#include <QByteArray>
#include <QDir>
#include <QFile>
#include <QString>

// A temporary environment with its own program folder, where the tests put language files.
class LocalizerTestFolder {
public:
    LocalizerTestFolder()
        : m_programDir(m_env.path(QStringLiteral("program")))
    {
        QDir().mkpath(m_programDir);
        qputenv("BRIMVAULT_PROGRAM_DIR", m_programDir.toLocal8Bit());
        qunsetenv("BRIMVAULT_LOCALE");
    }
    ~LocalizerTestFolder()
    {
        qunsetenv("BRIMVAULT_PROGRAM_DIR");
        qunsetenv("BRIMVAULT_LOCALE");
    }
    LocalizerTestFolder(const LocalizerTestFolder&) = delete;
    LocalizerTestFolder& operator=(const LocalizerTestFolder&) = delete;

    const TestEnvironment& env() const { return m_env; }
    QString programDir() const { return m_programDir; }

    QString writeFile(const QString& name, const QByteArray& bytes) const
    {
        const QString path = m_programDir + u'/' + name;
        QFile file(path);
        if (!file.open(QIODevice::WriteOnly) || file.write(bytes) != bytes.size())
            qFatal("cannot write %s", qPrintable(path));
        return path;
    }

    // A usable language file: its language, its charset and one text per line of `texts` (CR LF ends).
    QString writeLanguage(const QString& name, const QByteArray& language, int charset,
        const QByteArray& texts = QByteArrayLiteral("@10=Title\r\n")) const
    {
        return writeFile(
            name, "#language=" + language + "\r\n#charset=" + QByteArray::number(charset) + "\r\n" + texts);
    }

private:
    TestEnvironment m_env;
    QString m_programDir;
};

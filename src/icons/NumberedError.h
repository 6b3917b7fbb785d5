#pragma once

#include <QString>
#include <exception>

namespace Brimvault {

// The error the icon and resource objects raise: an object-error number (0x80040000 + code, or a plain run-time
// number such as 9), its message and the raising object as source ("brimvault.cFileIcon").
class NumberedError : public std::exception {
public:
    NumberedError(quint32 number, QString message, QString source);

    quint32 number() const { return m_number; }
    QString message() const { return m_message; }
    QString source() const { return m_source; }
    const char* what() const noexcept override;

private:
    quint32 m_number;
    QString m_message;
    QString m_source;
    QByteArray m_what;
};

constexpr quint32 ObjectErrorBase = 0x80040000u;
constexpr quint32 SubscriptOutOfRange = 9;
constexpr quint32 InvalidProcedureCall = 5;

// The application's name followed by ".cFileIcon", ".cResources", ...
QString ErrorSource(const QString& objectName);

} // namespace Brimvault

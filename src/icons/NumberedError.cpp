#include "icons/NumberedError.h"

#include "support/ProgramFolder.h"

namespace Brimvault {

NumberedError::NumberedError(quint32 number, QString message, QString source)
    : m_number(number)
    , m_message(std::move(message))
    , m_source(std::move(source))
    , m_what(m_message.toUtf8())
{ }

const char* NumberedError::what() const noexcept
{
    return m_what.constData();
}

QString ErrorSource(const QString& objectName)
{
    return ProgramBaseName() + u'.' + objectName;
}

} // namespace Brimvault

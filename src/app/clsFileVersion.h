#pragma once

#include <QString>
#include <array>

namespace Brimvault {

// The version information of one executable: eight text fields, empty until read.
class clsFileVersion {
public:
    bool ReadVersion(const QString& sFullFileName);
    // The fields joined by "; " in display order (product first), which differs from the reading order.
    QString GetAll() const;

    QString CompanyName() const { return m_fields[0]; }
    QString FileDescription() const { return m_fields[1]; }
    QString FileVersion() const { return m_fields[2]; }
    QString InternalName() const { return m_fields[3]; }
    QString LegalCopyright() const { return m_fields[4]; }
    QString OriginalFileName() const { return m_fields[5]; }
    QString ProductName() const { return m_fields[6]; }
    QString ProductVersion() const { return m_fields[7]; }
    QString FullFileName() const { return m_fullFileName; }

private:
    std::array<QString, 8> m_fields;
    QString m_fullFileName;
};

} // namespace Brimvault

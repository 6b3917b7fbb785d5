#pragma once

#include <QByteArray>
#include <QList>
#include <QString>
#include <QVariant>

class QImage;
class QPainter;
class QScreen;

namespace Brimvault {

class OpenFolder;
class PeModule;
class ReadOnlyFile;

// One directory entry of an icon file, as the file stores it.
struct IconDirEntry {
    quint8 bWidth = 0;
    quint8 bHeight = 0;
    quint8 bColorCount = 0;
    quint8 bReserved = 0;
    quint16 wPlanes = 0;
    quint16 wBitCount = 0;
    quint32 dwBytesInRes = 0;
    quint32 dwImageOffset = 0;
};

// Raster operations understood by DrawIconImage.
constexpr quint32 SRCCOPY = 0x00CC0020;
constexpr quint32 SRCPAINT = 0x00EE0086;
constexpr quint32 SRCAND = 0x008800C6;
constexpr quint32 SRCINVERT = 0x00660046;

// An icon exactly as an icon file holds it: header, directory and every image's bytes. Images are numbered from 1.
// SaveIcon, AddImage and the queries raise NumberedError (source ".cFileIcon").
class cFileIcon {
public:
    cFileIcon() = default;

    bool LoadIcon(const QString& sFileName);
    // The same for a file that may lie in a folder held open.
    bool LoadIcon(const QString& sFileName, const OpenFolder& folder);
    bool SaveIcon(const QString& sFileName = QString());
    void CloneTo(cFileIcon& target) const;

    QString Filename() const { return m_filename; }
    QVariant ResourceID() const { return m_resourceId; }
    int ImageCount() const { return m_idCount; }
    int ImageWidth(int nIndex) const;
    int ImageHeight(int nIndex) const;
    // bColorCount, else 2^wBitCount, else -1 for 32-bit images.
    qint64 ImageColourCount(int nIndex) const;
    int ImageSize(int nIndex) const;

    void AddImage(int lWidth, int lHeight, int lColours);
    void RemoveImage(int nIndex);

    bool LoadIconFromEXE(const QString& sFileName, int lID, const QString& sName);
    bool LoadMainIconFromEXE(const QString& sFileName);

    // The image that suits a 32-pixel cell on the display, composed with its transparency; null when none.
    QImage BestIconPicture();
    // The same on a screen of more device pixels than units: the image that fills the cell's real pixels,
    // with that pixel ratio; BestIconPicture's choice on an ordinary screen.
    QImage ScreenIconPicture();
    // True when ScreenIconPicture is sure to give a picture without decoding it now: the picture is the best
    // image as it stands, and that image's layout is sound.
    bool ScreenPictureIsSound();
    QImage IconPicture(int nIndex) const;
    // Colour bits and AND mask composed into one picture with transparency; null on failure.
    QImage IconHandle(int nIndex) const;
    void DrawIconImage(QPainter& painter, int nIndex, bool bMask, int x, int y, int lWidth = 0, int lHeight = 0,
        quint32 lRop = SRCCOPY) const;

    // The choice BestIconPicture makes for a display of the given depth.
    int bestIconIndex(int wantedDepth) const;
    // The smallest image at least wantedPixels wide (else the widest), nearest in depth among equals; 0 if none.
    int sharpIconIndex(int wantedPixels, int wantedDepth) const;
    static qreal displayPixelRatio();
    // Bits per pixel of the display, asked once per object: the primary screen's, or 32 without one.
    int displayDepth();
    // Why the last LoadIcon failed (not shown to anyone; kept for diagnostics and tests).
    QString lastLoadMessage() const { return m_lastLoadMessage; }

    quint16 idReserved() const { return m_idReserved; }
    quint16 idType() const { return m_idType; }
    const IconDirEntry& entry(int nIndex) const;
    QByteArray imageBytes(int nIndex) const;
    // The icon file this object would save.
    QByteArray toIconFile() const;

private:
    void reset(const QString& sFileName);
    bool loadFrom(const QString& sFileName, ReadOnlyFile& file);
    bool loadGroup(const PeModule& module, int lID, const QString& sName);
    void checkIndex(int nIndex) const;
    // Bits per pixel of an image, from its colour count (32 for true colour).
    double imageDepth(int nIndex) const;
    // The screen icons are drawn for; none without a GUI application.
    static const QScreen* displayScreen();

    QString m_filename;
    QVariant m_resourceId;
    quint16 m_idReserved = 0;
    quint16 m_idType = 0;
    qint16 m_idCount = 0;
    QList<IconDirEntry> m_entries;
    QList<QByteArray> m_images;
    // The bytes LoadIcon read at once; the images found in them refer into them.
    QByteArray m_fileBytes;
    int m_displayDepth = 0;
    QString m_lastLoadMessage;
};

} // namespace Brimvault

#pragma once

#include <QColor>
#include <QImage>
#include <QString>
#include <QWidget>

class QMovie;
class QToolButton;
class QWebEngineView;

namespace Brimvault {

enum class RegistryRoot : quint32;

// The media host window: shows a still picture in its own client area, a web page in an embedded browser
// (oIE) or a Flash movie played by Ruffle (oFlash). Every use is a new instance that deletes itself when it
// closes. The launcher calls RunGame, the advertising schedule ReclamaShow.
class frmReclama : public QWidget {
    Q_OBJECT

public:
    enum DisplayMode { ModeNothing = 0, ModeStillPicture = 1, ModeFlashMovie = 2, ModeWebPage = 3 };

    explicit frmReclama(QWidget* parent = nullptr);
    ~frmReclama() override;

    void ReclamaShow(const QString& file, const QString& address);
    void RunGame(const QString& path, const QString& clickAddress = QString());
    bool LoadHTML(const QString& address);
    QWebEngineView* GetIE();
    bool LoadFlashMovie(const QString& file);

    static QString RightTo(const QString& text, const QString& separator, int start, bool fromEnd);
    static bool SaveDword(RegistryRoot root, const QString& keyPath, const QString& valueName, quint32 value);

    // Captions the window "Advertising"; windows opened by a page for a new window use OnlineGamesCaption.
    void SetReclamaCaption();
    void SetOnlineGamesCaption();
    Q_INVOKABLE void ChangeLocalizeCaptions();

    int DisplayModeValue() const { return m_mode; }
    QString ClickAddress() const { return m_clickAddress; }
    QWebEngineView* oIE() const { return m_ie; }
    QWebEngineView* oFlash() const { return m_flash; }
    QToolButton* pbGoBack() const { return m_goBack; }

    // Client size of advertisements and Flash movies.
    static QSize HostClientSize() { return {640, 480}; }

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;

private:
    QWebEngineView* createBrowser();
    QWebEngineView* createFlashHost();
    void removeHostedControls();
    bool showStillPicture(const QString& file);
    void updateBackButton();
    void layoutControls();
    void openWithShell(const QString& target);
    void onFlashHostLoaded(bool ok);
    void reportFlashMissing();
    void finishShowing(bool failed, bool maximized);

    int m_mode = ModeNothing;
    QImage m_picture;
    QString m_clickAddress;
    QColor m_backColour;
    bool m_sampleColours = true;
    QColor m_sampledColour;
    // 0 when the caption is not one of the numbered texts (a game's own name).
    int m_captionNumber = 1210;
    QString m_captionText;
    QWebEngineView* m_ie = nullptr;
    QWebEngineView* m_flash = nullptr;
    QToolButton* m_goBack = nullptr;
    // Animated GIF advertisements; m_picture then holds the current frame.
    QMovie* m_animation = nullptr;
    bool m_flashReported = false;
};

} // namespace Brimvault

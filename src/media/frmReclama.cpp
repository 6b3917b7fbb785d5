#include "media/frmReclama.h"

#include "app/CatalogueServer.h"
#include "i18n/modLocalizer.h"
#include "media/BrowserEmulation.h"
#include "media/HostPages.h"
#include "media/MediaHost.h"
#include "media/MediaHostFiles.h"
#include "media/MediaKind.h"
#include "media/ReclamaPicture.h"
#include "store/CatalogueKeys.h"
#include "support/SystemFolders.h"
#include "support/UserPrompt.h"

#include <QAction>
#include <QDesktopServices>
#include <QDir>
#include <QImageReader>
#include <QKeyEvent>
#include <QMouseEvent>
#include <QMovie>
#include <QPainter>
#include <QPointer>
#include <QStyle>
#include <QToolButton>
#include <QWebEngineView>

namespace Brimvault {

namespace {

constexpr int OnlineGamesCaptionNumber = 1250;
constexpr int ReclamaCaptionNumber = 1210;
constexpr int BackBarHeight = 30;

void showMissingControl(const QString& text)
{
    ShowPrompt({text, modLocalizer::Translate(1020, QStringLiteral("Brimvault")), PromptIcon::Critical});
}

} // namespace

frmReclama::frmReclama(QWidget* parent)
    : QWidget(parent, Qt::Window)
    , m_backColour(0xFF, 0xAF, 0xAF)
{
    setAttribute(Qt::WA_DeleteOnClose);
    setObjectName(QStringLiteral("frmReclama"));
    resize(HostClientSize());

    m_goBack = new QToolButton(this);
    m_goBack->setObjectName(QStringLiteral("pbGoBack"));
    m_goBack->setAccessibleName(tr("Back"));
    m_goBack->setIcon(style()->standardIcon(QStyle::SP_ArrowBack));
    m_goBack->setAutoRaise(true);
    m_goBack->setFocusPolicy(Qt::NoFocus);
    m_goBack->hide();
    m_goBack->setEnabled(false);
    connect(m_goBack, &QToolButton::clicked, this, [this] {
        if (m_ie)
            m_ie->back();
    });

    ChangeLocalizeCaptions();
}

frmReclama::~frmReclama() = default;

QString frmReclama::RightTo(const QString& text, const QString& separator, int start, bool fromEnd)
{
    return Brimvault::RightTo(text, separator, start, fromEnd);
}

bool frmReclama::SaveDword(RegistryRoot root, const QString& keyPath, const QString& valueName, quint32 value)
{
    return Brimvault::SaveDword(root, keyPath, valueName, value);
}

void frmReclama::SetReclamaCaption()
{
    m_captionNumber = ReclamaCaptionNumber;
    ChangeLocalizeCaptions();
}

void frmReclama::SetOnlineGamesCaption()
{
    m_captionNumber = OnlineGamesCaptionNumber;
    ChangeLocalizeCaptions();
}

void frmReclama::ChangeLocalizeCaptions()
{
    if (m_captionNumber != 0)
        setWindowTitle(modLocalizer::Translate(m_captionNumber));
    else
        setWindowTitle(m_captionText);
}

void frmReclama::ReclamaShow(const QString& file, const QString& address)
{
    m_clickAddress = address;
    resize(HostClientSize());
    bool failed = false;
    switch (MediaKindOf(file)) {
    case MediaKind::WebPage:
        failed = !LoadHTML(address.trimmed().isEmpty() ? file : address);
        unsetCursor();
        break;
    case MediaKind::FlashMovie:
        failed = !LoadFlashMovie(file);
        unsetCursor();
        break;
    case MediaKind::StillPicture:
        failed = !showStillPicture(file);
        break;
    }
    finishShowing(failed, false);
}

void frmReclama::RunGame(const QString& path, const QString& clickAddress)
{
    if (!clickAddress.isNull())
        m_clickAddress = clickAddress;
    if (!clickAddress.trimmed().isEmpty()) {
        m_captionNumber = 0;
        m_captionText = clickAddress.trimmed();
        ChangeLocalizeCaptions();
    }

    bool failed = false;
    bool maximized = false;
    switch (MediaKindOf(path)) {
    case MediaKind::WebPage:
        if (!LoadHTML(path)) {
            openWithShell(path);
            close();
            return;
        }
        maximized = true;
        unsetCursor();
        break;
    case MediaKind::FlashMovie:
        resize(HostClientSize());
        failed = !LoadFlashMovie(path);
        unsetCursor();
        break;
    case MediaKind::StillPicture:
        failed = !showStillPicture(path);
        break;
    }
    finishShowing(failed, maximized);
}

void frmReclama::finishShowing(bool failed, bool maximized)
{
    if (failed) {
        close();
        return;
    }
    if (maximized)
        showMaximized();
    else
        show();
}

bool frmReclama::LoadHTML(const QString& address)
{
    if (!m_ie) {
        WriteBrowserEmulationValues();
        if (!MediaHostFiles::WebEngineAvailable())
            return false;
        createBrowser();
    }
    const QUrl url = MediaHostFiles::ContentUrl(address);
    if (!url.isValid() || address.trimmed().isEmpty())
        return false;
    m_ie->show();
    m_mode = ModeWebPage;
    layoutControls();
    m_ie->load(url);
    return true;
}

QWebEngineView* frmReclama::GetIE()
{
    if (!m_ie && !MediaHostFiles::WebEngineAvailable()) {
        showMissingControl(QStringLiteral("Internet Explorer Control not installed properly."));
        m_mode = ModeNothing;
        return nullptr;
    }
    if (!m_ie)
        createBrowser();
    m_ie->show();
    m_mode = ModeWebPage;
    layoutControls();
    return m_ie;
}

QWebEngineView* frmReclama::createBrowser()
{
    m_ie = new QWebEngineView(this);
    m_ie->setObjectName(QStringLiteral("oIE"));
    auto* page = new WebHostPage(m_ie);
    m_ie->setPage(page);
    connect(page, &QWebEnginePage::windowCloseRequested, this, &QWidget::close);
    connect(page->action(QWebEnginePage::Back), &QAction::changed, this, &frmReclama::updateBackButton);
    connect(page, &QWebEnginePage::geometryChangeRequested, this, [this](const QRect& geometry) {
        if (geometry.isValid())
            resize(geometry.size() + QSize(0, m_goBack->isVisible() ? BackBarHeight : 0));
    });
    layoutControls();
    return m_ie;
}

bool frmReclama::LoadFlashMovie(const QString& file)
{
    if (!MediaHostFiles::WebEngineAvailable() || !MediaHostFiles::RuffleInstalled()) {
        MediaHost::ReportFlashMissing();
        m_mode = ModeNothing;
        return false;
    }
    if (!m_flash)
        createFlashHost();
    m_flash->show();
    m_mode = ModeFlashMovie;
    layoutControls();
    m_flash->load(MediaHostFiles::RuffleHostUrl(MediaHostFiles::ContentUrl(file), CatalogueServerRoot()));
    m_flash->setFocus();
    return true;
}

QWebEngineView* frmReclama::createFlashHost()
{
    m_flash = new QWebEngineView(this);
    m_flash->setObjectName(QStringLiteral("oFlash"));
    m_flash->setPage(new FlashHostPage(m_flash));
    connect(m_flash, &QWebEngineView::loadFinished, this, &frmReclama::onFlashHostLoaded);
    connect(m_flash, &QWebEngineView::titleChanged, this, [this](const QString& title) {
        // Ruffle failed to start (its WebAssembly missing or broken) long after the page loaded.
        if (title == u"brimvault:failed" || title == u"brimvault:no-ruffle")
            reportFlashMissing();
    });
    return m_flash;
}

void frmReclama::onFlashHostLoaded(bool ok)
{
    if (!m_flash)
        return;
    if (!ok) {
        reportFlashMissing();
        return;
    }
    m_flash->page()->runJavaScript(QStringLiteral("window.brimvault ? window.brimvault.state : 'no-host'"),
        [window = QPointer<frmReclama>(this)](const QVariant& state) {
            const QString text = state.toString();
            if (window && (text == u"no-ruffle" || text == u"no-host"))
                window->reportFlashMissing();
        });
}

void frmReclama::reportFlashMissing()
{
    // Once per window: the page may report the failure in more than one way.
    if (m_flashReported)
        return;
    m_flashReported = true;
    m_mode = ModeNothing;
    // The message is all the user sees, not Ruffle's own error drawn in the player.
    if (m_flash)
        m_flash->hide();
    MediaHost::ReportFlashMissing();
    close();
}

void frmReclama::removeHostedControls()
{
    delete m_flash;
    m_flash = nullptr;
    delete m_ie;
    m_ie = nullptr;
    updateBackButton();
    delete m_animation;
    m_animation = nullptr;
}

bool frmReclama::showStillPicture(const QString& file)
{
    QImageReader reader(file);
    reader.setAutoTransform(true);
    QImage picture = reader.read();
    if (picture.isNull())
        return false;
    removeHostedControls();
    m_picture = std::move(picture);
    m_sampledColour = m_sampleColours ? ReclamaPicture::SurroundingColour(m_picture, m_backColour) : m_backColour;
    m_mode = ModeStillPicture;
    setCursor(Qt::PointingHandCursor);

    delete m_animation;
    m_animation = nullptr;
    if (reader.supportsAnimation() && reader.imageCount() != 1) {
        // Animated advertisements play; the surrounding colour stays the one of the first frame.
        m_animation = new QMovie(file, QByteArray(), this);
        connect(m_animation, &QMovie::frameChanged, this, [this] {
            const QImage frame = m_animation->currentImage();
            if (!frame.isNull())
                m_picture = frame;
            update();
        });
        m_animation->start();
    }
    update();
    return true;
}

void frmReclama::keyPressEvent(QKeyEvent* event)
{
    if (event->key() == Qt::Key_Escape && m_mode == ModeStillPicture) {
        close();
        return;
    }
    QWidget::keyPressEvent(event);
}

void frmReclama::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    if (m_mode == ModeStillPicture && !m_picture.isNull())
        ReclamaPicture::PaintPicture(painter, rect(), m_picture, m_sampledColour);
    else
        painter.fillRect(rect(), m_backColour);
}

void frmReclama::resizeEvent(QResizeEvent* event)
{
    QWidget::resizeEvent(event);
    layoutControls();
}

void frmReclama::layoutControls()
{
    const int top = m_goBack->isVisible() ? BackBarHeight : 0;
    if (m_goBack->isVisible())
        m_goBack->setGeometry(2, 2, BackBarHeight - 4, BackBarHeight - 4);
    const QRect area(0, top, width(), height() - top);
    if (m_ie)
        m_ie->setGeometry(area);
    if (m_flash)
        m_flash->setGeometry(area);
}

void frmReclama::updateBackButton()
{
    const bool canGoBack = m_ie && m_ie->page()->action(QWebEnginePage::Back)->isEnabled();
    m_goBack->setEnabled(canGoBack);
    m_goBack->setVisible(canGoBack);
    layoutControls();
}

void frmReclama::mouseReleaseEvent(QMouseEvent* event)
{
    if (event->button() != Qt::LeftButton || m_mode != ModeStillPicture) {
        QWidget::mouseReleaseEvent(event);
        return;
    }
    if (!m_clickAddress.trimmed().isEmpty())
        openWithShell(m_clickAddress.trimmed());
    close();
}

void frmReclama::openWithShell(const QString& target)
{
    // A relative name is looked up in the data folder, where the shell would start the program.
    const QString workingFolder = GetSpecialFolder(CSIDL_COMMON_APPDATA, QString(CatalogueKeys::GamesSubPath));
    QDesktopServices::openUrl(QUrl::fromUserInput(target, workingFolder));
}

} // namespace Brimvault

#include "ui/main/frmMain.h"

#include "catalogue/IconCacheBuilder.h"
#include "catalogue/ListBuilder.h"
#include "gameactions/PackageInstallCommand.h"
#include "i18n/ApplyLanguage.h"
#include "i18n/modLocalizer.h"
#include "media/ReclamaSchedule.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"
#include "support/CommandLine.h"
#include "ui/listview/ImageCtrl.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ClickLabel.h"
#include "ui/main/FormScaling.h"
#include "ui/main/ListFinder.h"
#include "ui/main/MainWindowDesign.h"
#include "ui/main/QuilletCalls.h"
#include "ui/main/StockPictures.h"

#include <QCloseEvent>
#include <QCoreApplication>
#include <QGuiApplication>
#include <QLinearGradient>
#include <QMenu>
#include <QPainter>
#include <QScopeGuard>
#include <QTimer>

namespace Brimvault {

namespace {

QFont fontWithFallbacks(const QFont& base, const QStringList& families, qreal pointSize)
{
    QFont font = base;
    font.setFamilies(families);
    font.setPointSizeF(pointSize);
    return font;
}

} // namespace

frmMain::frmMain(QWidget* parent)
    : QWidget(parent)
    , m_builder(std::make_unique<ListBuilder>(DataFolders::IconsFolder()))
    , m_iconBuilder(std::make_unique<IconCacheBuilder>(DataFolders::IconsFolder()))
    , m_installFolder(std::make_unique<InstallFolderMemory>())
{
    setObjectName(QStringLiteral("frmMain"));
    setWindowIcon(StockPictures::ProgramIcon());
    createControls();
    createMenus();
    connectGameActions();
    connectMediaHost();
    createKeyboardMenus();
    placeControls();
    connect(qGuiApp, &QGuiApplication::commitDataRequest, this, &frmMain::sessionEnding, Qt::DirectConnection);

    // Loading, up to the list: captions, the screen's resolution, the centre of the screen. The list is
    // filled once the window shows, so that the user watches it fill.
    modLocalizer::ApplyLanguage(this, true);
    FormScaling::ScaleForm(this, FormScaling::ScreenFactors(FormScaling::ScreenTwipsPerPixel(this)));
    m_actionsRightMargin = width() - m_labActions->geometry().right();
    keepActionsButtonAtRightEdge();
    QuilletCalls::CenterForm(this);
}

frmMain::~frmMain()
{
    for (QMenu* menu : {m_mnuActions.data(), m_mnuItemPopup.data()}) {
        if (menu)
            menu->deleteLater();
    }
}

void frmMain::createControls()
{
    m_label2 = new QLabel(this);
    m_label2->setObjectName(QStringLiteral("Label2"));
    m_label3 = new QLabel(this);
    m_label3->setObjectName(QStringLiteral("Label3"));
    m_label4 = new QLabel(this);
    m_label4->setObjectName(QStringLiteral("Label4"));

    // Label2 lies under Label3, a little offset, as its shadow.
    const QStringList titleFamilies {QStringLiteral("Arial Black"), QStringLiteral("Arial"),
        QStringLiteral("Liberation Sans"), QStringLiteral("DejaVu Sans")};
    QFont titleFont = fontWithFallbacks(font(), titleFamilies, MainWindowDesign::TitlePointSize);
    titleFont.setWeight(QFont::Black);
    m_label2->setFont(titleFont);
    m_label3->setFont(titleFont);
    m_label2->setStyleSheet(QStringLiteral("color: rgba(10, 20, 50, 150);"));
    m_label3->setStyleSheet(QStringLiteral("color: white;"));

    QFont copyrightFont = fontWithFallbacks(font(),
        {QStringLiteral("Times New Roman"), QStringLiteral("Liberation Serif"), QStringLiteral("DejaVu Serif")},
        MainWindowDesign::CopyrightPointSize);
    copyrightFont.setItalic(true);
    m_label4->setFont(copyrightFont);
    m_label4->setStyleSheet(QStringLiteral("color: rgb(206, 218, 242);"));

    m_imgActions = new ClickLabel(this);
    m_imgActions->setObjectName(QStringLiteral("imgActions"));
    m_imgActions->setPixmap(StockPictures::ActionsButton(MainWindowDesign::ActionsImageSize));
    m_labActions = new ClickLabel(this);
    m_labActions->setObjectName(QStringLiteral("labActions"));
    QFont actionsFont = font();
    actionsFont.setPointSizeF(MainWindowDesign::ActionsPointSize);
    actionsFont.setBold(true);
    m_labActions->setFont(actionsFont);
    m_labActions->setStyleSheet(QStringLiteral("QLabel { color: white; } QLabel:hover { color: rgb(255, 214, 120); }"));
    m_labActions->setAlignment(Qt::AlignLeft | Qt::AlignVCenter);
    connect(m_imgActions, &ClickLabel::Click, this, &frmMain::ShowActionsMenu);
    connect(m_labActions, &ClickLabel::Click, this, &frmMain::ShowActionsMenu);

    const auto hiddenImage = [this](const char* name, const QPixmap& picture) {
        auto* image = new ImageCtrl(this);
        image->setObjectName(QString::fromLatin1(name));
        image->SetPicture(picture);
        image->hide();
        return image;
    };
    m_imgOnLine = hiddenImage("imgOnLine", StockPictures::OnlineGames());
    m_imgSWF = hiddenImage("imgSWF", StockPictures::FlashMovie());
    m_imgNoIcon = hiddenImage("imgNoIcon", StockPictures::NoIcon());
    m_imgGbStels = hiddenImage("imgGbStels", StockPictures::GbStels());

    m_listView = new SimpleListView(this);
    m_listView->setObjectName(QStringLiteral("ListView1"));
    m_listView->SetOLEDropMode(1);
    // Captions wrap at 64 pixels: a compact font keeps most names whole.
    QFont captionFont = font();
    captionFont.setPointSizeF(MainWindowDesign::CaptionPointSize);
    m_listView->setFont(captionFont);

    m_tmrIcons = new QTimer(this);
    m_tmrIcons->setObjectName(QStringLiteral("tmrIcons"));
    m_tmrIcons->setInterval(MainWindowDesign::IconTimerIntervalMs);
    m_tmrIcons->setSingleShot(true);
    connect(m_tmrIcons, &QTimer::timeout, this, &frmMain::tmrIconsTimer);

    m_finder = new ListFinder(this, m_listView);
    m_listView->setToolTipSource([this](int index) { return itemToolTip(index); });
}

void frmMain::placeControls()
{
    using namespace MainWindowDesign;
    const FormScaling::TwipsPerPixel screen = FormScaling::ScreenTwipsPerPixel(this);
    resize(FormScaling::TwipsToPixels(FormTwips, screen).size());
    m_label2->setGeometry(FormScaling::TwipsToPixels(Label2Twips, screen));
    m_label3->setGeometry(FormScaling::TwipsToPixels(Label3Twips, screen));
    m_label4->setGeometry(FormScaling::TwipsToPixels(Label4Twips, screen));
    m_imgActions->setGeometry(FormScaling::TwipsToPixels(ImgActionsTwips, screen));
    m_labActions->setGeometry(FormScaling::TwipsToPixels(LabActionsTwips, screen));
    m_listView->setGeometry(FormScaling::TwipsToPixels(ListViewTwips, screen));
    for (ImageCtrl* image : {m_imgOnLine, m_imgSWF, m_imgNoIcon, m_imgGbStels})
        image->setGeometry(FormScaling::TwipsToPixels(HiddenImageTwips, screen));
}

void frmMain::ChangeLocalizeCaptions()
{
    using modLocalizer::Translate;
    const QString productName = Translate(1020, AppTitle());
    m_labActions->setText(Translate(1010, QStringLiteral("Actions")));
    m_imgActions->setAccessibleName(m_labActions->text());
    m_label2->setText(productName);
    m_label3->setText(productName);
    m_label4->setText(Translate(690));
    setWindowTitle(productName);
    captionMenus();
    if (m_finder)
        m_finder->caption();
    keepActionsButtonAtRightEdge();
}

void frmMain::showEvent(QShowEvent* event)
{
    QWidget::showEvent(event);
    if (m_loaded)
        return;
    m_loaded = true;
    // From a timer rather than a queued call (which a zero delay becomes): the fill lets events run between
    // items, and while it ran inside the dispatch of queued calls the list's own repaints, queued as well,
    // waited for the whole fill, so the window showed nothing until the last game.
    QTimer::singleShot(1, this, &frmMain::formLoad);
}

void frmMain::formLoad()
{
    enterBusy();
    const auto idle = qScopeGuard([this] { leaveBusy(); });
    QCoreApplication::processEvents();
    if (m_closing)
        return;
    RebuildList();
    if (m_closing)
        return;
    StartCommandLine(MainWindowDesign::ServiceUpdateCommand, 0);
}

void frmMain::resizeEvent(QResizeEvent* event)
{
    QWidget::resizeEvent(event);
    layoutListView();
    keepActionsButtonAtRightEdge();
}

void frmMain::layoutListView()
{
    const QRect target = MainWindowDesign::ListViewGeometry(size(), FormScaling::ScreenTwipsPerPixel(this));
    if (target.width() <= 0 || target.height() <= 0)
        return;
    // Updates held back instead of hiding the list, which would take the keyboard focus away from it.
    m_listView->setUpdatesEnabled(false);
    m_listView->setGeometry(target);
    m_listView->setUpdatesEnabled(true);
    m_listView->show();
}

void frmMain::keepActionsButtonAtRightEdge()
{
    if (m_actionsRightMargin <= 0)
        return;
    // The caption decides the button's width, so that every language keeps the same margin on the right.
    const int labelWidth = m_labActions->sizeHint().width();
    const int labelLeft = width() - m_actionsRightMargin - labelWidth;
    const int imageLeft = labelLeft - MainWindowDesign::ActionsGapPixels - m_imgActions->width();
    // The button stays clear of the title when the window gets narrow.
    if (imageLeft < m_label3->x() + m_label3->fontMetrics().horizontalAdvance(m_label3->text()) + 16)
        return;
    m_labActions->setGeometry(labelLeft, m_labActions->y(), labelWidth, m_labActions->height());
    m_imgActions->move(imageLeft, m_imgActions->y());
}

void frmMain::closeEvent(QCloseEvent* event)
{
    using ReclamaSchedule::UnloadMode;
    if (qGuiApp->isSavingSession())
        queryUnload(UnloadMode::AppWindows);
    else
        queryUnload(event->spontaneous() ? UnloadMode::FormControlMenu : UnloadMode::FormCode);
    event->accept();
}

void frmMain::queryUnload(ReclamaSchedule::UnloadMode mode)
{
    if (m_closing)
        return;
    m_closing = true;
    m_tmrIcons->stop();
    Q_EMIT closing();
    showDueReclama(mode);
}

void frmMain::sessionEnding()
{
    // The session manager does not close windows itself; the window unloads as it would at a system shutdown.
    queryUnload(ReclamaSchedule::UnloadMode::AppWindows);
    close();
}

void frmMain::enterBusy()
{
    ++m_busy;
}

void frmMain::leaveBusy()
{
    if (--m_busy == 0 && m_deleteWhenIdle)
        deleteLater();
}

bool frmMain::event(QEvent* event)
{
    if (event->type() == QEvent::DeferredDelete && m_busy > 0) {
        m_deleteWhenIdle = true;
        return true;
    }
    return QWidget::event(event);
}

void frmMain::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    const int bandBottom = std::max(0, std::min(m_listView->y(), height()) - MainWindowDesign::BandGapPixels);
    painter.fillRect(rect(), MainWindowDesign::FrameColor());
    QLinearGradient band(0, 0, 0, bandBottom);
    band.setColorAt(0, MainWindowDesign::BandTopColor());
    band.setColorAt(1, MainWindowDesign::BandBottomColor());
    painter.fillRect(QRect(0, 0, width(), bandBottom), band);
    painter.setPen(MainWindowDesign::BandEdgeColor());
    painter.drawLine(0, bandBottom, width(), bandBottom);
    // The emblem keeps its designed pixels like the title beside it.
    const QRect emblem = FormScaling::TwipsToPixels(MainWindowDesign::EmblemTwips, {});
    if (emblem.bottom() < bandBottom)
        painter.drawPixmap(emblem, windowIcon().pixmap(emblem.size(), devicePixelRatioF()));
}

} // namespace Brimvault

#include "clsAbout.h"

#include <QApplication>
#include <QDialog>
#include <QDialogButtonBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QLinearGradient>
#include <QPainter>
#include <QPushButton>
#include <QVBoxLayout>

namespace Brimvault {

namespace {

// The banner's colours follow the game list's background, so the box reads as part of the program.
constexpr QRgb BannerTop = qRgb(118, 146, 206);
constexpr QRgb BannerBottom = qRgb(60, 86, 146);

class Banner : public QWidget {
public:
    using QWidget::QWidget;

protected:
    void paintEvent(QPaintEvent*) override
    {
        QPainter painter(this);
        QLinearGradient gradient(0, 0, 0, height());
        gradient.setColorAt(0, QColor(BannerTop));
        gradient.setColorAt(1, QColor(BannerBottom));
        painter.fillRect(rect(), gradient);
    }
};

QLabel* newLabel(const QString& name, const QString& text, QWidget* parent)
{
    auto* label = new QLabel(text, parent);
    label->setObjectName(name);
    return label;
}

QWidget* buildBanner(const clsAbout& about, QWidget* parent)
{
    auto* banner = new Banner(parent);
    banner->setObjectName(QStringLiteral("picBanner"));
    banner->setFixedHeight(104);

    auto* icon = newLabel(QStringLiteral("imgIcon"), QString(), banner);
    icon->setFixedSize(64, 64);
    if (!about.Icon().isNull())
        icon->setPixmap(about.Icon().pixmap(QSize(64, 64), banner->devicePixelRatioF()));

    auto* caption = newLabel(QStringLiteral("labCaption"), about.Caption(), banner);
    QFont captionFont = caption->font();
    captionFont.setPointSizeF(captionFont.pointSizeF() * 2.0);
    captionFont.setBold(true);
    caption->setFont(captionFont);
    caption->setStyleSheet(QStringLiteral("color: white;"));

    auto* version = newLabel(QStringLiteral("labVersion"), about.Version(), banner);
    version->setStyleSheet(QStringLiteral("color: rgba(255, 255, 255, 200);"));

    auto* texts = new QVBoxLayout;
    texts->setSpacing(2);
    texts->addStretch();
    texts->addWidget(caption);
    texts->addWidget(version);
    texts->addStretch();

    auto* layout = new QHBoxLayout(banner);
    layout->setContentsMargins(20, 16, 20, 16);
    layout->setSpacing(18);
    layout->addWidget(icon, 0, Qt::AlignVCenter);
    layout->addLayout(texts, 1);
    return banner;
}

} // namespace

clsAbout::clsAbout(QObject* parent)
    : QObject(parent)
{ }

void clsAbout::ShowAbout()
{
    QDialog dialog(QApplication::activeWindow());
    dialog.setObjectName(QStringLiteral("frmAbout"));
    dialog.setWindowTitle(m_caption);
    dialog.setWindowIcon(m_icon);
    dialog.setWindowFlag(Qt::WindowContextHelpButtonHint, false);

    auto* copyright = newLabel(QStringLiteral("labCopyright"), m_copyright, &dialog);
    copyright->setWordWrap(true);
    copyright->setTextInteractionFlags(Qt::TextSelectableByMouse);

    auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok, &dialog);
    buttons->setObjectName(QStringLiteral("cmdOK"));
    QObject::connect(buttons, &QDialogButtonBox::accepted, &dialog, &QDialog::accept);

    auto* body = new QVBoxLayout;
    body->setContentsMargins(20, 16, 20, 16);
    body->setSpacing(16);
    body->addWidget(copyright);
    body->addWidget(buttons);

    auto* layout = new QVBoxLayout(&dialog);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addWidget(buildBanner(*this, &dialog));
    layout->addLayout(body);

    dialog.setFixedWidth(440);
    dialog.setFixedHeight(dialog.sizeHint().height());
    dialog.exec();
}

} // namespace Brimvault

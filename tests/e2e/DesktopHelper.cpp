// What the desktop drive needs besides xdotool, run on the test's own X display:
//   grab FILE.png     saves the whole screen
//   drag FILE         shows a small window; pressing the mouse on it drags FILE as a file URL
//   close WINDOW-ID   asks a window to close as a window manager does for its close button
#include <QApplication>
#include <QDrag>
#include <QFileInfo>
#include <QGuiApplication>
#include <QLabel>
#include <QMimeData>
#include <QMouseEvent>
#include <QPixmap>
#include <QScreen>
#include <QTextStream>
#include <QTimer>
#include <QUrl>

#include <xcb/xcb.h>

#include <cstdio>
#include <cstring>

namespace {

constexpr char DragSourceTitle[] = "Brimvault drag source";

int grabScreen(int argc, char** argv, const QString& file)
{
    QGuiApplication app(argc, argv);
    QScreen* screen = QGuiApplication::primaryScreen();
    if (!screen) {
        std::fprintf(stderr, "no screen\n");
        return 2;
    }
    const QPixmap shot = screen->grabWindow(0);
    if (shot.isNull() || !shot.save(file, "PNG")) {
        std::fprintf(stderr, "cannot save %s\n", qPrintable(file));
        return 2;
    }
    return 0;
}

class DragSource : public QLabel {
public:
    explicit DragSource(const QString& file)
        : m_file(file)
    {
        setText(QStringLiteral("Drag me:\n") + QFileInfo(file).fileName());
        setAlignment(Qt::AlignCenter);
        setStyleSheet(QStringLiteral("background: rgb(250, 230, 160); font-size: 14px;"));
        setWindowTitle(QString::fromLatin1(DragSourceTitle));
    }

protected:
    void mousePressEvent(QMouseEvent* event) override
    {
        if (event->button() != Qt::LeftButton)
            return;
        auto* mime = new QMimeData;
        mime->setUrls({QUrl::fromLocalFile(m_file)});
        auto* drag = new QDrag(this);
        drag->setMimeData(mime);
        const Qt::DropAction action = drag->exec(Qt::CopyAction | Qt::MoveAction | Qt::LinkAction, Qt::CopyAction);
        QTextStream(stdout) << "dropped " << int(action) << Qt::endl;
        // The target fetches the data after the drop: the source stays until it surely has.
        QTimer::singleShot(10000, qApp, &QCoreApplication::quit);
    }

private:
    QString m_file;
};

int showDragSource(int argc, char** argv, const QString& file)
{
    QApplication app(argc, argv);
    DragSource source(file);
    source.setGeometry(10, 10, 220, 120);
    source.show();
    return app.exec();
}

// The WM_DELETE_WINDOW message a window manager sends when the user clicks a window's close button.
int closeWindow(const char* windowId)
{
    char* end = nullptr;
    const unsigned long window = std::strtoul(windowId, &end, 0);
    if (!end || *end || window == 0) {
        std::fprintf(stderr, "bad window id %s\n", windowId);
        return 2;
    }
    xcb_connection_t* connection = xcb_connect(nullptr, nullptr);
    if (xcb_connection_has_error(connection)) {
        std::fprintf(stderr, "cannot open the display\n");
        xcb_disconnect(connection);
        return 2;
    }
    const auto intern = [connection](const char* name) -> xcb_atom_t {
        xcb_intern_atom_reply_t* reply = xcb_intern_atom_reply(
            connection, xcb_intern_atom(connection, 0, uint16_t(std::strlen(name)), name), nullptr);
        const xcb_atom_t atom = reply ? reply->atom : xcb_atom_t(XCB_ATOM_NONE);
        std::free(reply);
        return atom;
    };
    xcb_client_message_event_t message {};
    message.response_type = XCB_CLIENT_MESSAGE;
    message.format = 32;
    message.window = xcb_window_t(window);
    message.type = intern("WM_PROTOCOLS");
    message.data.data32[0] = intern("WM_DELETE_WINDOW");
    message.data.data32[1] = XCB_CURRENT_TIME;
    xcb_void_cookie_t cookie = xcb_send_event_checked(
        connection, 0, xcb_window_t(window), XCB_EVENT_MASK_NO_EVENT, reinterpret_cast<const char*>(&message));
    xcb_generic_error_t* error = xcb_request_check(connection, cookie);
    const int result = error ? 3 : 0;
    if (error)
        std::fprintf(stderr, "cannot send to window %s\n", windowId);
    std::free(error);
    xcb_disconnect(connection);
    return result;
}

} // namespace

int main(int argc, char** argv)
{
    if (argc >= 3 && std::strcmp(argv[1], "close") == 0)
        return closeWindow(argv[2]);
    if (argc >= 3 && std::strcmp(argv[1], "grab") == 0)
        return grabScreen(argc, argv, QString::fromLocal8Bit(argv[2]));
    if (argc >= 3 && std::strcmp(argv[1], "drag") == 0)
        return showDragSource(argc, argv, QString::fromLocal8Bit(argv[2]));
    std::fprintf(stderr, "usage: %s grab FILE.png | drag FILE | close WINDOW-ID\n", argv[0]);
    return 1;
}

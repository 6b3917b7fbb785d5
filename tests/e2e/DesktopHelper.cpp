// What the desktop drive needs besides xdotool, run on the test's own X display:
//   grab FILE.png     saves the whole screen
//   drag FILE         shows a small window; pressing the mouse on it drags FILE as a file URL
//   close WINDOW-ID   asks a window to close as a window manager does for its close button
#include <QApplication>
#include <QDrag>
#include <QMimeData>
#include <QPixmap>
#include <QPushButton>
#include <QScreen>
#include <QTimer>
#include <QUrl>

#include <xcb/xcb.h>

#include <cstring>

// The WM_DELETE_WINDOW message a window manager sends when the user clicks a window's close button.
static int closeWindow(xcb_window_t window)
{
    xcb_connection_t* connection = xcb_connect(nullptr, nullptr);
    const auto atom = [connection](const char* name) {
        xcb_intern_atom_reply_t* reply = xcb_intern_atom_reply(
            connection, xcb_intern_atom(connection, 0, uint16_t(std::strlen(name)), name), nullptr);
        const xcb_atom_t found = reply ? reply->atom : xcb_atom_t(XCB_ATOM_NONE);
        std::free(reply);
        return found;
    };
    xcb_client_message_event_t message {};
    message.response_type = XCB_CLIENT_MESSAGE;
    message.format = 32;
    message.window = window;
    message.type = atom("WM_PROTOCOLS");
    message.data.data32[0] = atom("WM_DELETE_WINDOW");
    xcb_generic_error_t* error = xcb_request_check(connection,
        xcb_send_event_checked(
            connection, 0, window, XCB_EVENT_MASK_NO_EVENT, reinterpret_cast<const char*>(&message)));
    const int result = xcb_connection_has_error(connection) || error ? 2 : 0;
    std::free(error);
    xcb_disconnect(connection);
    return result;
}

int main(int argc, char** argv)
{
    const QByteArray command = argc == 3 ? argv[1] : "";
    if (command == "close")
        return closeWindow(xcb_window_t(std::strtoul(argv[2], nullptr, 0)));
    QApplication app(argc, argv);
    if (command == "grab")
        return QGuiApplication::primaryScreen()->grabWindow(0).save(QString::fromLocal8Bit(argv[2]), "PNG") ? 0 : 2;
    if (command != "drag")
        return 1;
    QPushButton source(QStringLiteral("Drag me"));
    source.setWindowTitle(QStringLiteral("Brimvault drag source"));
    source.setGeometry(10, 10, 220, 120);
    QObject::connect(&source, &QPushButton::pressed, [&] {
        auto* mime = new QMimeData;
        mime->setUrls({QUrl::fromLocalFile(QString::fromLocal8Bit(argv[2]))});
        auto* drag = new QDrag(&source);
        drag->setMimeData(mime);
        drag->exec(Qt::CopyAction | Qt::MoveAction | Qt::LinkAction, Qt::CopyAction);
        // The target fetches the data after the drop: the source stays until it surely has.
        QTimer::singleShot(10000, &app, &QCoreApplication::quit);
    });
    source.show();
    return app.exec();
}

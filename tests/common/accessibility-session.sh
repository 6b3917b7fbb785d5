#!/bin/sh
# Runs a test where Qt's AT-SPI bridge is live, as under a screen reader: its own D-Bus session, X server and
# accessibility bus. Usage: accessibility-session.sh TEST-EXECUTABLE [ARGUMENTS...]
launcher=/usr/libexec/at-spi-bus-launcher
for need in dbus-run-session:dbus-daemon xvfb-run:xvfb xauth:xauth dbus-send:dbus-bin "$launcher":at-spi2-core; do
    if ! command -v "${need%%:*}" >/dev/null 2>&1; then
        echo "${need%%:*} is missing: install the Debian package ${need#*:} (make test does)" >&2
        exit 1
    fi
done
if [ "$1" != --inside ]; then
    exec dbus-run-session -- xvfb-run -a -s "-screen 0 1280x1024x24" "$0" --inside "$@"
fi
shift
"$launcher" --launch-immediately &
# Qt asks the session bus for the accessibility bus once, at start: it has to be there first.
tries=0
until dbus-send --session --print-reply --dest=org.freedesktop.DBus / org.freedesktop.DBus.NameHasOwner \
    string:org.a11y.Bus 2>/dev/null | grep -q true; do
    tries=$((tries + 1))
    if [ "$tries" -gt 100 ]; then
        echo "the accessibility bus did not start" >&2
        exit 1
    fi
    sleep 0.1
done
QT_QPA_PLATFORM=xcb QT_LINUX_ACCESSIBILITY_ALWAYS_ON=1 exec "$@"

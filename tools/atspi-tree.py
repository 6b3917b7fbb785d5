#!/usr/bin/python3
"""Prints the accessibility tree of a running application as a screen reader sees it over AT-SPI.

Usage: tools/atspi-tree.py [APPLICATION-NAME] [--wait SECONDS]
Run it in the same D-Bus session as the program, with the accessibility bus up (at-spi2-core) and the
program started with QT_LINUX_ACCESSIBILITY_ALWAYS_ON=1.
"""
import sys
import time

import pyatspi


def dump(node, depth=0, limit=12):
    try:
        states = node.getState()
        marks = [name for name, state in (("focused", pyatspi.STATE_FOCUSED), ("selected", pyatspi.STATE_SELECTED))
                 if states.contains(state)]
        extent = node.queryComponent().getExtents(pyatspi.DESKTOP_COORDS) if node.getRole() != pyatspi.ROLE_APPLICATION else None
        where = f" @{extent.x},{extent.y} {extent.width}x{extent.height}" if extent else ""
        print(f"{'  ' * depth}[{node.getRoleName()}] {node.name!r}"
              f"{' — ' + node.description if node.description else ''}{where}{' ' + ','.join(marks) if marks else ''}")
    except Exception as error:  # a node that vanished while walking
        print(f"{'  ' * depth}<unreadable: {error}>")
        return
    if depth < limit:
        for child in node:
            if child is not None:
                dump(child, depth + 1, limit)


def main():
    name = sys.argv[1] if len(sys.argv) > 1 and not sys.argv[1].startswith("--") else "brimvault"
    wait = float(sys.argv[sys.argv.index("--wait") + 1]) if "--wait" in sys.argv else 20
    deadline = time.time() + wait
    while True:
        apps = [app for app in pyatspi.Registry.getDesktop(0) if app is not None and app.name.lower() == name.lower()]
        if apps or time.time() > deadline:
            break
        time.sleep(0.5)
    if not apps:
        print(f"no application named {name!r} on the accessibility bus", file=sys.stderr)
        return 1
    for app in apps:
        dump(app)
    return 0


if __name__ == "__main__":
    sys.exit(main())

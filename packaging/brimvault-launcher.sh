#!/bin/sh
# Installed as <prefix>/bin/brimvault. The program looks for its components, service, language files and
# help beside itself, so it stays in <prefix>/lib/brimvault. This script may be reached through a symbolic
# link or from a prefix that has moved, so it finds the program from its own resolved location.
self=$(readlink -f -- "$0" 2>/dev/null) || self=$0
[ -n "$self" ] || self=$0
prefix=$(cd -- "$(dirname -- "$self")/.." && pwd -P) || exit 127
program=$prefix/lib/brimvault/brimvault
if [ ! -x "$program" ]; then
    echo "brimvault: $program is missing" >&2
    exit 127
fi
exec "$program" "$@"

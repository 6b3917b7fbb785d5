#!/usr/bin/env bash
# Installs the pinned Ruffle web build (package-lock.json) into node_modules/, only when it is missing or
# older than the lock file. The build copies it beside the program (build/bin/ruffle/).
set -euo pipefail
cd "$(dirname "$0")/.."

if ! command -v node >/dev/null 2>&1 || ! command -v npm >/dev/null 2>&1; then
    echo "Node.js and npm are missing: Flash movies will not play until Ruffle is installed" \
        "(apt-get install nodejs npm, then tools/install-ruffle.sh)." >&2
    exit 0
fi

ruffle=node_modules/@ruffle-rs/ruffle
stamp=node_modules/.package-lock.json

wanted=$(node -e 'const l=require("./package-lock.json");const p=l.packages["node_modules/@ruffle-rs/ruffle"];process.stdout.write(p?p.version:"")')
have=""
if [ -f "$ruffle/package.json" ]; then
    have=$(node -e 'process.stdout.write(require("./'"$ruffle"'/package.json").version||"")')
fi

if [ -n "$have" ] && [ "$have" = "$wanted" ] && [ -f "$stamp" ] && [ ! package-lock.json -nt "$stamp" ] \
    && [ -f "$ruffle/ruffle.js" ]; then
    exit 0
fi

echo "Installing Ruffle ${wanted}"
npm ci --no-audit --no-fund

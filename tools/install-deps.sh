#!/usr/bin/env bash
# Installs what building, running and testing Brimvault needs on Debian 12, and only what is missing.
set -euo pipefail

packages=(
    cmake ninja-build g++ pkg-config
    qt6-base-dev qt6-webengine-dev libqt6webenginecore6-bin qt6-image-formats-plugins libgl-dev
    libarchive-dev xvfb xauth xdotool libxcb1-dev unzip
    at-spi2-core dbus-daemon dbus-bin python3-pyatspi
    mingw-w64 icoutils python3-pefile
    clang libclang-rt-14-dev clang-format
    desktop-file-utils appstream librsvg2-bin
    dpkg-dev lintian
)

missing=()
for p in "${packages[@]}"; do
    dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q 'install ok installed' || missing+=("$p")
done
# Node.js and npm install Ruffle, which plays Flash movies (tools/install-ruffle.sh). A Node.js installed
# from elsewhere with its own npm is kept as it is.
command -v node >/dev/null 2>&1 || missing+=(nodejs)
command -v npm >/dev/null 2>&1 || missing+=(npm)

if ((${#missing[@]})); then
    sudo=""
    [ "$(id -u)" -eq 0 ] || sudo="sudo"
    echo "Installing: ${missing[*]}"
    $sudo apt-get update -qq
    DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq --no-install-recommends "${missing[@]}"
fi

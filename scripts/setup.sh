#!/bin/sh
# Installs the build and test dependencies from Debian's packages. Idempotent:
# does nothing when everything is present.
set -eu

PACKAGES="cmake g++-mingw-w64-x86-64-posix mingw-w64-tools wine64 libwine-dev googletest libboost-dev nlohmann-json3-dev"

missing=""
for p in $PACKAGES; do
    if ! dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed"; then
        missing="$missing $p"
    fi
done
[ -z "$missing" ] && exit 0

SUDO=""
[ "$(id -u)" -ne 0 ] && SUDO="sudo"
echo "setup: installing$missing"
$SUDO apt-get update -qq
DEBIAN_FRONTEND=noninteractive $SUDO apt-get install -y -qq $missing

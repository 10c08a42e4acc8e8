#!/bin/sh
# Installs the Debian 12 packages that building, running and testing Corvid need.
# Only what is missing is installed, so a second run costs nothing.
set -e

PACKAGES="cmake g++ make pkg-config
qt6-base-dev qt6-5compat-dev libqt6sql6-sqlite libgl-dev
libsqlite3-dev
libcurl4-openssl-dev libcpp-httplib-dev libssl-dev openssl ca-certificates
libpacparser-dev
clang libclang-rt-14-dev llvm"

missing=""
for p in $PACKAGES; do
    dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing="$missing $p"
done
[ -z "$missing" ] && exit 0

if [ "$(id -u)" -ne 0 ]; then
    echo "install-deps: missing packages:$missing (run as root to install them)" >&2
    exit 1
fi
export DEBIAN_FRONTEND=noninteractive
apt-get update -q
apt-get install -y -q --no-install-recommends $missing

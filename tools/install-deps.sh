#!/bin/sh
# Installs what lodestack needs to build, test and benchmark on Debian 12.
# Run as root; already installed packages are left alone.
set -eu
packages="cmake ninja-build g++ clang libclang-rt-14-dev pkg-config binutils
  libglib2.0-dev libssl-dev libgtest-dev libgmock-dev libbenchmark-dev
  libprotobuf-dev protobuf-compiler libgeographiclib-dev
  nlohmann-json3-dev libgps-dev gpsd gpsd-clients libcli11-dev libcurl4-openssl-dev time openssl
  dbus-daemon python3-dbusmock valgrind"
missing=""
for p in $packages; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing="$missing $p"
done
if [ -n "$missing" ]; then
  export DEBIAN_FRONTEND=noninteractive
  apt-get update -qq
  apt-get install -y -qq --no-install-recommends $missing
fi

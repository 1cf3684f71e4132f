#!/usr/bin/env bash
# Installs the Debian packages Norvo needs that are missing; says nothing
# when every one is already there. `install-deps.sh fuzz` adds what the
# libFuzzer builds need, `install-deps.sh tidy` clang-tidy.
set -euo pipefail

packages=(
  build-essential cmake ninja-build pkg-config clang-format lld
  protobuf-compiler libprotobuf-dev libprotoc-dev
  libboost1.81-dev libboost-json1.81-dev
  libsdbus-c++-dev libsystemd-dev dbus-daemon libicu-dev modemmanager-dev
  libgtest-dev libgmock-dev libbenchmark-dev
  libmosquitto-dev mosquitto openssl libssl-dev
  libtomlplusplus-dev
  chromium nodejs
  tshark
)
case "${1:-}" in
  fuzz) packages+=(clang libclang-rt-14-dev) ;;
  tidy) packages+=(clang-tidy) ;;
esac

missing=()
for package in "${packages[@]}"; do
  status=$(dpkg-query -W -f='${Status}' "$package" 2>/dev/null || true)
  [[ "$status" == "install ok installed" ]] || missing+=("$package")
done
# Some Node.js builds bring npm along; Debian's packages it on its own.
command -v npm > /dev/null 2>&1 || missing+=(npm)
[[ ${#missing[@]} -eq 0 ]] && exit 0

echo "Installing missing packages: ${missing[*]}"
sudo=""
[[ $(id -u) -eq 0 ]] || sudo="sudo"
export DEBIAN_FRONTEND=noninteractive
# wireshark-common asks whether users outside the wireshark group may capture packets: no.
echo "wireshark-common wireshark-common/install-setuid boolean false" | $sudo debconf-set-selections
$sudo apt-get update -qq
$sudo apt-get install -y -qq --no-install-recommends "${missing[@]}"

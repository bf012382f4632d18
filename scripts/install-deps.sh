#!/usr/bin/env bash
# Installs what building and testing need on Debian, when missing: the
# mingw-w64 cross compilers (i686 for the program, x86-64 for 64-bit
# stand-ins), Wine with its 32-bit part, CMake, the GoogleTest sources, widl
# and Wine's IDL files for the stand-ins' type libraries, zlib for the target,
# wixl for the installer package, unzip as an independent zip reader and Xvfb.
set -euo pipefail

packages=(g++-mingw-w64-i686-posix g++-mingw-w64-x86-64-posix wine wine32:i386 wine64 cmake make
          googletest mingw-w64-tools libwine-dev libz-mingw-w64-dev wixl unzip xvfb)
missing=()
for package in "${packages[@]}"; do
  if ! dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q 'install ok installed'; then
    missing+=("$package")
  fi
done
[ ${#missing[@]} -eq 0 ] && exit 0

sudo=""
if [ "$(id -u)" -ne 0 ]; then
  command -v sudo >/dev/null || { echo "need root (or sudo) to install: ${missing[*]}" >&2; exit 1; }
  sudo="sudo"
fi
echo "installing: ${missing[*]}"
if ! dpkg --print-foreign-architectures | grep -qx i386; then
  $sudo dpkg --add-architecture i386
fi
$sudo apt-get update -qq
DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq -o DPkg::Lock::Timeout=600 \
  --no-install-recommends "${missing[@]}" >/dev/null

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

# minizip's source comes from Debian's zlib source package (fetched at build
# time by cmake/minizip.cmake): a deb-src entry for the machine's own Debian
# archive, suite and keyring, in a sources file of its own.
zlib_sources=/etc/apt/sources.list.d/qm-zlib-src.sources
if ! apt-cache showsrc zlib 2>/dev/null | grep -q '^Package: zlib'; then
  run_as_root=""
  [ "$(id -u)" -ne 0 ] && run_as_root="sudo"
  if [ ! -f "$zlib_sources" ]; then
    stanza=$(awk 'BEGIN { RS = ""; FS = "\n" }
                  /(^|\n)Types:[^\n]*deb/ && /(^|\n)URIs:[^\n]*\/debian\/?(\n|$)/ { print; exit }' \
             /etc/apt/sources.list.d/debian.sources 2>/dev/null | grep -v '^#' || true)
    if [ -z "$stanza" ]; then
      codename=$(. /etc/os-release && echo "$VERSION_CODENAME")
      stanza="Types: deb
URIs: http://deb.debian.org/debian
Suites: $codename $codename-updates
Components: main
Signed-By: /usr/share/keyrings/debian-archive-keyring.gpg"
    fi
    echo "adding the deb-src entry for zlib's source: $zlib_sources"
    printf '%s\n' "$stanza" | sed 's/^Types:.*/Types: deb-src/' | $run_as_root tee "$zlib_sources" >/dev/null
  fi
  $run_as_root apt-get update -qq -o DPkg::Lock::Timeout=600
fi

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

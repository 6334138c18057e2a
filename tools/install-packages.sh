#!/usr/bin/env bash
# Installs the packages that are missing for the given purposes: of Debian, and programs from the npm registry.
# Usage: tools/install-packages.sh run|test|armhf|arm64|i386|mipsel|packages ...
set -euo pipefail

packages=(build-essential cmake ninja-build pkg-config libglib2.0-dev)
machine=(qemu-user-static googletest python3) # for every other machine
programs=() # of the npm registry: PROGRAM=PACKAGE@VERSION
modules=()  # of the npm registry, for node: PACKAGE@VERSION
for purpose in "$@"; do
    case "$purpose" in
    run)
        packages+=(qtbase5-dev libqt5webkit5-dev libwebkit2gtk-4.1-dev libjavascriptcoregtk-4.1-dev libepoxy-dev
            libsoup-3.0-dev x11proto-dev fonts-dejavu-core xvfb xauth libgstreamer1.0-dev
            libgstreamer-plugins-base1.0-dev gstreamer1.0-plugins-base gstreamer1.0-plugins-good
            gstreamer1.0-plugins-bad gstreamer1.0-plugins-ugly gstreamer1.0-libav gstreamer1.0-x gstreamer1.0-alsa
            ffmpeg libjson-glib-dev libcurl4-gnutls-dev libxml2-dev python3)
        ;;
    test)
        packages+=(libgtest-dev libgmock-dev libbenchmark-dev libexpat1-dev clang-14 libclang-rt-14-dev
            clang-format-14 clang-tidy-14 libwpewebkit-1.1-dev
            cog python3 python3-clang-14 gcovr binutils util-linux procps dpkg-dev man-db openssl webkit2gtk-driver
            python3-selenium)
        programs+=(tsc=typescript@5.4.5)
        modules+=(selenium-webdriver@4.27.0)
        ;;
    armhf) packages+=(g++-arm-linux-gnueabihf "${machine[@]}") ;;
    arm64) packages+=(g++-aarch64-linux-gnu "${machine[@]}") ;;
    i386) packages+=(g++-i686-linux-gnu "${machine[@]}") ;;
    mipsel) packages+=(g++-mipsel-linux-gnu "${machine[@]}") ;;
    packages)
        packages+=(debhelper dpkg-dev lintian mmdebstrap python3 util-linux git)
        ;;
    *)
        echo "$0: $purpose: unknown purpose, expected run, test, armhf, arm64, i386, mipsel or packages" >&2
        exit 2
        ;;
    esac
done

missing=()
for package in "${packages[@]}"; do
    if [ "$(dpkg-query -W -f '${db:Status-Status}' "$package" 2>/dev/null)" != installed ]; then
        missing+=("$package")
    fi
done
missing_npm=() # of the npm registry
for program in "${programs[@]}"; do
    command -v "${program%%=*}" >/dev/null || missing_npm+=("${program#*=}")
done
for module in "${modules[@]}"; do
    [ -d "$(npm root --global 2>/dev/null)/${module%@*}" ] || missing_npm+=("$module")
done
if [ ${#missing_npm[@]} -gt 0 ] && ! command -v npm >/dev/null; then
    missing+=(npm) # not in the list above: other packages of nodejs have it too
fi
[ ${#missing[@]} -gt 0 ] || [ ${#missing_npm[@]} -gt 0 ] || exit 0

if ! command -v apt-get >/dev/null; then
    echo "$0: cannot install ${missing[*]} ${missing_npm[*]}: apt-get not found" >&2
    exit 2
elif [ "$(id -u)" -eq 0 ]; then
    sudo=()
elif command -v sudo >/dev/null; then
    sudo=(sudo)
else
    echo "$0: cannot install ${missing[*]} ${missing_npm[*]}: neither root nor sudo" >&2
    exit 2
fi
if [ ${#missing[@]} -gt 0 ]; then
    echo "Installing: ${missing[*]}"
    "${sudo[@]}" apt-get update -q
    "${sudo[@]}" env DEBIAN_FRONTEND=noninteractive apt-get install -q -y --no-install-recommends "${missing[@]}"
fi
if [ ${#missing_npm[@]} -gt 0 ]; then
    echo "Installing: ${missing_npm[*]}"
    "${sudo[@]}" npm install --global --no-fund --no-audit "${missing_npm[@]}"
fi

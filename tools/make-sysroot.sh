#!/usr/bin/env bash
# Assembles a Debian sysroot with what the plug-in and its tests need, for cross-compiling and for running under qemu. The
# package state of this machine is neither used nor changed.
# Usage: tools/make-sysroot.sh armhf|arm64|i386|mipsel DIR
# DIR is made complete or not at all; a complete one is left as it is.
set -euo pipefail

fail() {
    echo "make-sysroot.sh: $1" >&2
    exit 2
}

[ $# -eq 2 ] || fail "usage: tools/make-sysroot.sh armhf|arm64|i386|mipsel DIR"
architecture=$1
sysroot=$2
packages=(libc6-dev libglib2.0-dev libstdc++6)
complete=.complete # the file that says what a complete sysroot has

case "$architecture" in
armhf | arm64 | i386 | mipsel) ;;
*) fail "$architecture: unknown architecture, expected armhf, arm64, i386 or mipsel" ;;
esac
content="$architecture ${packages[*]}"
if [ -f "$sysroot/$complete" ]; then
    [ "$(cat "$sysroot/$complete")" != "$content" ] || exit 0
    fail "$sysroot: a sysroot of something else: $(cat "$sysroot/$complete")"
elif [ -e "$sysroot" ]; then
    fail "$sysroot: not a complete sysroot, remove it first"
fi
for command in apt-get dpkg-deb; do
    command -v "$command" >/dev/null || fail "$command: command not found"
done

parent=$(dirname "$sysroot")
mkdir -p "$parent" 2>/dev/null || fail "$parent: cannot make the folder"
work=$(mktemp -d "$parent/unfinished.XXXXXX" 2>/dev/null) || fail "$parent: cannot write to the folder"
trap 'rm -rf "$work"' EXIT
# A signal ends the script by way of the trap above.
trap 'exit 2' HUP INT TERM
mkdir -p "$work/state/lists/partial" "$work/cache/archives/partial" "$work/root"
touch "$work/status"
# The sources, keys and proxies are this machine's; state, cache and architecture are not, and neither are its hooks.
cat >"$work/apt.conf" <<END
#clear APT::Update::Pre-Invoke;
#clear APT::Update::Post-Invoke;
#clear APT::Update::Post-Invoke-Success;
#clear APT::Architectures;
#clear DPkg::Post-Invoke;
APT::Architecture "$architecture";
APT::Architectures { "$architecture"; };
APT::Sandbox::User "";
Acquire::Languages "none";
Acquire::Retries "2";
Dir::State "$(realpath "$work")/state";
Dir::State::status "$(realpath "$work")/status";
Dir::Cache "$(realpath "$work")/cache";
END

# A list that cannot be fetched matters only if packages then are missing: its error precedes theirs in the log.
apt-get -q -c "$work/apt.conf" update >"$work/log" 2>&1 || true
apt-get -q -c "$work/apt.conf" install -y --no-install-recommends --download-only "${packages[@]}" >>"$work/log" 2>&1 ||
    fail "$architecture: cannot fetch packages: $(grep -m 1 '^[EW]: ' "$work/log" || tail -n 1 "$work/log")"
for package in "$work"/cache/archives/*.deb; do
    dpkg-deb -x "$package" "$work/root" 2>/dev/null || fail "${package##*/}: cannot unpack"
done

# Absolute links would lead out of the sysroot.
find "$work/root" -type l -lname '/*' | while read -r link; do
    ln -snf --relative "$work/root$(readlink "$link")" "$link"
done
echo "$content" >"$work/root/$complete"
chmod 755 "$work/root"
mv -T "$work/root" "$sysroot"

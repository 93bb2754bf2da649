#!/usr/bin/env bash
# Makes the Debian package from a release build, installs it, uses it, and removes it again,
# checking that nothing of it stays behind. Needs root (or sudo) for dpkg.
#   package.sh [build folder]      (default build/release)
set -euo pipefail
cd "$(dirname "$0")/.."
build=${1:-build/release}
sudo=""
[ "$(id -u)" -eq 0 ] || sudo="sudo"
(cd "$build" && cpack -G DEB >/dev/null)
deb=$(ls -t "$build"/qzivifgen_*.deb | head -1)
echo "package: $deb"
files=$(dpkg-deb --contents "$deb" | awk '{print $6}' | sed 's|^\./|/|' | grep -v '/$')
$sudo dpkg -i "$deb" >/dev/null
QZIVI_SESSION_MANAGER=none qzfgen configure /usr/share/qzivifgen/examples/two-channels.qzc
qzfgen-emu --help >/dev/null
[ -n "$(find /usr/lib -name libqzscpifgen.so)" ]
[ -f /usr/lib/pkgconfig/qzivifgen.pc ] || [ -n "$(find /usr/lib -name qzivifgen.pc)" ]
$sudo dpkg -r qzivifgen >/dev/null
left=0
for f in $files; do
  if [ -e "$f" ]; then echo "left behind: $f"; left=1; fi
done
[ $left -eq 0 ] && echo "installed, used and removed cleanly"
exit $left

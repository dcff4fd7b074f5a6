#!/usr/bin/env bash
# Makes the Debian packages of a build, has them checked, installs them into a root of their own, and there builds and runs the
# agent that the README shows, and kivctl.
# usage: packages.sh BUILD_DIR README CXX...
set -euo pipefail
build=$1 readme=$2 cxx=("${@:3}")
. "$(dirname "$0")/agent.sh"
for tool in lintian dpkg-shlibdeps file; do
    command -v $tool >/dev/null || { echo "skipped: $tool is not installed"; exit 77; }
done

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cd "$scratch"
cpack --config "$build/CPackConfig.cmake" -B "$scratch" >cpack.log 2>&1 || { cat cpack.log; exit 1; }
ls ./*.deb
lintian --allow-root --fail-on error ./*.deb

# dpkg knows what is installed here, or in a cross build what the compiler's libraries are, so that it refuses a package whose
# dependencies are not there.
root=$scratch/root
mkdir -p "$root"/var/lib/dpkg/{info,updates,triggers}
cp "${KIV_SYSROOT-}/var/lib/dpkg/status" "$root/var/lib/dpkg/status"
dpkg-deb --field ./kivctl*.deb Architecture >"$root/var/lib/dpkg/arch"
if ! PATH=$PATH:/usr/sbin:/sbin dpkg --root="$root" --force-not-root --log=/dev/null --install ./*.deb >dpkg.log 2>&1; then
    grep --invert-match "files list file" dpkg.log
    exit 1
fi

try_agent "$root/usr" "$readme" "$scratch" "${cxx[@]}"
${KIV_EMULATOR-} "$root/usr/bin/kivctl" country 450 | tee country
grep --quiet "Korea, South" country

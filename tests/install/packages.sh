#!/usr/bin/env bash
# Makes the Debian packages of a build, checks them, installs them into a private root, and builds and runs the README's agent and
# kivctl there.
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

# dpkg knows what is installed here, or in a cross build the packages of the compiler's libraries, so it refuses a package with
# missing dependencies.
root=$scratch/root
mkdir -p "$root"/var/lib/dpkg/{info,updates,triggers}
cp "${KIV_SYSROOT-}/var/lib/dpkg/status" "$root/var/lib/dpkg/status"
arch=$(dpkg-deb --field ./kivctl*.deb Architecture)
echo "$arch" >"$root/var/lib/dpkg/arch"
# dpkg treats packages for all architectures as packages of this machine. On the device it treats them as packages of the device.
if [[ $arch != "$(dpkg --print-architecture)" ]]; then
    for package in ./*_all.deb; do
        dpkg-deb --raw-extract "$package" "$scratch/all"
        sed --in-place "s/^Architecture: all/Architecture: $arch/" "$scratch/all/DEBIAN/control"
        dpkg-deb --root-owner-group --build "$scratch/all" "$package" >/dev/null
        rm -r "$scratch/all"
    done
fi
if ! PATH=$PATH:/usr/sbin:/sbin dpkg --root="$root" --force-not-root --log=/dev/null --install ./*.deb >dpkg.log 2>&1; then
    grep --invert-match "files list file" dpkg.log
    exit 1
fi

try_agent "$root/usr" "$readme" "$scratch" "${cxx[@]}"
${KIV_EMULATOR-} "$root/usr/bin/kivctl" country 450 | tee country
grep --quiet "Korea, South" country

#!/usr/bin/env bash
# Builds the library for a device: from its own sources only, with libraries and headers that pkg-config finds by their names on a
# device. The simulated device is installed under these names, each header in a place that only its .pc file names.
# usage: native.sh BUILD_DIR SOURCE_DIR CXX...
set -euo pipefail
build=$1 sources=$2 cxx=("${@:3}")

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cmake --install "$build" --prefix "$scratch/made" >"$scratch/log"
device=$scratch/device
mkdir -p "$device/lib/pkgconfig" "$device/include/common" "$scratch/tree/lib"
cp --no-dereference "$(find "$scratch/made" -name libkiv_util.so -printf %h)"/libkiv_{util,platform}.so* "$device/lib"
installed=$scratch/made/include/kiv_system
mv "$installed/platform_decls.h" "$device/include/common"

while read -r name library headers; do
    mkdir "$device/include/$name"
    for header in $headers; do
        mv "$installed/$header" "$device/include/$name"
    done
    cat >"$device/lib/pkgconfig/$name.pc" <<PC
prefix=\${pcfiledir}/../..
Name: $name
Description: what a device calls $name
Version: 1.0
Cflags: -I\${prefix}/include/$name -I\${prefix}/include/common
Libs: -L\${prefix}/lib -l$library
PC
done <<NAMES
kiv_util  kiv_util  DAMutex.h DAUtil.h DASubscriberInfo.h DASubscriberStore.h DADatabaseManager.h DASubscribeDataManager.h
device-log                  kiv_platform  dlog.h
capi-telephony              kiv_platform  telephony.h
tapi                        kiv_platform  TapiUtility.h ITapiCall.h ITapiNetText.h ITapiNetwork.h ITapiSim.h
capi-system-info            kiv_platform  system_info.h
capi-system-system-settings kiv_platform  system_settings.h
capi-system-runtime-info    kiv_platform  runtime_info.h
storage                     kiv_platform  storage.h
capi-appfw-package-manager  kiv_platform  package_manager.h package_info.h
capi-appfw-alarm            kiv_platform  app_alarm.h
vconf                       kiv_platform  vconf.h
capi-network-connection     kiv_platform  net_connection.h
capi-network-wifi           kiv_platform  wifi.h
NAMES
rm -r "$scratch/made"

cp -r "$sources"/{CMakeLists.txt,cmake,dbus} "$scratch/tree"
cp -r "$sources"/lib/{DASystem,records} "$scratch/tree/lib"
export PKG_CONFIG_PATH=$device/lib/pkgconfig
configure() # option...
{
    cmake -G Ninja -S "$scratch/tree" -B "$scratch/build" -DKIV_PLATFORM=native -DCMAKE_BUILD_TYPE=Debug -DCMAKE_CXX_COMPILER="${cxx[0]}" \
        ${KIV_TOOLCHAIN:+-DCMAKE_TOOLCHAIN_FILE="$KIV_TOOLCHAIN" -DCMAKE_FIND_ROOT_PATH="$device"} "$@" >"$scratch/log" 2>&1
}
if configure || ! grep --quiet "None of the required 'dlog' found" "$scratch/log"; then
    echo "configured without the platform log, or refused for another reason:"
    cat "$scratch/log"
    exit 1
fi
configure -DKIV_PC_DLOG=device-log && cmake --build "$scratch/build" --parallel 2 >>"$scratch/log" 2>&1 &&
    cmake --install "$scratch/build" --prefix "$scratch/prefix" >>"$scratch/log" || { cat "$scratch/log"; exit 1; }

# Nothing of the device is built or installed, and the exports are the same. An agent finds the device by these names.
made=$(find "$scratch/prefix" -name '*.so*' -o -name '*.h' | sed 's|.*/||; s|[.]so.*|.so|' | sort --unique | tr '\n' ' ')
expected=$({ ls "$sources/lib/DASystem/include"; echo libkiv_system.so; } | sort | tr '\n' ' ')
[[ $made == "$expected" ]] || { echo "installed: $made"; exit 1; }
library=$(find "$scratch/prefix" -name libkiv_system.so)
nm=$(sed --quiet 's/^CMAKE_NM:FILEPATH=//p' "$build/CMakeCache.txt")
cmake -DNM="$nm" -DLIBRARY="$library" -DSYMBOLS="$sources/lib/DASystem/exported_symbols.txt" \
    -P "$sources/tests/frame/exported_symbols.cmake"
PKG_CONFIG_PATH=$PKG_CONFIG_PATH:$(dirname "$(find "$scratch/prefix" -name kiv_system.pc)")
read -ra flags <<<"$(pkg-config --cflags kiv_system)"
for header in DASystem DASimManager DADBusManager DAConnectionManager; do
    echo "#include <$header.h>"
done | "${cxx[@]}" -std=c++17 -fsyntax-only -Wall -Wextra -Werror -x c++ - "${flags[@]}"

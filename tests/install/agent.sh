# shellcheck shell=bash
# Sourced. Builds the README's agent with an installed tree, as a user would, and runs it.

# Builds with the flags of pkg-config and with CMake's package. Both find the tree in any place.
try_agent() # prefix readme scratch compiler...
{
    local prefix=$1 readme=$2 scratch=$3 cxx=("${@:4}") flags
    awk '/^```cpp$/ { inside = 1; next } /^```$/ { inside = 0 } inside' "$readme" >"$scratch/agent.cpp"

    export PKG_CONFIG_PATH LD_LIBRARY_PATH
    PKG_CONFIG_PATH=$(dirname "$(find "$prefix" -name kiv_system.pc)")
    read -ra flags <<<"$(pkg-config --cflags --libs kiv_system)"
    "${cxx[@]}" -std=c++17 -Wall -Wextra -Werror "$scratch/agent.cpp" "${flags[@]}" -o "$scratch/agent"
    LD_LIBRARY_PATH=$(dirname "$(find "$prefix" -name libkiv_system.so)")
    run_agent "$scratch/agent"
    unset LD_LIBRARY_PATH

    mkdir "$scratch/with-cmake"
    cat >"$scratch/with-cmake/CMakeLists.txt" <<'CMAKE'
cmake_minimum_required(VERSION 3.21)
project(agent LANGUAGES CXX)
find_package(kiv_system 1.0 REQUIRED)
add_executable(agent ../agent.cpp)
target_link_libraries(agent kiv::system)
CMAKE
    cmake -G Ninja -S "$scratch/with-cmake" -B "$scratch/with-cmake" -DCMAKE_PREFIX_PATH="$prefix" -DCMAKE_CXX_COMPILER="${cxx[0]}" \
        ${KIV_TOOLCHAIN:+-DCMAKE_TOOLCHAIN_FILE="$KIV_TOOLCHAIN" -DCMAKE_FIND_ROOT_PATH="$prefix"} \
        -DCMAKE_CXX_STANDARD=17 >"$scratch/cmake.log"
    cmake --build "$scratch/with-cmake" >>"$scratch/cmake.log"
    run_agent "$scratch/with-cmake/agent"
}

# Checks that the agent prints what the README shows.
# KIV_EMULATOR is the command that runs programs of a cross build, word by word; otherwise it is empty.
run_agent() # agent
{
    export DBUS_SYSTEM_BUS_ADDRESS="unix:path=$scratch/no-bus" KIV_SUBSCRIBERS="$scratch/subscribers.db"
    local single none
    single=$(KIV_PROFILE=single ${KIV_EMULATOR-} "$1")
    none=$(KIV_PROFILE=no-telephony ${KIV_EMULATOR-} "$1") && exit 1
    printf '%s\n%s\n' "$single" "$none"
    grep --quiet --line-regexp --fixed-strings "$single" "$readme" && grep --quiet --line-regexp --fixed-strings "$none" "$readme"
}

# Tests the builds that an integrator may want, from sources $1, and what each of them installs.
. "$(dirname "$0")/../box/expect.sh"
. "$(dirname "$0")/../scratch.sh"

# try NAME OPTION...: configures in a folder of its own, quickly rather than well.
try() {
    folder=$work/$1
    shift
    read_only --bind "$work" "$work" -- cmake -S "$source" -B "$folder" -G Ninja \
        -DCMAKE_INSTALL_PREFIX="$folder/prefix" -DCMAKE_CXX_FLAGS=-O0 "$@" >"$work/log" 2>&1 || {
        failed=1
        echo "FAILED to configure with $*"
        cat "$work/log"
    }
}
installed() {
    read_only --bind "$work" "$work" -- \
        cmake --build "$folder" --target install -j"$(nproc)" >"$work/log" 2>&1 || cat "$work/log"
    (cd "$folder/prefix" && find bin sbin ! -type d 2>/dev/null | sort | xargs)
}
source=$1
without_tests=-DCMAKE_DISABLE_FIND_PACKAGE_GTest=ON # as if GoogleTest were not installed

try program -DKESTROVA_TOOLS=OFF $without_tests
expect "program alone" sbin/kestrova-panel "$(installed)"
try default $without_tests
expect "program and tools" "bin/kestrova-appliance-check bin/kestrova-panel-box bin/panel-emulator sbin/kestrova-panel" \
    "$(installed)"
try tests -DKESTROVA_TOOLS=OFF -DBUILD_TESTING=ON
try release -DBUILD_TESTING=ON -DCMAKE_BUILD_TYPE=Release -DKESTROVA_WERROR=OFF
finish

# Tests how the scripts react to wrong usage.
cd "$(dirname "$(realpath "$0")")/../.." || exit 1
. tests/box/expect.sh
. tests/scratch.sh

# Without a temporary folder they print one line and end, because the next step could harm the host.
for script in tests/box/box.sh tests/box/journey.sh \
    tests/packaging/files.sh tests/packaging/builds.sh tests/packaging/scripts.sh \
    tests/packaging/root.sh tests/packaging/source.sh \
    scripts/bench scripts/check scripts/demo scripts/package scripts/test scripts/test-fresh \
    scripts/test-packages scripts/test-web; do
    TMPDIR=/nonexistent read_only -- timeout 30 sh $script >"$work/said" 2>&1
    expect "$script without a temporary folder" "1 1 1" \
        "$? $(grep -c '^mktemp: ' "$work/said") $(wc -l <"$work/said")"
done

expect "an unknown release" "test-fresh: unknown release '11' (see --help)" \
    "$(sh scripts/test-fresh 12 11 2>&1)"

# A build of nothing, made as the scripts make theirs.
mkdir -p "$work/here/tools"
cp tools/common.sh "$work/here/tools"
printf 'cmake_minimum_required(VERSION 3.25)\nproject(nothing NONE)\n' >"$work/here/CMakeLists.txt"
build() { # FOLDER
    (cd "$1" && me=me && . tools/common.sh &&
        step build in_build build configure build -S . -B build -G Ninja) >"$work/said" 2>&1
    echo $?
}
built_in() { sed -n 's/^CMAKE_HOME_DIRECTORY:INTERNAL=//p' "$1/build/CMakeCache.txt"; }
cmake -S "$work/here" -B "$work/here/build" -G "Unix Makefiles" -DCMAKE_MAKE_PROGRAM=true >/dev/null
expect "another generator" 0 "$(build "$work/here")"
mv "$work/here" "$work/moved here"
expect "moved" "0 $work/moved here" "$(build "$work/moved here") $(built_in "$work/moved here")"
cp -R "$work/moved here" "$work/copy"
expect "copied" "0 $work/copy" "$(build "$work/copy") $(built_in "$work/copy")"

flock "$work/copy/build" sh -c "sleep 1; touch '$work/first'" &
sleep 0.2
expect "a second build waits for the first" "0 $work/first" "$(build "$work/copy") $(ls "$work/first")"

one_line() { echo "$? $(grep -c "^me: .*$work/copy/build" "$work/said") $(wc -l <"$work/said")"; }
in_copy='cd "$1" && me=me && . tools/common.sh && in_build build true'
read_only -- sh -c "exec 2>&1; TMPDIR=/dev/shm; export TMPDIR; $in_copy" sh "$work/copy" >"$work/said"
expect "a build that cannot be written to" "1 1 1" "$(one_line)"
finish

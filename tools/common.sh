# The scripts source this file in the checkout's folder. It contains steps that show what they do, and
# builds. $me is the name of the script, which begins its messages.
: "${me:?}"

# What the current step has printed. The file no longer has a name, so it disappears with the script.
printed=$(mktemp) || exit 1
exec 8>"$printed"
rm "$printed"
printed=/dev/fd/8

# step TITLE COMMAND: runs COMMAND, and sets $seconds to the time it took. A log gets one line if
# COMMAND succeeds, and everything that it printed if not. A terminal shows its lines as they come.
step() {
    title=$1
    shift
    begin=$(date +%s)
    status=0
    if [ -t 1 ]; then
        echo "$title ..."
        "$@" || status=$?
    else
        "$@" >$printed 2>&1 || status=$?
        [ $status -eq 0 ] || cat $printed
    fi
    [ $status -eq 0 ] || {
        echo "$me: failed: $title" >&2
        exit 1
    }
    seconds=$(($(date +%s) - begin))
    printf '%-40s ok, %d s\n' "$title" $seconds
}

# and_tell SCRIPT: prints what sed's script takes from the step's output, unless a terminal showed it.
and_tell() { [ -t 1 ] || sed -n "$1" $printed | sed 's/^/    /'; }

# in_build FOLDER COMMAND: runs COMMAND if everything in the folder can be written, one at a time.
in_build() {
    build=$1
    shift
    mkdir -p "$build" 2>/dev/null || {
        echo "$me: $(id -un) cannot make $PWD/$build" >&2
        return 1
    }
    blocked=$(find "$build" ! -type l ! -writable -print -quit)
    [ -z "$blocked" ] || {
        echo "$me: $(id -un) cannot write to $PWD/$blocked, which belongs to" \
            "$(stat -c %U "$blocked"): remove $PWD/$build" >&2
        return 1
    }
    { flock 9 && "$@"; } 9<"$build"
}

# configure FOLDER ARGUMENT...: configures a build with Ninja, from scratch if the folder was moved or
# copied, or made with another generator.
configure() {
    build=$1
    shift
    for entry in CMAKE_CACHEFILE_DIR:INTERNAL="$PWD/$build" CMAKE_HOME_DIRECTORY:INTERNAL="$PWD" \
        CMAKE_GENERATOR:INTERNAL=Ninja; do
        grep -qxF "$entry" "$build/CMakeCache.txt" 2>/dev/null || set -- --fresh "$@"
    done
    cmake "$@"
}

# compile FOLDER PRESET [TARGET...]: all targets, or just these.
compile() {
    folder=$1
    preset=$2
    shift 2
    configure "$folder" --preset "$preset" &&
        cmake --build --preset "$preset" -j"$(nproc)" ${1:+--target "$@"}
}

# Root may ask in somebody else's checkout, too.
ask_git() { git -c safe.directory="$PWD" "$@"; }

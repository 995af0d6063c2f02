# Sourced by the scripts, from the checkout's folder: steps that show what they do, and builds.
# $me is the script's name for what it says.

# What the present step printed: a file that has no name any more.
printed=$(mktemp) || exit 1
exec 8>"$printed"
rm "$printed"
printed=/dev/fd/8

# step TITLE COMMAND: in a log one line when all is well, and everything that COMMAND printed when
# not; on a terminal COMMAND's own lines show that it moves. Sets $seconds.
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

# Indents what the step told beyond its result, where a terminal has not shown it: sed's script.
and_tell() { [ -t 1 ] || sed -n "$1" $printed | sed 's/^/    /'; }

# in_build FOLDER COMMAND: one at a time, and only where everything can be written.
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

# configure FOLDER ARGUMENT...: with Ninja, anew when the folder was moved, copied or made otherwise.
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

# Also root may ask, in somebody else's checkout.
ask_git() { git -c safe.directory="$PWD" "$@"; }

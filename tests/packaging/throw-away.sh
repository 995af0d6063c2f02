# The tests source this file. It makes a Debian of release $release below $root, which is removed
# together with $work at the end; `in_system` runs commands in it.
. "${here:?}/../../tools/bare-debian.sh"
. "$here/../scratch.sh"
root=$work/root

container="$nspawn --directory=$root"
in_system() {
    $container sh -c "apt() {
        apt-get -q update &&
            DEBIAN_FRONTEND=noninteractive apt-get -q -y --no-install-recommends \"\$@\"
    }; $1"
}

give_up() {
    echo "FAILED $*"
    exit 1
}
must() { "$@" >"$work/log" 2>&1 || { cat "$work/log"; give_up "$@"; }; }

must bare_debian "$root" "${release:?}"

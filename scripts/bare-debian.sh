# Sourced: a bare Debian 12 to throw away, copied from one that is kept.

# bare_debian FOLDER NAME [OPTION...]: makes FOLDER, which must not exist, a copy of the system that
# debootstrap made with these options and that is kept under this name. For root.
bare_debian() {
    new=$1
    kept=${XDG_CACHE_HOME:-$HOME/.cache}/kestrova-panel/$2
    shift 2
    [ -d "$kept" ] || {
        # An interrupted one must not be taken for a whole one.
        rm -rf "$kept.part" &&
            mkdir -p "${kept%/*}" &&
            debootstrap --variant=minbase "$@" bookworm "$kept.part" &&
            mv "$kept.part" "$kept" || return 1
    }
    cp -a "$kept" "$new"
}

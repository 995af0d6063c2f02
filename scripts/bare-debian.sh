# The scripts source this file for a throw-away copy of a bare Debian 12.

# bare_debian FOLDER NAME [OPTION...]: copies a bare system to FOLDER, which must not exist. The system
# is made by debootstrap with these options, and kept under this name. Only root can do this.
bare_debian() {
    new=$1
    kept=${XDG_CACHE_HOME:-$HOME/.cache}/kestrova-panel/$2
    shift 2
    [ -d "$kept" ] || {
        # An interrupted debootstrap must not leave something that looks complete.
        rm -rf "$kept.part" &&
            mkdir -p "${kept%/*}" &&
            debootstrap --variant=minbase "$@" bookworm "$kept.part" &&
            mv "$kept.part" "$kept" || return 1
    }
    cp -a "$kept" "$new"
}

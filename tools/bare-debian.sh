# The scripts source this file for throw-away copies of a bare Debian, in each release that is
# supported. $me is the name of the script, which begins its messages.

# known_releases [RELEASE...]: prints these in order or, if there are none, all. Fails if one is not
# known.
known_releases() {
    for release; do
        [ -n "$(codename "$release")" ] || {
            echo "${me:?}: unknown release '$release' (see --help)" >&2
            return 2
        }
    done
    echo "${*:-12 13}" | xargs -n 1 | sort -u | xargs
}

codename() {
    case $1 in
        12) echo bookworm ;;
        13) echo trixie ;;
    esac
}

# This runs a command in the system of a --directory, or boots it. Without --suppress-sync, although a
# power failure may well damage that system: it would forbid openat2, which Debian 13's sandbox needs.
export nspawn="systemd-nspawn --quiet --register=no --keep-unit --console=pipe --machine=kestrova-$$"
export SYSTEMD_NSPAWN_UNIFIED_HIERARCHY=1 SYSTEMD_NSPAWN_API_VFS_WRITABLE=1

# is_own RELEASE: whether this machine runs this release.
is_own() { (. /etc/os-release && [ "$ID ${VERSION_ID-}" = "debian $1" ]); }

# sources_of CODENAME: where this machine gets Debian from, as package sources of this release. There
# are none if it does not know that.
sources_of() {
    apt-get indextargets --format '$(ORIGIN) $(REPO_URI) $(CODENAME) $(COMPONENT)' 'Created-By: Packages' |
        sed -nE "s#^Debian (https?://[^ ]+) (bookworm|trixie)(-updates|-security)? main\$#deb \1 $1\3 main#p" |
        sort -u
}

# bare_debian FOLDER RELEASE: copies a bare system of this release to FOLDER, which must not exist. Its
# packages come from where this machine gets its own. The system as debootstrap makes it is kept. Only
# root can do this.
bare_debian() {
    name=$(codename "$2")
    kept=${XDG_CACHE_HOME:-$HOME/.cache}/kestrova-panel/debian-$2-minbase
    [ -n "$(sources_of "$name")" ] || apt-get update || return 1
    sources=$(sources_of "$name")
    [ -d "$kept" ] || {
        # An interrupted debootstrap must not leave something that looks complete. Without a mirror, it
        # knows one itself, and writes it into the system's own sources.
        rm -rf "$kept.part" &&
            mkdir -p "${kept%/*}" &&
            echo "$sources" | awk -v name="$name" '$3 == name { print $2; exit }' |
            xargs debootstrap --variant=minbase "$name" "$kept.part" &&
            mv "$kept.part" "$kept" || return 1
    }
    cp -a "$kept" "$1" &&
        { [ -z "$sources" ] || echo "$sources" >"$1/etc/apt/sources.list"; } &&
        # The host may use a proxy, or a snapshot of the packages whose date has passed.
        { apt-config dump | grep '^Acquire::\(https\?::\|Check-\)' || true; } >"$1/etc/apt/apt.conf.d/host" &&
        echo force-unsafe-io >"$1/etc/dpkg/dpkg.cfg.d/throw-away" &&
        cp -L /etc/resolv.conf /etc/hosts "$1/etc"
}

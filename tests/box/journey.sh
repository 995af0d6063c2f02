# EMULATOR PROGRAM JOURNEY: plays a journey with the real program in the box. The pictures that it takes
# have to be those of the documentation, byte for byte.
cd "$(dirname "$(realpath "$0")")/../.." || exit 1
. tests/scratch.sh
"$1" --journey "$3" --pictures "$work" -- box/kestrova-panel-box -- "$2" || exit 1
for picture in "$work"/*.svg; do
    cmp "$picture" "docs/pictures/${picture##*/}" || {
        echo "no longer what the panel shows: scripts/demo --renew-pictures renews the pictures"
        exit 1
    }
done

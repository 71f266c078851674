#!/bin/sh
# The demonstration: runs inside an appliance root and says every command before it runs it. A chapter is a file
# chapters/FAMILY.sh; a later one finds what the earlier ones made.
# usage: story.sh [CHAPTER]...   (all of them when none is named)
set -eu
export PATH=/usr/sbin:/usr/bin:/sbin:/bin:/usr/tavo/bin

here=${0%/*}
all='conf section lock proc error storage disk partition raid lvm volume user group quota net discover watch service state'

say() { printf '\n\033[1m%s\033[0m\n' "$*"; }

# A command as a person would type it, then what it prints. Its failure is part of the story only where expected.
run() {
    printf '$ %s\n' "$*"
    "$@"
}
expect() {
    wanted=$1
    shift
    printf '$ %s\n' "$*"
    status=0
    "$@" || status=$?
    printf '(exit status %s)\n' "$status"
    [ "$status" = "$wanted" ]
}
# Whether disks, arrays and cards are real; in a plain root they are scripted.
machine() { [ ! "${TAVO_ROOT_FORM-}" ]; }

if [ $# = 0 ]; then
    say 'An appliance, its library and its command-line program'
    run uname -m
    run tavoctl version
    # shellcheck disable=SC2086
    set -- $all
fi
# Without namespaces there is no /proc, and what is asked there cannot be shown.
need_proc=' proc storage disk partition raid lvm volume quota net discover watch service state '
left_out=
for chapter; do
    case $need_proc in
    *" $chapter "*) [ -e /proc/self ] || { left_out="$left_out $chapter" && continue; } ;;
    esac
    . "$here/chapters/$chapter.sh"
done
[ ! "$left_out" ] || say "Left out, because there is no /proc in this form of the root:$left_out"

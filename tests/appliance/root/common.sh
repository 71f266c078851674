# What the tests of the appliance root share. Sourced; the root that the build made is the first argument.
set -uo pipefail
root=${1:?the root that tools/appliance/build made}
tools=$(cd "$(dirname "$0")/../../../tools/appliance" && pwd)
enter="$tools/enter --root $root"
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"; [[ $failed -eq 0 ]] || exit 1' EXIT
failed=0

complain() {
    echo "FAILED: $*" >&2
    failed=1
}

# same WHAT WANTED FOUND
same() { [[ $2 == "$3" ]] || complain "$1: wanted '$2', found '$3'"; }

# inside COMMAND...: through a shell in the root, in the form under test
inside() { $enter ${form:+--form "$form"} -- /bin/sh -c "$1"; }

skip() {
    echo "skipped: $*"
    exit 77
}

# The forms that this user can enter.
forms=namespaces
[[ $(id -u) -ne 0 ]] || forms+=" chroot"

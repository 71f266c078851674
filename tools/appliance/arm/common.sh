# What the shell tools of the virtual appliance share: where things are kept, and Debian's packages for 32-bit ARM.
# Sourced, never run.

arm_tools=$(dirname "$(readlink -f "${BASH_SOURCE[0]}")")
arm_tree=$(readlink -f "$arm_tools/../../..")
# All products are below one folder, which is safe to delete. Checkouts may share products made only of Debian's
# packages, but not those that contain this tree's own programs.
arm_own=$arm_tree/build/appliance/arm
arm_cache=${TAVO_ARM_CACHE:-$arm_own}

say() { echo "$(basename "$0"): $*" >&2; }

# Says what is missing and stops: CI fails, a desk that cannot have it goes on (77 is a skip to ctest).
unavailable() {
    say "$*"
    [[ ${CI:-} == true ]] && exit 1
    exit 77
}

need() {
    local missing=() program
    for program in "$@"; do
        command -v "$program" >/dev/null || missing+=("$program")
    done
    [[ ${#missing[@]} -eq 0 ]] || unavailable "missing: ${missing[*]}: run scripts/install-packages arm"
}

# The key of a thing that is made: a digest over the files that it is made from.
key_of() { cat "$@" | sha256sum | cut -c1-16; }

# The names in a package list, without its comments.
names_in() { grep -hv '^#' "$@"; }

# apt with lists, archives and an empty status file of its own, for the foreign architecture. The sources, keys and
# proxies are those of this machine; nothing is added to its package database and nothing is installed.
arm_apt() {
    local apt=$arm_cache/apt
    if [[ ! -f $apt/apt.conf ]]; then
        mkdir -p "$apt/lists/partial" "$apt/archives/partial" "$apt/nothing/partial"
        : >"$apt/status"
        cat >"$apt/apt.conf.new" <<END
APT::Architecture "armhf";
APT::Architectures { "armhf"; };
APT::Install-Recommends "false";
APT::Sandbox::User "root";
Acquire::Languages "none";
Acquire::Retries "3";
Dir::State "$apt";
Dir::State::lists "lists";
Dir::State::status "$apt/status";
Dir::Cache "$apt";
Dir::Cache::archives "archives";
Dir::Etc::preferences "/dev/null";
Dir::Etc::preferencesparts "/dev/null";
END
        mv "$apt/apt.conf.new" "$apt/apt.conf"
    fi
    APT_CONFIG=$apt/apt.conf LC_ALL=C "$@"
}

# Brings the lists up to date. A mirror in the middle of its own update may lack one of them; what is there will do,
# and a package that cannot be found is reported by name later.
arm_apt_update() {
    mkdir -p "$arm_cache/apt"
    arm_apt apt-get -qq update >"$arm_cache/apt/update.log" 2>&1 ||
        say "some package lists did not come ($arm_cache/apt/update.log); going on with the others"
}

# arm_unpack DIRECTORY with|alone NAME...: unpacks packages, with all that they depend on or alone. No maintainer
# script runs, so no emulator and no root is needed.
arm_unpack() {
    local directory=$1 mode=$2 archive files
    shift 2
    if [[ $mode == alone ]]; then
        mkdir -p "$arm_cache/apt/archives/partial"
        (cd "$arm_cache/apt/archives" && arm_apt apt-get -qq download "$@" >&2) || return 1
        files=$(arm_apt apt-get -qq download --print-uris "$@" | awk '{print $2}')
    else
        # With an empty archive every file is listed; with the real one only those that are still to come.
        files=$(arm_apt apt-get -qq install --yes --print-uris -o Dir::Cache::archives=nothing "$@" | awk '{print $2}')
        arm_apt apt-get -qq install --yes --download-only "$@" >&2 || return 1
    fi
    [[ -n $files ]] || return 1
    # One /usr: packages of both layouts land in the same place.
    local part
    mkdir -p "$directory/usr"
    for part in bin sbin lib; do
        mkdir -p "$directory/usr/$part"
        [[ -e $directory/$part ]] || ln -s "usr/$part" "$directory/$part"
    done
    while read -r archive; do
        dpkg-deb --fsys-tarfile "$arm_cache/apt/archives/$archive" |
            tar -x --keep-directory-symlink --no-same-owner -p -C "$directory" || return 1
    done <<<"$files"
}

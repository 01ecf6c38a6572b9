# shellcheck shell=sh
# A minimal system of a release, for scripts/checks/on-debian and scripts/checks/packages, which source this file. It is
# fetched once, with mmdebstrap or debootstrap, and kept in build/debian. Commands run in it in namespaces of their own,
# which end with the command: no mount and no process is left.
#
# Needs root, or as an ordinary user newuidmap and a range of user ids in /etc/subuid.

PATH=$PATH:/usr/sbin:/sbin  # an ordinary user may lack them

fail() {
    echo "$*" >&2
    exit 1
}

# quietly MESSAGE COMMAND...: shows the command's output only if it fails.
quietly() {
    message=$1
    shift
    "$@" >"$log" 2>&1 || {
        cat "$log" >&2
        fail "$message"
    }
}

# be_root ARGUMENT...: runs the script with these arguments again as the root of a namespace, unless it runs as root.
be_root() {
    [ "$(id -u)" -ne 0 ] || return 0
    scripts/install-packages mmdebstrap uidmap
    unshare --map-root-user --map-auto true 2>/dev/null ||
        fail "This system does not permit namespaces to ordinary users; run the script as root"
    exec unshare --map-root-user --map-auto -- "$PWD/scripts/checks/${0##*/}" "$@"
}

# prepare RELEASE: sets $suite, $work, $system and $log, fetches the system, and removes what was unpacked at the end.
prepare() {
    case $1 in
    12) suite=bookworm ;;
    13) suite=trixie ;;
    14) suite=forky ;;
    '' | *[!a-z]*) fail "$1: not a release, such as 12, 13 or trixie" ;;
    *) suite=$1 ;;
    esac
    work=$PWD/build/debian/$suite
    system=$work/system
    log=$work/log
    mkdir -p "$work/archives"
    exec 9>"$work/lock"
    flock --nonblock 9 || fail "$work is in use"
    trap clean EXIT
    trap 'exit 1' HUP INT TERM
    [ -f "$work/minimal.tar" ] || fetch
}

fetch() {
    mkdir -p "$work/temporary"
    echo "Fetching a minimal $suite"
    # This machine's own archive has its own release; another release comes from the default archive.
    sources=
    # shellcheck source=/dev/null
    if (. /etc/os-release && [ "${VERSION_CODENAME-}" = "$suite" ]); then
        for file in /etc/apt/sources.list.d/debian.sources /etc/apt/sources.list.d/ubuntu.sources \
            /etc/apt/sources.list; do
            [ ! -f "$file" ] || sources=${sources:-$file}
        done
    fi
    if ! command -v mmdebstrap >/dev/null && command -v debootstrap >/dev/null; then
        # shellcheck disable=SC2016  # the inner shell expands them
        set -- sh -c 'debootstrap --variant=minbase "$1" "$2" && tar -cf "$3" -C "$2" --one-file-system .' \
            sh "$suite" "$work/temporary/system" "$work/temporary/minimal.tar"
    else
        scripts/install-packages mmdebstrap debian-archive-keyring
        set -- mmdebstrap --variant=minbase --mode=root "$suite" "$work/temporary/minimal.tar" ${sources:+"$sources"}
    fi
    quietly "$suite could not be fetched" in_background env TMPDIR="$work/temporary" \
        unshare --mount --pid --fork --kill-child --mount-proc "$@"
    mv "$work/temporary/minimal.tar" "$work/minimal.tar"
    rm -rf "$work/temporary"
}

# Runs a command and waits for it. A shell acts on a signal only while it waits for a command in the background.
running=
in_background() {
    env --default-signal=INT,QUIT "$@" 9>&- &
    running=$!
    ended=0
    wait "$running" || ended=$?
    running=
    return $ended
}

# Ends the running command with everything that it started, and removes the system.
clean() {
    if [ -n "$running" ]; then
        # When the first process of the namespace ends, all of it ends.
        first=$(cat "/proc/$running/task/$running/children" 2>/dev/null) || :
        # shellcheck disable=SC2086  # none before the namespace is made
        kill -KILL ${first:-"$running"} || :
        wait "$running" || :
    fi
    rm -rf --one-file-system "$system" "$work/temporary" "$work/archives/partial"
}

# inside COMMAND...: runs a command in the system as root.
inside() {
    # shellcheck disable=SC2016  # the inner shell expands them
    in_background unshare --mount --pid --fork --kill-child sh -c '
        set -e
        cd "$1"
        mount -t proc proc proc
        mount --rbind /sys sys
        mount --bind "$2" var/cache/apt/archives
        mount -t tmpfs -o mode=755 tmpfs dev
        mkdir dev/pts dev/shm
        mount -t devpts -o newinstance,ptmxmode=666,mode=620 devpts dev/pts
        mount -t tmpfs -o mode=1777 tmpfs dev/shm
        for device in null zero full random urandom tty; do
            : >"dev/$device"
            mount --bind "/dev/$device" "dev/$device"
        done
        ln -s pts/ptmx dev/ptmx
        ln -s /proc/self/fd dev/fd
        for number in 0:stdin 1:stdout 2:stderr; do
            ln -s "/proc/self/fd/${number%:*}" "dev/${number#*:}"
        done
        system=$1
        shift 2
        exec chroot "$system" /usr/bin/env -i PATH=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin \
            HOME=/root LC_ALL=C.UTF-8 DEBIAN_FRONTEND=noninteractive "$@"
        ' sh "$system" "$work/archives" "$@"
}

# start: unpacks a fresh system.
start() {
    rm -rf --one-file-system "$system"
    mkdir "$system"
    tar -xf "$work/minimal.tar" -C "$system" --exclude='./dev/*'
    cp /etc/resolv.conf "$system/etc/resolv.conf"
    for proxy in ${http_proxy:+"http $http_proxy"} ${https_proxy:+"https $https_proxy"}; do
        echo "Acquire::${proxy%% *}::Proxy \"${proxy#* }\";"
    done >"$system/etc/apt/apt.conf.d/proxy"
    echo "127.0.0.1 localhost $(uname -n)" >"$system/etc/hosts"
    quietly "The list of packages could not be fetched" inside apt-get update
}

# copy_tree FOLDER: copies the tree as it is to a folder of the system.
copy_tree() {
    mkdir -p "$system$1"
    tar -c --exclude-vcs --exclude=./build . | tar -x --no-same-owner -C "$system$1"
}

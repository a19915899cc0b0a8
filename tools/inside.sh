# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# Running commands on a machine that is in a folder. Sourced by bash scripts; needs root.

# Runs a command in a folder of such a machine: inside MACHINE FOLDER UNSHARE_OPTION... -- COMMAND...
# Mounts and processes end with it.
inside() {
    local machine=$1 folder=$2 options=()
    shift 2
    while [ "$1" != -- ]; do
        options+=("$1")
        shift
    done
    shift
    # shellcheck disable=SC2016 # expanded by the inner shell
    env -i PATH=/usr/sbin:/usr/bin:/sbin:/bin HOME=/root CI=true \
        unshare --mount --pid --fork --kill-child "${options[@]}" -- sh -euc '
            mount --bind "$1" "$1"
            cd "$1"
            mount -t proc proc proc
            mount -t devpts -o newinstance,ptmxmode=0666 devpts dev/pts
            mount -t tmpfs tmpfs dev/shm
            mount -t tmpfs tmpfs run
            pivot_root . mnt
            umount -l /mnt
            cd "$2"
            shift 2
            exec "$@"
        ' sh "$machine" "$folder" "$@" </dev/null
}

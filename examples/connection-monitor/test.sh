#!/bin/sh
# Plays commute.toml to the application: test.sh CORESYSTEM APPLICATION
#
# Each line of the application lets the next step be played, so that nothing depends on time.
set -eu
CORESYSTEM=$1 APPLICATION=$2
here=$(CDPATH='' cd -- "$(dirname -- "$0")" && pwd)
export CORESYSTEM APPLICATION here
exec "$CORESYSTEM" device run --copy "$here/commute.toml" -- sh -euc '
    "$APPLICATION" 4 | tee "${CORESYSTEM_DEVICE%/*}/told" |
        "$CORESYSTEM" device play --by-line "$here/commute.toml"
    diff "$here/expected.txt" "${CORESYSTEM_DEVICE%/*}/told"'

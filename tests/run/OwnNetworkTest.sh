#!/usr/bin/env bash
# OwnNetworkTest.sh: what who starts ./run is told where the system forbids networks of one's own.
set -euo pipefail
cd "$(dirname "$0")/../.."

folder=$(mktemp -d)
trap 'rm -r "$folder"' EXIT
failures=0

expect() { # WHAT TEST...
    local what=$1
    shift
    "$@" || { echo "FAILED: $what" >&2; failures=$((failures + 1)); }
}

# A system that refuses, and one that allows without doing anything.
mkdir "$folder/refusing" "$folder/allowing"
printf '#!/bin/sh\necho "unshare: unshare failed: Operation not permitted" >&2\nexit 1\n' \
    >"$folder/refusing/unshare"
printf '#!/bin/sh\n[ "$2" = true ] || echo "entered:" "$@"\n' >"$folder/allowing/unshare"
chmod +x "$folder"/*/unshare

enter() { # SYSTEM: enters as ./run does; output and errors go to files
    code=0
    PATH="$folder/$1:$PATH" bash -c '. cmake/own-network.sh; enter_own_network ./run --once' \
        >"$folder/output" 2>"$folder/errors" || code=$?
}

enter refusing
expect "a refusal ends with 1" [ "$code" = 1 ]
expect "a refusal prints nothing to standard output" [ ! -s "$folder/output" ]
expect "the system's own reason is shown" \
    grep -q "unshare failed: Operation not permitted" "$folder/errors"
expect "the reason is put in words" \
    grep -q "does not let you make a network of your own" "$folder/errors"
expect "the way to open the port is told" \
    grep -q "sudo sysctl net.ipv4.ip_unprivileged_port_start=803" "$folder/errors"
expect "the way as root is told, with the arguments" grep -q "sudo ./run --once" "$folder/errors"

enter allowing
expect "where it is allowed the command is entered" grep -q "entered:.*./run --once" "$folder/output"
expect "where it is allowed nothing is said" [ ! -s "$folder/errors" ]

expect "./run enters by this road alone" bash -c '! grep -q "unshare -Urn sh" run && grep -q enter_own_network run'
exit $((failures > 0))

#!/usr/bin/env bash
# Runs a program as a user whom permissions bind, root too: unprivileged.sh PROGRAM [ARGUMENT]...
set -euo pipefail

bound=()
if [[ $(id -u) == 0 ]]; then
    bound=(setpriv --bounding-set=-all --inh-caps=-all)
fi
secret=$(mktemp)
trap 'rm -f -- "$secret"' EXIT
chmod 0 -- "$secret"
if "${bound[@]}" cat -- "$secret" 2>/dev/null; then
    echo "permissions do not bind this user" >&2
    exit 1
fi
"${bound[@]}" "$@"

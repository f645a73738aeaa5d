#!/usr/bin/env bash
# What a newcomer reads when packages are missing: stubs take the places of apt-get, dpkg-query, sudo and id.
# Catches: a script that ends without a word, or with nothing but apt's errors.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/../.."
STUBS=$(mktemp -d)
trap 'rm -rf "$STUBS"' EXIT
stub() { printf '#!/bin/sh\n%s\n' "$2" >"$STUBS/$1" && chmod +x "$STUBS/$1"; }
stub id "echo \${USER_ID:-0}"
stub sudo 'exit 1'
stub dpkg-query "[ -z \${ALL:-} ] || sed 's/^/installed /' tools/packages-demo.txt"
# shellcheck disable=SC2016 # the stub expands them
stub apt-get 'case $* in
  *update*) exit ${UPDATE:-0} ;;
  *--assume-no*)
    [ -z "${SIZE:-}" ] || printf "Need to get $SIZE of archives.\nAfter this operation, 9 GB of additional disk space...\n"
    exit 1 ;;
  *--download-only*) exit ${DOWNLOAD:-0} ;;
esac
exit ${INSTALL:-0}'

packages=$(grep -v '^#' tools/packages-demo.txt | paste -sd ' ')
while IFS='|' read -r environment status text; do
  got=0
  read -ra variables <<<"$environment"
  line=$(env "PATH=$STUBS:$PATH" "${variables[@]}" bash -c '. tools/common.sh; install_missing "Note." demo' 2>&1) || got=$?
  [ "$got" = "$status" ] && [ "$(tail -n 1 <<<"$line")" = "${text/PACKAGES/$packages}" ] ||
    { echo "error: with '$environment': status $got and: $line" && exit 1; }
done <<TABLE
ALL=1|0|
SIZE=1kB|0|== Installing $(wc -w <<<"$packages") missing packages: 1kB to fetch, 9 GB on disk. Note.
UPDATE=100|1|error: cannot reach the package servers; these packages are missing: PACKAGES
UPDATE=100 SIZE=1kB DOWNLOAD=100|1|error: cannot reach the package servers; these packages are missing: PACKAGES
UPDATE=0|1|error: the package servers of this system do not have all these packages (those of Debian 12 do): PACKAGES
SIZE=1kB INSTALL=100|1|error: apt-get cannot install these packages: PACKAGES
USER_ID=1000|1|error: these packages are missing, and installing them needs root: PACKAGES
TABLE

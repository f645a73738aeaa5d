#!/usr/bin/env bash
# Puts includes into a copy of the tree, one at a time. Catches: an arrow that tools/check-arrows does not
# guard, a spelling of an include that it does not see, a correct include that it refuses.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/../.."
COPY=$(mktemp -d)
trap 'rm -rf "$COPY"' EXIT
{ tools/files '*.h' '*.cpp' '*.c'; echo tools/files; echo tools/check-arrows; } | xargs -d '\n' cp --parents -t "$COPY"
cd "$COPY"

die() {
  echo "error: $*" >&2
  exit 1
}

# refuses FOLDER INCLUDE: whether a new source of that folder is reported for that include.
refuses() {
  mkdir -p "$1"
  printf '// A new source.\n%s\n' "$2" >"$1/probe.cpp"
  local report status=0
  report=$(tools/check-arrows 2>&1) || status=$?
  rm "$1/probe.cpp"
  echo "$report"
  [ "$status" -eq 1 ] && [[ $report == "$1/probe.cpp:"* ]]
}

tools/check-arrows || die "the tree as it is fails"

while read -r folder include; do
  refuses "$folder" "$include" || die "$folder is free to include: $include"
done <<'TABLE'
include               #include "command.h"
sdk                   #include "recording/header.h"
sdk/zv_lib            #include "virtual_card.h"
recording             #include "print.h"
app                   #include "zv_driver.h"
app/demodialog        #include <zv_driver.h>
app/demodialog        #include "../../sdk/zv_card.h"
app                   #include "tests/support.h"
programs/players      #  include "sdk/zv_driver.h"
programs/recorder     #include "demodialog.h"
programs/check        #include "sdk/zv_card.h"
examples              #include "recording/header.h"
virtual_card          #include "nodes/card.h"
virtual_card/nodes    #include "../guest/preload.h"
virtual_card/nodes    #include "zv_card.h"
virtual_card/picture  #include "nodes/clock.h"
virtual_card/picture  #include "app_state.h"
virtual_card/host     #include "card_state.h"
new_folder            #include "zv_lib.h"
TABLE

while read -r folder include; do
  ! refuses "$folder" "$include" || die "$folder must be able to include: $include"
done <<'TABLE'
programs/check        #include "sdk/zv_driver.h"
programs/recorder     #include "recording/tree.h"
virtual_card/guest    #include "picture/engine.h"
tests/virtual_card    #include "demodialog.h"
app                   // #include "zv_driver.h"
TABLE

# shellcheck shell=bash
# What every end-to-end test begins with: a temporary folder, the helpers of tools/, and checks that say
# what they found. ctest passes the paths of the built programs. To be sourced, not run.
set -euo pipefail

HERE=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
# shellcheck source=tools/common.sh
. "$HERE/../../tools/common.sh"
# shellcheck source=tools/streams.sh
. "$ZARVO_ROOT/tools/streams.sh"
# shellcheck source=tools/operator.sh
. "$ZARVO_ROOT/tools/operator.sh"

CARD=$ZARVO_CARD
PROGRAM=${ZARVO_DEMO:-}
WIDGET_MAP=${ZARVO_WIDGET_MAP:-}
unset ZARVO_VIRTUAL_CARD
export TZ=UTC

FOLDER=$(mktemp -d)
clean_up() {
  [ -z "$OPERATOR_FOLDER" ] || close_display
  rm -rf "$FOLDER"
}
trap clean_up EXIT
use_card "$CARD"

# expect WHAT COMMAND...: the command must succeed.
expect() {
  local what=$1
  shift
  "$@" || die "$what"
}

# expect_equal WHAT EXPECTED ACTUAL
expect_equal() { [ "$2" = "$3" ] || die "$1: expected '$2', got '$3'"; }

# expect_decodes FILE...: every file must exist and decode without an error line.
expect_decodes() { report_streams "$@" || die "not all recordings decode"; }

# readme_block LANGUAGE [DOCUMENT]: the code block of the README, or of another document, in that language.
readme_block() { awk -v begin="\`\`\`$1" '$0 == "```" { inside = 0 } inside; $0 == begin { inside = 1 }' "$ZARVO_ROOT/${2:-README.md}"; }

# open_program: starts the demo application in $FOLDER/work, on an invisible display.
open_program() {
  mkdir -p "$FOLDER/work/Data"
  open_display
  trap clean_up EXIT
  start_program "$FOLDER/work"
}

# end_program: closes the dialog; the program must end with status 0.
end_program() {
  close_program
  expect_equal "exit status of the program" 0 "$STATUS"
}

# record_cif: chooses 16 CIF channels and starts the recording.
record_cif() {
  choose comboQualityMode 1
  click btnRecordStart
}

# set_clock TIME: sets the program's wall clock, before its start or while it runs: libfaketime reads the
# offset from a file. The card's clock does not change.
set_clock() {
  ZARVO_PRELOAD=$(find /usr/lib -name libfaketimeMT.so.1 -print -quit)
  expect "libfaketime is missing" test -n "$ZARVO_PRELOAD"
  export FAKETIME_TIMESTAMP_FILE=$FOLDER/clock FAKETIME_NO_CACHE=1 FAKETIME_DONT_FAKE_MONOTONIC=1 DONT_FAKE_MONOTONIC=1
  printf '%+d\n' $(($(date -d "$1" +%s) - $(date +%s))) >"$FOLDER/clock"
}

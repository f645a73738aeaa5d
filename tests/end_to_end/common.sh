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

# wait_for_all: waits for all jobs; the first that fails ends the test.
wait_for_all() { local job; for job in $(jobs -p); do wait "$job" || exit 1; done; }

# expect_all_faults TABLE: the table, whose rows begin with an item, has each fault of the card. Catches: a new kind of
# fault that nobody tries.
expect_all_faults() {
  local name
  for name in $("$ZARVO_CARD_PROGRAM" --list | sed -nE 's/^\| `([a-z]+).*/\1/p'); do
    case $name in cameraN | camera | board | seed | speed | log | state | control) continue ;; esac
    grep -q "^$name\(=\||\)" <<<"$1" || die "no row for the fault $name"
  done
}

# acknowledged LOG: frames and bytes of the MPEG-4 frames that the card's log shows as acknowledged: their callbacks
# have returned.
acknowledged() {
  awk -v descriptor=64 '
    / read size=1048576 = / { got = $NF }
    / ENC_IOC_MPEG4_DONE / && got > 0 { ++frames; bytes += got - descriptor; got = 0 }
    END { print frames + 0, bytes + 0 }' "$1"
}

# packets FILE: "frames that decode,frames"
packets() {
  stream_input "$1"
  ffprobe -v quiet -count_frames -count_packets -show_entries stream=nb_read_frames,nb_read_packets \
    -of csv=p=0 "${STREAM[@]}"
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

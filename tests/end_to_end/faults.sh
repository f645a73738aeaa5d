#!/usr/bin/env bash
# Applies every fault of the card while a program records, then undoes it. Catches: a program that hangs,
# crashes, stays broken after the fault, or does not tell what is missing.
#   faults.sh record    zarvo_record: a run of 6 seconds for each fault, which is in effect from second 2 to 4
#   faults.sh dialog    the demo application: one session with preview and recording through all faults
. "$(dirname "$0")/common.sh"

# The faults of both runs: item | codec whose recording shows it | what the host loses (see check_record).
FAULTS='lost=3|mpeg4|nothing
flicker=3:10|mpeg4|nothing
black=3|mpeg4|nothing
still=3|mpeg4|nothing
silent=1-4|mpeg4|nothing
stall=mpeg4,audio,preview|mpeg4|frames
stall=mjpeg|mjpeg|nothing
late=mpeg4,audio:80|mpeg4|nothing
burst=mjpeg,audio:500|mjpeg|nothing
queue=mpeg4,mjpeg,audio:1|mpeg4|anything
drop=mpeg4,mjpeg,audio:5|mpeg4|frames
drop=mjpeg,audio:5|mjpeg|frames
twice=mpeg4,audio:5|mpeg4|extra
twice=mjpeg,audio:5|mjpeg|nothing
torn=mpeg4,audio:5|mpeg4|damage
torn=mjpeg:5|mjpeg|damage
bits=mpeg4,audio:40|mpeg4|damage
bits=mjpeg:40|mjpeg|damage
nointra=mpeg4|mpeg4|anything
noeoi=mjpeg|mjpeg|damage
type=mpeg4:3|mpeg4|damage
channel=mpeg4:2|mpeg4|frames
channel=mjpeg:2|mjpeg|frames
foreign=mjpeg:17|mjpeg|frames
ahead=mpeg4:100|mpeg4|nothing
back=mpeg4:100|mpeg4|nothing
long=mpeg4|mpeg4|anything
empty=mpeg4,audio,preview|mpeg4|frames
empty=mjpeg|mjpeg|frames
oversize=mpeg4,audio,preview|mpeg4|anything
oversize=mjpeg|mjpeg|anything
negative=mpeg4,audio,preview|mpeg4|frames
negative=mjpeg|mjpeg|frames
short=audio:100|mpeg4|anything
index=preview:9|mpeg4|nothing
frozen=preview|mpeg4|nothing
fail=any/ioctl:EIO|mpeg4|anything
fail=any/ioctl:EINTR:every2|mpeg4|nothing
fail=any/read:EIO:every3|mpeg4|anything
slow=20|mpeg4|anything
vanish|mpeg4|frames
absent|mpeg4|nothing
nowait|mpeg4|nothing
stuck=0x310|mpeg4|nothing
garbage=0x5a|mpeg4|nothing
noreply|mpeg4|nothing
wrongreply|mpeg4|nothing
bite|mpeg4|nothing'

# sanitized: whether the card is built with a sanitizer. (A pipe into grep -q would fail now and then: the reader goes
# before the writer has ended.)
sanitized() { [[ $(ldd "$CARD") =~ lib(asan|tsan) ]]; }

# A sanitizer believes what a read returns and looks at as many bytes of the buffer. The reads of video have none.
! sanitized || FAULTS=${FAULTS/oversize=mpeg4,audio,preview/oversize=mpeg4}

expect_all_faults "$FAULTS"

# end_errors FILE: what ffmpeg says about the recording from its last but one intra frame on.
end_errors() {
  local mark='\x00\x00\x01\x00' end=$1.end.m4v offset
  [[ $1 != *.mjpeg ]] || mark='\xff\xd8\xff' end=$1.end.mjpeg
  offset=$(LC_ALL=C grep -obUaP "$mark" "$1" | tail -n 2 | head -n 1 | cut -d : -f 1)
  tail -c +$((offset + 1)) "$1" >"$end"
  decode_errors "$end"
}

# slow_run FOLDER: whether frames may be missing up to the end: the program runs under a sanitizer, or the card says
# that it did not read in time.
slow_run() { sanitized || grep -q '^virtual card: .* are lost' "$1.log"; }

# check_record FAULT LOSES FOLDER STATUS: the recording of a run with that fault.
check_record() {
  local fault=$1 loses=$2 out=$3 status=$4 file
  expect "$fault: status $status: $(tail -n 3 "$out.log")" test "$status" -eq 0 -o "$status" -eq 3
  ! slow_run "$out" || return 0
  case $loses in
    nothing) expect_equal "status under $fault" 0 "$status" ;;
    frames) expect_equal "status under $fault, although frames are missing" 3 "$status" ;;
  esac
  for file in "$out"/ch0[12].*; do
    [ "$loses" != nothing ] || expect_equal "$fault: $file" '' "$(decode_errors "$file")"
    expect_equal "$fault: the end of $file" '' "$(end_errors "$file")"
  done
}

run_recorder() {
  local item codec loses number=0
  while IFS='|' read -r item codec loses; do
    number=$((number + 1))
    (
      out=$FOLDER/$number status=0
      ZARVO_VIRTUAL_CARD="@2-4 $item" timeout -k 5 60 "${ON_CARD[@]}" "$ZARVO_RECORD" --channels 1-2 \
        --codec "$codec" --seconds 6 --output "$out" >"$out.log" 2>&1 </dev/null || status=$?
      check_record "$item" "$loses" "$out" "$status"
      rm -r "$out"
    ) &
    [ $((number % 4)) -ne 0 ] || wait_for_all
  done <<<"$FAULTS"
  wait_for_all
}

# restore_preview FAULT: the preview runs, or has ended with its error line and runs after Stop and Start.
restore_preview() {
  if preview_gone; then
    expect "$1: the preview has ended without a word" grep -q 'zv_GetPreviewScreen Error' "$LOG"
    click btnPreviewStop
    click btnPreviewStart
    wait_preview
  fi
  expect "$1: the preview stands still" wait_until 20 preview_runs
}

run_dialog() {
  local item codec loses file
  export ZARVO_CARD_SOCKET=$FOLDER/card ZARVO_VIRTUAL_CARD=control=$FOLDER/card
  open_program
  click btnPreviewStart
  wait_preview
  click radioEnAudio
  click checkCh1
  record_cif
  wait_line kbps 2
  while IFS='|' read -r item codec loses; do
    "$ZARVO_CARD_PROGRAM" "$item" || die "the card refused $item"
    sleep 0.7
    "$ZARVO_CARD_PROGRAM" reset
    expect "$item: the program has ended: $(tail -n 3 "$LOG")" kill -0 "$DEMO"
    restore_preview "$item"
    wait_line kbps $(($(lines kbps) + 1))
  done <<<"$FAULTS"
  wait_line kbps $(($(lines kbps) + 3))
  click btnRecordStop
  expect "the recordings stay open after Stop" wait_until 20 files_closed
  for file in "$FOLDER"/work/Data/Video/*/*/*.rec; do
    expect_equal "the end of $file" '' "$(end_errors "$file")"
  done
  click btnRecordStart # a recording after all of it is as good as the first
  wait_line kbps $(($(lines kbps) + 3))
  click btnRecordStop
  expect "the recordings stay open after Stop" wait_until 20 files_closed
  expect_decodes "$FOLDER"/work/Data/Video/*/*/*.rec
  end_program
}

case $1 in
  record) run_recorder ;;
  dialog) run_dialog ;;
esac

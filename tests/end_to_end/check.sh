#!/usr/bin/env bash
# zarvo_check on the virtual card.
#   check.sh run      all quick checks hold; TAP, read by the program `prove`, and JSON give the same results; the
#                     table in the document is right; message and status when zarvo_check cannot run
#   check.sh faults   each fault of the card makes checks of the right theme fail
#   check.sh short    checks that need no speed: for the builds with a sanitizer, which ends the program on a fault
#   check.sh kill     killed at random moments, it leaves the card as it was. ZARVO_KILLS is the number of kills (6).
. "$(dirname "$0")/common.sh"

check() { "${ON_CARD[@]}" "$ZARVO_CHECK" "$@"; }

# cannot_run PATTERN ITEM: status 2, and a line with the pattern.
cannot_run() {
  local status=0
  ZARVO_VIRTUAL_CARD=$2 check --only 'nodes.*' >"$FOLDER/out" 2>&1 || status=$?
  expect_equal "status with $2" 2 "$status"
  expect "with $2 it says: $(cat "$FOLDER/out")" grep -q "$1" "$FOLDER/out"
}

run_all() {
  local document=docs/checking-a-card.md
  diff <("$ZARVO_CHECK" --list) <(sed -n '/^| check /,/^$/p' "$ZARVO_ROOT/$document") ||
    die "the table in $document is not the one of zarvo_check --list"

  cannot_run 'load the driver' absent
  cannot_run 'plug the card in' vanish
  cannot_run 'no permission' 'fail=encoder/open:EACCES'
  cannot_run 'zarvo_g723_0.*no such node' 'fail=audio/open:ENOENT'
  cannot_run 'another program uses the card' 'fail=display/open:EBUSY'

  prove --verbose --exec "${ON_CARD[*]}" "$ZARVO_CHECK" :: --quick || die "prove does not accept the output, or a check fails"
  check --json --only 'nodes.*' >"$FOLDER/json"
  expect_equal "broken checks in the JSON" 0 "$(grep -c '"outcome": "broken"' "$FOLDER/json")"
  expect_equal "themes in the JSON" 1 "$(grep -c '"themes"' "$FOLDER/json")"
}

# The checks that look at one capture of the driver's four streams.
STREAMS='mpeg4.read.* mpeg4.descriptor.* mpeg4.start.* mpeg4.stamp.* mpeg4.gap mjpeg.read.* mjpeg.descriptor.*
  mjpeg.eoi mjpeg.start.* mjpeg.gap audio.read.* audio.start.* audio.gap preview.read.* preview.start.* preview.rate'

# Item | checks | the themes of the checks that fail; "hold": none fails; "skip": none fails, and all are skipped;
# "cannot": the program cannot run.
FAULTS='lost=1-16|picture.*|skip
flicker=3:10|registers.*|registers
black=1-16|picture.hue picture.mask.*|skip
still=1-16|motion.*|skip
silent=1-4|audio.sound.* audio.apart|skip
fail=any/ioctl:EIO|boundary.accepts.*|boundary
fail=any/ioctl:EINTR:every2|boundary.accepts.*|hold
fail=any/read:EIO:every3|mpeg4.read.*|mpeg4
fail=any/close:EIO|nodes.*.opens|nodes
fail=encoder/mmap:EIO|boundary.*|boundary
slow=50|load.mpeg4.*|load
vanish|nodes.*|cannot
absent|nodes.*|cannot
nowait|STREAMS|hold
stuck=0x310|registers.*|registers
garbage=0x310|registers.*|registers
noreply|watchdog.*|watchdog
wrongreply|registers.*|registers
bite|watchdog.*|hold
stall=mpeg4|STREAMS|mpeg4
stall=mjpeg|STREAMS|mjpeg
stall=audio|STREAMS|audio
stall=preview|STREAMS|preview
late=mpeg4:1000|STREAMS|mpeg4
late=mjpeg:1000|STREAMS|mjpeg
late=audio:1000|STREAMS|audio
burst=mpeg4:1000|STREAMS|mpeg4
burst=mjpeg:1000|STREAMS|mjpeg
burst=audio:1000|STREAMS|audio
queue=mpeg4:1|load.pause.*|load
queue=mjpeg:1|load.pause.*|load
queue=audio:1|load.pause.*|load
drop=mpeg4:5|mpeg4.rate.ntsc.30|mpeg4
drop=mjpeg:5|mjpeg.rate.30|mjpeg
drop=audio:5|audio.rate.*|audio
twice=mpeg4:5|STREAMS|mpeg4
twice=mjpeg:5|mjpeg.rate.30|mjpeg
twice=audio:5|audio.rate.*|audio
torn=mpeg4:5|mpeg4.size.ntsc.720.*|mpeg4
torn=mjpeg:5|mjpeg.size.ntsc.720.*|mjpeg
torn=audio:5|STREAMS|audio
bits=mpeg4:40|mpeg4.size.ntsc.720.*|mpeg4
bits=mjpeg:40|mjpeg.size.ntsc.720.*|mjpeg
silent=2;bits=audio:400|audio.silence|audio
nointra=mpeg4|STREAMS|mpeg4
noeoi=mjpeg|STREAMS|mjpeg
type=mpeg4:3|STREAMS|mpeg4
channel=mpeg4:2|STREAMS|mpeg4
channel=mjpeg:2|STREAMS|mjpeg
foreign=mjpeg:17|STREAMS|mjpeg
ahead=mpeg4:100|STREAMS|mpeg4
back=mpeg4:100|STREAMS|mpeg4
long=mpeg4|STREAMS|mpeg4
empty=mpeg4|STREAMS|mpeg4
empty=mjpeg|STREAMS|mjpeg
empty=audio|STREAMS|audio
empty=preview|STREAMS|preview
oversize=mpeg4|STREAMS|mpeg4
oversize=mjpeg|STREAMS|mjpeg
oversize=audio|STREAMS|audio
oversize=preview|STREAMS|preview
negative=mpeg4|STREAMS|mpeg4
negative=mjpeg|STREAMS|mjpeg
negative=audio|STREAMS|audio
negative=preview|STREAMS|preview
short=audio:100|STREAMS|audio
index=preview:9|STREAMS|preview
frozen=preview|STREAMS|preview'

# try_fault NUMBER ITEM GLOBS EXPECTED
try_fault() {
  local out=$FOLDER/$1 item=$2 expected=$4 found status=0 globs=() glob
  for glob in ${3//STREAMS/$STREAMS}; do globs+=(--only "$glob"); done
  ZARVO_VIRTUAL_CARD=$item check --quick --watchdog --seconds 2 "${globs[@]}" >"$out" 2>"$out.errors" || status=$?
  found=$(sed -n 's/^not ok [0-9]* - \([a-z0-9]*\)\..*/\1/p' "$out" | sort -u | paste -sd ,)
  [ -n "$found" ] || found=hold
  if ! grep '^ok ' "$out" | grep -qv SKIP && grep -q '^ok ' "$out"; then found=skip; fi
  [ "$status" -ne 2 ] || found=cannot
  expect_equal "$item: $(grep -A 5 '^not ok' "$out" | head -n 12; tail -n 2 "$out.errors")" "$expected" "$found"
}

try_faults() {
  local item globs expected number=0
  expect_all_faults "$FAULTS"
  while IFS='|' read -r item globs expected; do
    number=$((number + 1))
    try_fault "$number" "$item" "$globs" "$expected" &
    [ $((number % 3)) -ne 0 ] || wait_for_all
  done <<<"$FAULTS"
  wait_for_all
}

# write_state FILE: PAL, 704 pixels, four pictures, two windows swapped, a mask, properties and a threshold.
write_state() {
  local window x y places=('0 0' '352 0' '0 288' '352 288')
  {
    printf '# State\nVIN_IOC_SET_STANDARD value=1\nVIN_IOC_SET_WIDTH value=704\n'
    printf 'VIN_IOC_WRITE_REG address=0x%x value=0x%x\n' 0x180 0x10000100 0x184 0x00000100 0x14c 0x0a140508
    printf 'VIN_IOC_WRITE_TW2815 chip=0x1 address=0x%x value=0x%x\n' 0x17 0x90 0x19 0xa0
    for window in {0..15}; do
      read -r x y <<<"${places[window]:-}"
      printf 'DISP_IOC_SET_WINDOW index=%d channel=%d scale=%d x_start=%d y_start=%d x_end=%d y_end=%d flags=1\n' \
        "$window" $((window < 2 ? 1 - window : window)) "${x:+3}" "$x" "$y" "${x:+$((x + 352))}" "${y:+$((y + 288))}"
    done
    echo 'DISP_IOC_SET_GRID column=0 column=352 column=702 column=0 column=0 row=0 row=288 row=574 row=0 row=0 cells=51'
    echo 'DISP_IOC_SET_RECT number=0 x_start=0 y_start=0 x_end=702 y_end=574 enable=1'
    echo 'VIN_IOC_SET_MOTION_MAP channel=0 column=0 row=0 columns=64 rows=64 threshold=345'
  } >"$1"
  perl -0777 -ne '$s = 2166136261; $s = (($s ^ $_) * 16777619) & 0xffffffff for unpack "C*"; print "checksum $s\n"' \
    "$1" >"$1.sum"
  cat "$1.sum" >>"$1"
}

kill_at_random() {
  local state=$FOLDER/state round signal program
  write_state "$state"
  export ZARVO_VIRTUAL_CARD=state=$state
  check --only nodes.encoder.opens >/dev/null # writes the file as the card does
  cp "$state" "$FOLDER/before"
  for ((round = 1; round <= ${ZARVO_KILLS:-6}; ++round)); do
    signal=INT
    [ $((round % 2)) -eq 0 ] || signal=TERM
    # A background job of a script ignores SIGINT; env restores the default.
    env --default-signal=INT "${ON_CARD[@]}" "$ZARVO_CHECK" --quick >"$FOLDER/out" 2>&1 &
    program=$!
    expect "round $round: no check has run" wait_until 30 grep -q '^ok ' "$FOLDER/out"
    sleep "$((RANDOM % ${ZARVO_KILL_SECONDS:-20})).$((RANDOM % 1000))"
    kill -s "$signal" "$program" 2>/dev/null || true
    wait "$program" || true
    diff "$FOLDER/before" "$state" || die "round $round: signal $signal after '$(grep -a '^ok' "$FOLDER/out" | tail -n 1)'"
  done
}

run_short() {
  local status=0
  # Pictures may come late, so some checks may not hold.
  check --seconds 1 --only 'nodes.*' --only 'boundary.*' --only 'registers.*' --only 'mpeg4.read.*' --only 'audio.block' \
    --only 'preview.layout.*' --only 'picture.*' --only 'motion.*' --only 'load.*' >"$FOLDER/out" 2>&1 || status=$?
  expect "status $status: $(tail -n 30 "$FOLDER/out")" test "$status" -le 1
  expect "a report of a sanitizer: $(cat "$FOLDER/out")" test "$(grep -c 'Sanitizer\|runtime error' "$FOLDER/out")" -eq 0
  expect "not all checks have run" grep -q '^# load ' "$FOLDER/out"
  expect "boundary: $(grep -A 4 '^not ok' "$FOLDER/out")" test "$(grep -c '^not ok.* boundary' "$FOLDER/out")" -eq 0
}

case $1 in
  short) run_short ;;
  run) run_all ;;
  faults) try_faults ;;
  kill) kill_at_random ;;
esac

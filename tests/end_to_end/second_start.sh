#!/usr/bin/env bash
# The card keeps what a program has set (option state). The README's program and zarvo_record record after a
# session in PAL with 704 pixels: the stream header must have the size of the pictures, else decoding fails.
. "$(dirname "$0")/common.sh"

# compile NAME SED-SCRIPT: builds the README's program with changes.
compile() {
  readme_block c | sed "s/sleep(5)/sleep(2)/; $2" >"$FOLDER/$1.c"
  cc "$FOLDER/$1.c" -I"$ZARVO_ROOT/include" "$ZARVO_BUILD/sdk/libzarvo_sdk.a" -pthread -o "$FOLDER/$1"
}

# on_card COMMAND...: runs it in $FOLDER on a card that keeps its state there.
on_card() {
  (cd "$FOLDER" && ZARVO_VIRTUAL_CARD="state=$FOLDER/state" "${ON_CARD[@]}" "$@") >"$FOLDER/log" 2>&1 ||
    die "$*: $(cat "$FOLDER/log")"
}

# after_session COMMAND...: runs it on a card on which a PAL session with 704 pixels has ended.
after_session() {
  rm -f "$FOLDER/state"
  on_card ./session
  on_card "$@"
}

# expect_format FILE CODEC,WIDTH,HEIGHT
expect_format() {
  local got
  expect_decodes "$1"
  got=$(probe "$1")
  expect_equal "format of $1" "$2" "${got%,*}"
}

compile session 's/ZV_NTSC/ZV_PAL/; s/ZV_720/ZV_704/'
compile cif ''
compile d1 's/SCALE_ZV_CIF/SCALE_ZV_D1/'
compile careless 's/SCALE_ZV_CIF/SCALE_ZV_D1/; /zv_SetVideoStandard/d; /zv_SetResolution/d'

after_session ./cif
expect_format "$FOLDER/camera1.m4v" mpeg4,352,240
after_session ./d1
expect_format "$FOLDER/camera1.m4v" mpeg4,720,480
after_session "$ZARVO_RECORD" --seconds 2 --channels 1 --scale d1 --audio none
expect_format "$FOLDER/recordings/ch01.m4v" mpeg4,720,480

# A program that sets neither must fail: else the settings of the session do not reach the others.
after_session ./careless
expect "the card has kept nothing" test -n "$(decode_errors "$FOLDER/camera1.m4v")"

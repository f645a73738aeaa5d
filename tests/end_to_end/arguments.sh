#!/usr/bin/env bash
# Wrong arguments of zarvo_record, wrong options of the virtual card, no card, files that are there: the message
# says what is wrong (and what is possible), and the exit status says that it failed.
. "$(dirname "$0")/common.sh"

# refused STATUS PATTERN OPTION...: that status, the pattern on standard error, and nothing recorded.
refused() {
  local expected=$1 pattern=$2 status=0
  shift 2
  (cd "$FOLDER" && "${ON_CARD[@]}" "$ZARVO_RECORD" --seconds 1 "$@") >"$FOLDER/stdout" 2>"$FOLDER/stderr" || status=$?
  expect_equal "status of: $*" "$expected" "$status"
  expect "'$*' does not say '$pattern' but: $(cat "$FOLDER/stderr")" grep -q -- "$pattern" "$FOLDER/stderr"
  expect "'$*' recorded something" test ! -e "$FOLDER/recordings"
}

refused 2 "'5x' is not a number" --seconds 5x
refused 2 "'-1' is not a number" --seconds -1
refused 2 'number from 0 to 86400' --seconds 99999999999
refused 2 'number from 1 to 16' --channels 0
refused 2 'number from 1 to 16' --channels 1-17
refused 2 'runs backwards' --channels 5-3
refused 2 "'' is not a number" --channels 1,
refused 2 'number from 1 to 4' --audio 5
refused 2 'mjpeg, mpeg4' --codec h264
refused 2 'cif, d1, half-d1' --scale vga
refused 2 'ntsc, pal' --standard secam
refused 2 'is empty' --output ''
refused 2 "'stray' is not an option; possible are --seconds, " stray
refused 2 "'--frames' is not an option; possible are --seconds, " --frames
refused 2 "'-s' is not an option" -s 5
refused 2 'choose one channel' --output -
refused 2 'audio needs a folder' --output - --channels 1 --audio 1
refused 2 'requires an argument' --scale
refused 1 'frame-rate budget' --scale d1 --channels 1-5
refused 1 '/dev/null/x' --output /dev/null/x

# The recorder changes neither an existing file nor the target of a link that has the name of a file.
mkdir "$FOLDER/kept"
echo precious | tee "$FOLDER/precious" >"$FOLDER/kept/audio1.g726"
refused 1 'exists; --force overwrites it' --output kept
rm "$FOLDER/kept/audio1.g726"
ln -s ../precious "$FOLDER/kept/audio1.g726"
refused 1 'is a symbolic link' --output kept --force
expect_equal "files beside the link" audio1.g726 "$(ls "$FOLDER/kept")"
expect_equal "the file behind the link" precious "$(cat "$FOLDER/precious")"

# The card reports options that it does not understand, on standard error only.
for option in speed=fast lost=17 nonsense=1 camera3=/nowhere.mp4; do
  ZARVO_VIRTUAL_CARD=$option "${ON_CARD[@]}" "$ZARVO_RECORD" --seconds 1 --output "$FOLDER/card" \
    >"$FOLDER/stdout" 2>"$FOLDER/stderr" || true
  expect "the virtual card is silent about '$option': $(cat "$FOLDER/stderr")" \
    grep -q -- "${option%%=*}" "$FOLDER/stderr"
  expect "the virtual card prints on standard output" test -z "$(grep -i virtual "$FOLDER/stdout")"
done

# Without any card.
if ! real_card; then
  ON_CARD=(env)
  refused 1 'zv_Open failed with status 1' --channels 1
fi

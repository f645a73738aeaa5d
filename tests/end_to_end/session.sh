#!/usr/bin/env bash
# One session of an operator: choose CIF, record with the preview on, stop, open a recording. The files are
# complete, and the player gets the chosen path with its blanks and quotes.
. "$(dirname "$0")/common.sh"

mkdir -p "$FOLDER/work"
cat >"$FOLDER/work/Videoplayer" <<'SCRIPT'
#!/bin/sh
printf '%s\n' "$#" "$1" >player.log
SCRIPT
chmod +x "$FOLDER/work/Videoplayer"

set_clock '2026-03-03 14:10:00' # far from a change of the hour
# A link in the place of a recording: what it leads to must stay as it is, and the other channels must record.
echo precious >"$FOLDER/precious"
mkdir -p "$FOLDER/work/Data/Video/20260303/CH09"
ln -s "$FOLDER/precious" "$FOLDER/work/Data/Video/20260303/CH09/20260303-14.rec"
open_program
click btnPreviewStart
wait_preview
choose comboQualityMode 1
click radioEnAudio
click checkCh2
click btnRecordStart
wait_line kbps 4
click btnRecordStop
expect "the recordings stay open after Stop" wait_until 10 files_closed

mapfile -t files < <(find "$FOLDER/work/Data" -type f | sort)
expect_equal "recorded files" 16 "${#files[@]}"
expect_equal "the file behind the link" precious "$(cat "$FOLDER/precious")"
expect_decodes "${files[@]}"
expect_equal "channel folders" 20 "$(find "$FOLDER/work/Data" -type d -name 'CH*' | wc -l)"
header=$(find "$FOLDER/work/Data/Video" -path '*CH05*' -name '*.rec' -exec od -A n -t x1 -N 32 {} + | tr -d ' \n')
expect_equal "header of channel 5" \
  4d50473460010000f00000001e0000004368616e6e656c203500000000000000 "$header"

picked="$FOLDER/work/it's \$(a) film.rec"
cp "${files[-1]}" "$picked"
click btnPlayback
expect "no file dialog" wait_until 10 xdotool search --onlyvisible --name 'Choose a file to playback'
xdotool type --delay 10 -- "$picked"
xdotool key Return
expect "the player was not started" wait_until 10 test -s "$FOLDER/work/player.log"
expect_equal "arguments of the player" "1 $picked" "$(paste -s -d ' ' "$FOLDER/work/player.log")"

# The operator closes the dialog during a recording and a preview: the files must be complete and the program must end.
click btnRecordStart
wait_line kbps $(($(lines kbps) + 3))
end_program
expect_decodes "${files[@]}"
expect "the preview thread did not end by itself" grep -q 'Exit video thread' "$LOG"

#!/usr/bin/env bash
# What an operator does without thinking, on a screen with a window manager: turns the wheel, presses Space twice,
# presses Return, clicks while a player runs. And what of the dialog such a screen shows: with a dark theme, and
# on a screen that is too low for the form.
. "$(dirname "$0")/common.sh"

# pixels: a checksum of what the dialog shows above its last groups.
pixels() { import -silent -window "$DIALOG" -crop 728x670+0+0 rgb:- | cksum; }

# record_start: a checksum of Start in Record, which is disabled while a player runs.
record_start() {
  local x y
  read -r x y <<<"${WIDGET[btnRecordStart]}"
  import -silent -window "$DIALOG" -crop "80x20+$((x - 40))+$((y - 10))" rgb:- | cksum
}
reacts() { [ "$(record_start)" != "$blocked" ]; }

# value_of PROPERTY: what the dialog says about it after Set.
value_of() {
  local before
  before=$(lines "^$1 =")
  click btnSetProperty
  wait_line "^$1 =" $((before + 1)) 10
  sed -n "s/^$1 = //p" "$LOG" | tail -n 1
}

# point_at WIDGET: moves the mouse without a click.
# shellcheck disable=SC2086 # two numbers
point_at() { xdotool mousemove --sync --window "$DIALOG" ${WIDGET[$1]}; }

# on_screen SIZE: opens the program on a screen of this size; sets DIALOG_HEIGHT.
on_screen() {
  SCREEN=$1 # for open_display
  open_program
  eval "$(xdotool getwindowgeometry --shell "$DIALOG" | sed 's/^/DIALOG_/')"
}

# Players that wait until the test lets them end.
mkdir -p "$FOLDER/work/Data"
printf '#!/bin/sh\ntouch playing\nwhile [ ! -e played ]; do sleep 0.1; done\n' >"$FOLDER/work/Videoplayer"
chmod +x "$FOLDER/work/Videoplayer"
echo recording >"$FOLDER/work/a.rec"

on_screen 1680x1200
expect_equal "lines of the dialog on a large screen" 780 "$DIALOG_HEIGHT"
expect_equal "first line of the program" "Zarvo Demo AP: zv_Open Success, test count = 10" "$(head -n 1 "$LOG")"

# The wheel: a slider and a list without the focus stay as they are.
click edtFocus
point_at sliderHue
xdotool click --repeat 3 5
point_at comboQualityMode
xdotool click --repeat 2 5
expect_equal "hue after the wheel over its slider" 0 "$(value_of Hue)"
click btnRecordStart # disabled as long as the quality is None
click sliderHue
xdotool click --repeat 3 5
expect "the wheel does not move the slider that has the focus" test "$(value_of Hue)" -ne 0

# Return: presses the button that has the focus, and nothing from an edit.
count=$(lines '^Hue =')
xdotool key Return
wait_line '^Hue =' $((count + 1)) 10
click edtHue
xdotool key Return
value_of Hue >/dev/null
expect_equal "uses of Set: by Return on it and by a click, not by Return in the edit" $((count + 2)) "$(lines '^Hue =')"

# Space on Start, Space again.
click btnPreviewStart
wait_preview
focus_dialog
xdotool key space
expect "the second Space does not stop the preview" wait_until 20 preview_gone
focus_dialog
xdotool key space
wait_preview
focus_dialog
xdotool key space
expect "the third Space does not stop the preview" wait_until 20 preview_gone
expect_equal "recordings of a quality None" '' "$(find "$FOLDER/work/Data" -type f)"
choose comboQualityMode 1
click btnRecordStart
wait_line kbps 2
focus_dialog
xdotool key space
expect "Space after Start does not stop the recording" wait_until 20 files_closed

# A player blocks the program: what it shows is whole, and what is clicked and typed meanwhile is dropped.
click edtFocus
point_at btnPlayback
before=$(pixels)
click btnPlayback
wait_until 20 xdotool search --onlyvisible --name 'Choose a file to playback' || die "no file dialog"
xdotool type --delay 10 -- "$FOLDER/work/a.rec"
xdotool key Return
expect "the player was not started" wait_until 20 test -e "$FOLDER/work/playing"
expect_equal "the dialog while a player runs" "$before" "$(pixels)"
count=$(lines '^Hue =')
click btnSetProperty
xdotool key Return space
click btnSplit16
blocked=$(record_start)
touch "$FOLDER/work/played"
expect "the dialog does not react after the player has ended" wait_until 20 reacts
expect_equal "uses of Set after the player has ended" $((count + 1)) "$(value_of Hue >/dev/null && lines '^Hue =')"
end_program
close_display

# A dark theme on a low screen: all of the dialog is on the screen, on a light ground.
dark_theme "$FOLDER"
on_screen 1366x768
picture "$DIALOG" "$FOLDER/dark.png"
expect "the dialog is $DIALOG_HEIGHT lines high, too many for a screen of 768" test "$DIALOG_HEIGHT" -lt 740
expect "a smaller dialog than the screen requires: $DIALOG_HEIGHT" test "$DIALOG_HEIGHT" -gt 700
expect "the ground is not light" test "$(convert "$FOLDER/dark.png" -crop 1x1+2+2 -colorspace gray -format '%[fx:mean > 0.8]' info:)" = 1
end_program
close_display

# On a dense screen the dialog grows with the scale.
for scale in 150 200; do
  export QT_SCALE_FACTOR=$((scale / 100)).$((scale % 100))
  on_screen 2560x1800
  picture "$DIALOG" "$FOLDER/scale-$scale.png"
  expect "the dialog is $DIALOG_HEIGHT lines high at $scale %" test "$DIALOG_HEIGHT" -ge $((780 * scale / 100))
  end_program
  for style in fusion windows; do
    QT_STYLE_OVERRIDE=$style "$ZARVO_BUILD/tests/app/test_dialog" --gtest_filter='DialogTest.ClipsNothing*:DialogTest.EveryText*' \
      >"$FOLDER/clips" 2>&1 || die "text is clipped in the style $style at $scale %: $(cat "$FOLDER/clips")"
  done
  close_display
done

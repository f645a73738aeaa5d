#!/usr/bin/env bash
# Clicks Start and Stop of the preview 50 times, as fast as xdotool can click. Catches: a lost Stop, or a
# second thread in SDL, which leaves a window, hangs the dialog or crashes the program.
. "$(dirname "$0")/common.sh"

open_program
storm=()
for ((n = 0; n < 50; ++n)); do
  for button in btnPreviewStart btnPreviewStop; do
    # shellcheck disable=SC2206 # two numbers
    storm+=(mousemove --window "$DIALOG" ${WIDGET[$button]} click 1)
  done
done
xdotool "${storm[@]}"
click btnPreviewStop # the last click may have come while the button was disabled
expect "a preview window is left" wait_until 30 preview_gone
click btnPreviewStart
wait_preview
click btnPreviewStop
expect "the preview window does not close" wait_until 30 preview_gone
end_program
expect_equal "preview threads started and ended" "$(lines 'Exit video thread')" "$(lines 'Start video thread')"

# shellcheck shell=bash
# A scripted operator, made with xdotool: it opens the demo application on a display of its own, clicks
# widgets by their object names, waits for lines and windows, and takes screenshots. To be sourced after
# common.sh, not run. The caller sets PROGRAM, CARD and WIDGET_MAP to the built files.

OPERATOR_FOLDER=   # display number and logs; removed at the end
DIALOG=            # X window of the dialog
declare -A WIDGET=()  # object name to "x y" in the dialog

# open_display: starts an X server with an invisible screen (SCREEN, or 1680x1200), and a window manager on it.
open_display() {
  OPERATOR_FOLDER=$(mktemp -d)
  trap close_display EXIT
  Xvfb -displayfd 3 -screen 0 "${SCREEN:-1680x1200}x24" -nolisten tcp 3>"$OPERATOR_FOLDER/display" >"$OPERATOR_FOLDER/xvfb.log" 2>&1 &
  XVFB=$!
  wait_until 120 test -s "$OPERATOR_FOLDER/display" || die "Xvfb did not start: $(cat "$OPERATOR_FOLDER/xvfb.log")"
  DISPLAY=:$(cat "$OPERATOR_FOLDER/display")
  export DISPLAY QT_QPA_PLATFORM=xcb SDL_VIDEODRIVER=x11 XDG_RUNTIME_DIR=$OPERATOR_FOLDER
  openbox >"$OPERATOR_FOLDER/openbox.log" 2>&1 &
  OPENBOX=$!
  wait_until 120 window_manager_runs || die "openbox did not start"
}

# Windows that appear before the window manager is ready may stay hidden.
window_manager_runs() { [[ $(xprop -root _NET_SUPPORTING_WM_CHECK) == *"window id"* ]]; }

close_display() {
  trap - EXIT
  local process
  for process in "${DEMO:-}" "${OPENBOX:-}" "${XVFB:-}"; do
    [ -z "$process" ] || kill "$process" 2>/dev/null || true
  done
  wait 2>/dev/null || true
  rm -rf "$OPERATOR_FOLDER"
}

# start_program FOLDER: starts the demo application in that working directory; its output goes to FOLDER/output.log.
start_program() {
  LOG=$1/output.log
  use_card "$CARD"
  [ ${#WIDGET[@]} -gt 0 ] || read_widget_map
  (cd "$1" && exec "${ON_CARD[@]}" "$PROGRAM") >"$LOG" 2>&1 &
  DEMO=$!
  wait_until 120 dialog_shown || die "the dialog did not appear: $(cat "$LOG")"
  xdotool windowmove "$DIALOG" 20 40
  focus_dialog
}

dialog_shown() { DIALOG=$(xdotool search --onlyvisible --name '^Tarn Demo$' | head -n 1) && [ -n "$DIALOG" ]; }

# The positions depend on fonts and style, so widget_map reads them from the same dialog on the same display.
read_widget_map() {
  local name x y
  while read -r name x y; do WIDGET[$name]="$x $y"; done < <("${ON_CARD[@]}" "$WIDGET_MAP" 2>/dev/null | sed -n 's/^widget //p')
  [ ${#WIDGET[@]} -gt 0 ] || die "$WIDGET_MAP printed no widget positions"
}

focus_dialog() { xdotool windowactivate --sync "$DIALOG"; }

# click WIDGET
click() {
  [ -n "${WIDGET[$1]:-}" ] || die "the dialog has no widget $1"
  # shellcheck disable=SC2086 # two numbers
  xdotool windowactivate --sync "$DIALOG" mousemove --sync --window "$DIALOG" ${WIDGET[$1]} click 1
}

# choose COMBO INDEX: opens the list and chooses the item with the arrow keys.
choose() {
  local keys=(Home) n
  WINDOWS=$(program_windows)
  for ((n = 0; n < $2; ++n)); do keys+=(Down); done
  click "$1"
  wait_until 120 popup_shown || die "the list of $1 did not open"
  xdotool key --delay 30 "${keys[@]}" Return
  wait_until 120 popup_gone || die "the list of $1 did not close"
}

# A popup is one more visible window of the program.
popup_shown() { [ "$(program_windows)" -gt "$WINDOWS" ]; }
popup_gone() { [ "$(program_windows)" -le "$WINDOWS" ]; }
program_windows() { xdotool search --onlyvisible --class zarvo_demo 2>/dev/null | wc -l; }

# enter EDIT TEXT: replaces the text of a line edit.
enter() {
  click "$1"
  xdotool key ctrl+a type --delay 5 -- "$2"
}

# wait_line PATTERN [COUNT [SECONDS]]: waits until the program has printed that many lines with the pattern.
wait_line() { wait_until "${3:-120}" has_lines "$1" "${2:-1}" || die "the program did not print '$1': $(tail -n 5 "$LOG")"; }
has_lines() { [ "$(grep -c -- "$1" "$LOG")" -ge "$2" ]; }
lines() { grep -c -- "$1" "$LOG"; }

# wait_preview: waits until the preview window exists and its caption shows a rate; sets PREVIEW to the window.
wait_preview() {
  wait_until 120 preview_shown || die "no preview window appeared: $(tail -n 5 "$LOG")"
  xdotool windowmove "$PREVIEW" 780 40 2>/dev/null
  wait_until 120 preview_runs || die "the preview shows no pictures"
}
preview_shown() { PREVIEW=$(xdotool search --onlyvisible --name '^Preview' | head -n 1) && [ -n "$PREVIEW" ]; }
preview_gone() { ! preview_shown; }
preview_runs() { [[ $(preview_caption) =~ ^Preview\ FPS\ :\ [1-9] ]]; }
preview_caption() { xdotool getwindowname "$PREVIEW"; }

# preview_rate: the pictures of the last second, as the caption shows.
preview_rate() { preview_caption | sed 's/.*: //'; }

# picture WINDOW FILE: a screenshot of a window, or of the whole screen for "root".
picture() { import -silent -window "$1" "$2" && printf '  saved %s\n' "$2"; }

# close_program: closes the dialog; sets STATUS to the program's exit status.
# shellcheck disable=SC2034 # STATUS is for the caller
close_program() {
  focus_dialog
  xdotool key alt+F4
  wait_until 120 process_gone "$DEMO" || die "the program did not end after its dialog was closed"
  STATUS=0
  wait "$DEMO" || STATUS=$?
  DEMO=
}
process_gone() { ! kill -0 "$1"; }

# rate_near RATE: whether the caption shows that rate, plus or minus 2. The first rate after a change of the
# layout may be too low.
rate_near() { local rate; rate=$(preview_rate) && [ "$rate" -ge $(($1 - 2)) ] && [ "$rate" -le $(($1 + 2)) ]; }

# files_closed: whether the program has closed all its recordings.
files_closed() { [ -z "$(find "/proc/$DEMO/fd" -lname '*.rec')" ]; }

# dark_theme FOLDER: lets programs that start from now on use a dark theme, which it writes to the folder.
dark_theme() {
  local group
  for group in Window View Button Tooltip Selection; do
    printf '[Colors:%s]\nBackgroundNormal=35,38,41\nBackgroundAlternate=49,54,59\nForegroundNormal=239,240,241\n' "$group"
    printf 'ForegroundLink=41,128,185\nForegroundVisited=127,140,141\n\n'
  done >"$1/kdeglobals"
  export XDG_CURRENT_DESKTOP=KDE KDE_FULL_SESSION=true KDE_SESSION_VERSION=5 XDG_CONFIG_HOME=$1
}

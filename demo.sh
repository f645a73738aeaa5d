#!/usr/bin/env bash
# Shows the whole system on this machine. See usage() below.
[ -n "${BASH_VERSION:-}" ] || exec bash "$0" "$@" # started as "sh demo.sh"
set -euo pipefail
# shellcheck source=tools/common.sh
. "$(dirname "${BASH_SOURCE[0]}")/tools/common.sh"
# shellcheck source=tools/streams.sh
. "$ZARVO_ROOT/tools/streams.sh"
# shellcheck source=tools/operator.sh
. "$ZARVO_ROOT/tools/operator.sh"

usage() {
  cat <<'TEXT'
Usage: ./demo.sh                      with a display: open the program; without: record, then tour
       ./demo.sh window               open the program
       ./demo.sh record [OPTION...]   record without the program; the options are those of zarvo_record
       ./demo.sh tour                 let a scripted operator use the program on an invisible display

Uses the card of this machine if there is one (/dev/zarvo_enc0), otherwise the virtual card.
Installs missing packages, builds, and writes its results to build/demo.
TEXT
}

BUILD=${ZARVO_BUILD:-$ZARVO_ROOT/build/product} # test.sh names a folder where everything is built
RESULTS=$ZARVO_ROOT/build/demo
SHOTS=$RESULTS/screenshots
TOUR=$RESULTS/tour # the scripted operator's working directory; the user's recordings are in $RESULTS/Data
CARD=$BUILD/virtual_card/libzarvo_virtual_card.so
PROGRAM=$BUILD/app/zarvo_demo
WIDGET_MAP=$BUILD/tools/widget_map

prepare() {
  if [ -z "${ZARVO_BUILD:-}" ]; then
    install_missing "Installing and building take about 5 minutes on two cores." demo
    say "Building in $BUILD; the first time this takes minutes"
    build product zarvo_record zarvo_motion zarvo_card zarvo_demo zarvo_virtual_card Videoplayer Audioplayer widget_map
  fi
  use_card "$CARD"
  if [[ $ZARVO_ROOT == /tmp/zarvo-* ]]; then say "Some tools cannot deal with the name of this folder: using the link $ZARVO_ROOT"; fi
  mkdir -p "$RESULTS"
  if real_card; then say "Using the card of this machine"; else say "No card here: using the virtual card"; fi
}

# prepare_working_folder FOLDER: the program expects the players and the folder Data in its working directory.
prepare_working_folder() {
  mkdir -p "$1/Data"
  cp "$BUILD/programs/players/Videoplayer" "$BUILD/programs/players/Audioplayer" "$1/"
}

run_window() {
  prepare_working_folder "$RESULTS"
  say "Opening the program in $RESULTS; its recordings go to $RESULTS/Data. Close the dialog to end."
  cd "$RESULTS"
  exec "${ON_CARD[@]}" "$PROGRAM"
}

run_record() {
  local log=$RESULTS/record.log pictures=$RESULTS/record/pictures status=0 line file frames files=() saved=()
  case " $* " in *" -h "* | *" --help "* | *" --version "*) exec "$BUILD/examples/zarvo_record" "$@" ;; esac
  say "Recording without the program: zarvo_record --seconds 5 $*"
  rm -rf "$RESULTS/record"
  "${ON_CARD[@]}" "$BUILD/examples/zarvo_record" --seconds 5 --output "$RESULTS/record" "$@" 2>&1 | tee "$log" || status=$?
  case $status in
    0) ;;
    3) slow "$(missing_frames "$log")" ;;
    *)
      fail "zarvo_record ended with status $status"
      return
      ;;
  esac
  mapfile -t files < <(sed -nE 's/: [0-9]+ (frames|blocks), [0-9]+ bytes, .*//p' "$log")

  say "What ffprobe and ffmpeg say about each file (codec, width, height, frames; audio: codec, rate, blocks)"
  report_streams "${files[@]}" || FAILED=1
  mkdir -p "$pictures"
  while read -r line; do
    [[ $line =~ ^(.*):\ ([0-9]+)\ frames,\ [0-9]+\ bytes, ]] || continue
    file=${BASH_REMATCH[1]} frames=${BASH_REMATCH[2]}
    [ "$frames" -gt 0 ] || continue # report_streams has told
    [ "$(decoded_frames "$file")" = "$frames" ] || fail "$file: not all of its $frames frames decode"
    saved+=("$pictures/$(basename "$file").png")
    save_frame "$file" "$((frames / 2))" "${saved[-1]}" || fail "$file: no frame to save"
  done <"$log"
  [ ${#saved[@]} -gt 0 ] || return 0
  montage "${saved[@]}" -geometry 352x240+2+2 "$RESULTS/record/frames.png"
  echo "A frame of each channel: $RESULTS/record/frames.png"
}

# missing_frames LOG: how many frames of how many the tallies of zarvo_record miss.
missing_frames() {
  awk '/ frames, .*expected [0-9]+, missing [0-9]+/ {
    sub(/.*, expected /, ""); expected += $1; sub(/.*missing /, ""); missing += $1
  } END { printf "%d of %d frames are missing", missing, expected }' "$1"
}

# shot NAME [WINDOW]: a screenshot of the window (or the whole screen), and one frame of the tour.
shot() {
  picture "${2:-root}" "$SHOTS/$1.png"
  STEP=$((STEP + 1))
  import -silent -window root -crop 1530x890+0+0 +repage -resize 60% "$SHOTS/tour-$(printf '%02d' "$STEP").png"
}

# expect_rate RATE: notes if the preview is slower. The first second of a layout may be short.
expect_rate() { wait_until 5 rate_near "$1" || slow "the preview shows $(preview_rate) pictures a second, not $1"; }

tour_preview() {
  local split
  say "Preview in all six splits"
  click btnPreviewStart
  wait_preview
  for split in 1 4 6 8 9 16; do
    click "btnSplit$split"
    sleep 1.2 # until the screenshot shows the new layout
    shot "preview-split-$split" "$PREVIEW"
    expect_rate 30
  done
  echo "  caption: $(preview_caption)"
}

tour_panels() {
  say "Hue of camera 6, a mask on camera 11, motion marks, focus on camera 5"
  choose comboProperty 5
  enter edtHue 90
  click btnSetProperty
  choose comboShield 10
  enter edtLeft 160
  enter edtTop 120
  enter edtRight 560
  enter edtBottom 360
  click btnSetShield
  sleep 1
  shot preview-hue-and-mask "$PREVIEW"
  click btnMotionStart
  sleep 1.5
  shot preview-motion "$PREVIEW"
  click btnMotionStop
  click btnSplit6
  enter edtFocus 5
  click btnSetFocus
  sleep 1
  shot preview-focus-5 "$PREVIEW"
  click btnPreviewStop
  wait_until 120 preview_gone || fail "the preview window did not close"
}

tour_pal() {
  say "The same in PAL"
  click radioPAL
  click btnSplit16
  click btnPreviewStart
  wait_preview
  expect_rate 25
  echo "  caption: $(preview_caption)"
  shot preview-pal "$PREVIEW"
  click btnPreviewStop
  wait_until 120 preview_gone || fail "the preview window did not close"
  click radioNTSC
}

tour_recording() {
  local files=()
  say "Recording 16 CIF channels and 2 audio inputs, with the preview on"
  click btnPreviewStart
  wait_preview
  choose comboQualityMode 1
  click radioEnAudio
  click checkCh1
  click checkCh2
  shot dialog-quality-chosen "$DIALOG"
  click btnRecordStart
  wait_line kbps 6
  shot dialog-recording "$DIALOG"
  click btnRecordStop
  wait_until 120 files_closed || fail "the recordings stay open after Stop"
  click btnPreviewStop
  wait_until 120 preview_gone || fail "the preview window did not close"

  say "The recorded files: header, contents (codec, width, height, frames) and ffmpeg's verdict"
  mapfile -t files < <(find "$TOUR/Data" -name '*.rec' -o -name '*.aud' | sort)
  [ ${#files[@]} -eq 18 ] || fail "${#files[@]} files instead of 16 video and 2 audio files"
  report_streams "${files[@]}" || FAILED=1
}

tour_playback() {
  local file chooser player
  say "Playing a recording"
  file=$(find "$TOUR/Data" -path '*CH07*' -name '*.rec' -print -quit)
  click btnPlayback
  wait_until 120 xdotool search --onlyvisible --name 'Choose a file to playback' || die "no file dialog appeared"
  chooser=$(xdotool search --onlyvisible --name 'Choose a file to playback' | head -n 1)
  shot playback-chooser "$chooser"
  xdotool windowactivate --sync "$chooser" type --delay 5 -- "$file"
  xdotool key Return
  wait_until 120 xdotool search --onlyvisible --name "^Channel 7 - ${file##*/}" || die "no player appeared"
  player=$(xdotool search --onlyvisible --name "^Channel 7 - ${file##*/}" | head -n 1)
  sleep 0.5 # until the player shows the first picture
  shot player "$player"
  wait_until 120 player_gone "$file" || fail "the player does not end"
}
player_gone() { ! xdotool search --onlyvisible --name "^Channel 7 - ${1##*/}"; }

# The dialog with a font of 125 %, as it opens and enlarged by hand.
tour_sizes() {
  say "The dialog with a font of 125 %, and enlarged"
  QT_FONT_DPI=120 start_program "$TOUR"
  shot dialog-125-percent "$DIALOG"
  xdotool windowsize --sync "$DIALOG" 1500 950
  sleep 0.5 # until the dialog is repainted
  shot dialog-enlarged "$DIALOG"
  close_program
}

# The dialog with a dark theme on a screen that is lower than the dialog: light, and smaller.
tour_dark() {
  say "The dialog with a dark theme on a screen of 1366 x 768"
  mkdir -p "$TOUR/dark"
  (
    dark_theme "$TOUR/dark"
    SCREEN=1366x768 # for open_display
    open_display
    start_program "$TOUR"
    picture "$DIALOG" "$SHOTS/dialog-dark-theme.png"
    close_display # ends the program too
  )
}

run_tour() {
  local losses
  say "A scripted operator uses the program on an invisible display"
  rm -rf "$TOUR" "$SHOTS"
  mkdir -p "$SHOTS"
  prepare_working_folder "$TOUR"
  STEP=0
  open_display
  start_program "$TOUR"
  shot dialog "$DIALOG"
  tour_preview
  tour_panels
  tour_pal
  tour_recording
  tour_playback
  close_program
  [ "$STATUS" -eq 0 ] || fail "the program ended with status $STATUS"
  ! losses=$(grep '^virtual card: .* lost' "$LOG") || slow "$losses"
  tour_sizes
  close_display
  tour_dark

  say "Picture-in-picture and zoom, with the example zarvo_motion"
  "${ON_CARD[@]}" "$BUILD/examples/zarvo_motion" "$RESULTS/zoom" || fail "zarvo_motion failed"
  mogrify -format png "$RESULTS"/zoom/*.ppm
  convert -delay 120 -loop 0 "$SHOTS"/tour-*.png -layers optimize -colors 128 "$SHOTS/tour.gif"
  rm "$SHOTS"/tour-*.png
}

fail() {
  printf 'FAILED: %s\n' "$*" >&2
  FAILED=1
}

# slow WHAT: all is right but late; the demo goes on.
slow() {
  printf 'SLOW: %s\n' "$*"
  SLOW=1
}

finish() {
  say "Results are in $(cd -P "$RESULTS" && pwd)"
  [ -z "${1:-}" ] || printf '%s\n' "$@"
  if [ "$FAILED" -ne 0 ]; then
    echo "Something failed: see the lines with FAILED above." >&2
    exit 1
  fi
  if [ "$SLOW" -eq 0 ]; then
    echo "Everything worked."
  elif real_card; then
    echo "Everything worked, but frames are missing: see the lines with SLOW above. The machine or its disk is too slow."
  else
    echo "Everything worked, but this machine was too slow to be sixteen cameras too: see the lines with SLOW above."
    echo "End other programs, or record fewer channels: ./demo.sh record --channels 1-4"
  fi
}

FAILED=0
SLOW=0
mode=${1:-all}
[ $# -eq 0 ] || shift
case $mode in
  all | record | tour | window) ;;
  -h | --help | help)
    usage
    exit 0
    ;;
  *)
    usage >&2
    die "'$mode' is not one of record, tour and window"
    ;;
esac
display=${DISPLAY:-}${WAYLAND_DISPLAY:-}
if [ "$mode" = all ] && [ -n "$display" ]; then mode=window; fi
if [ "$mode" = window ] && [ -z "$display" ]; then die "there is no display for the window; try ./demo.sh tour"; fi

prepare
case $mode in
  window) run_window ;;
  record) run_record "$@" ;;
  tour) run_tour ;;
  all)
    run_record
    run_tour
    ;;
esac
finish "  recordings    record/ (zarvo_record), tour/Data/ (the scripted operator)" \
  "  screenshots   screenshots/, zoom/" "  program's log tour/output.log"

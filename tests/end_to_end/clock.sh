#!/usr/bin/env bash
# A recording across the change of the hour, or of the day, with the wall clock moved by libfaketime:
# each channel has two files, both decode, and the change is printed once.
. "$(dirname "$0")/common.sh"

case $1 in
  hour) change='2026-03-03 15:00:00' before=20260303/CH%02d/20260303-14 after=20260303/CH%02d/20260303-15 ;;
  day) change='2026-03-04 00:00:00' before=20260303/CH%02d/20260303-23 after=20260304/CH%02d/20260304-00 ;;
esac

set_clock "$change 10 minutes ago"

open_program
choose comboQualityMode 1
click radioEnAudio
click checkCh1
enter edtTime 1
click btnFolder
set_clock "$change 6 seconds ago"
click btnRecordStart
wait_line 'Hour changed' 1 60
wait_line kbps $(($(lines kbps) + 5)) 60
click btnRecordStop
expect "the recordings stay open after Stop" wait_until 10 files_closed
end_program

expect_equal "lines about the change" 1 "$(lines 'Hour changed')"
data=$FOLDER/work/Data
files=()
for channel in {1..16}; do
  for name in "$before" "$after"; do
    # shellcheck disable=SC2059 # the names are patterns
    files+=("$data/Video/$(printf "$name" "$channel").rec")
  done
done
for name in "$before" "$after"; do
  # shellcheck disable=SC2059
  files+=("$data/Audio/$(printf "$name" 1).aud")
done
expect_decodes "${files[@]}"
expect_equal "all files" "${#files[@]}" "$(find "$data" -type f | wc -l)"

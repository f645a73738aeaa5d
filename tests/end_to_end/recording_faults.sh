#!/usr/bin/env bash
# While the dialog records, the disk fills up, its folders vanish, or the root becomes read-only. The dialog
# keeps running and prints the lines it must, and no recording stays open.
. "$(dirname "$0")/common.sh"

if ! { [ "$(id -u)" -eq 0 ] && mkdir "$FOLDER/disk" && mount -t tmpfs -o size=8m tmpfs "$FOLDER/disk" 2>/dev/null; }; then
  echo "skipped: no right to mount a small disk"
  exit 77
fi
unmount_and_clean_up() {
  [ -z "$OPERATOR_FOLDER" ] || close_display
  umount -l "$FOLDER/disk"
  rm -rf "$FOLDER"
}

# use_root FOLDER: enters it as the operator does, with a check of the disk every second.
use_root() {
  enter edtRecordPath "$1"
  enter edtTime 1
  click btnFolder
}

set_clock '2026-03-03 14:10:00' # far from a change of the hour
open_program
trap unmount_and_clean_up EXIT
choose comboQualityMode 1

# Starts with more than 10 % free; the recording itself and a file beside it fill the disk to the last block.
use_root "$FOLDER/disk"
click btnRecordStart
wait_line kbps 1
head -c 16m /dev/zero >"$FOLDER/disk/filler" 2>/dev/null || true
wait_line '^No enough disk space$' 1
expect "recordings stay open on a full disk" wait_until 10 files_closed
click btnRecordStart
wait_line '^No enough disk space$' 2
rm "$FOLDER/disk/filler"

# The whole tree vanishes during a recording, with the root.
mkdir "$FOLDER/vanishing"
use_root "$FOLDER/vanishing"
click btnRecordStart
wait_line kbps $(($(lines kbps) + 2))
rm -r "$FOLDER/vanishing"
wait_line '^No enough disk space$' 3
expect "recordings of a deleted root stay open" wait_until 10 files_closed

# The root becomes read-only during a recording: no file can be opened at the change of the hour. At the next
# change the root is writable again, and all files can be opened.
rm -r "$FOLDER"/disk/*
use_root "$FOLDER/disk"
click btnRecordStart
wait_line kbps $(($(lines kbps) + 2))
mount --bind "$FOLDER/disk" "$FOLDER/disk"
mount -o remount,bind,ro "$FOLDER/disk"
set_clock '2026-03-03 15:10:00'
wait_line '^Hour changed$' 1
wait_line '^WriteEnableCh' $(($(lines '^WriteEnableCh') + 1)) # started again after the pause
expect "recordings are open on a root that turned read-only" files_closed
umount "$FOLDER/disk"
set_clock '2026-03-03 16:10:00'
wait_line '^Hour changed$' 2
wait_line kbps $(($(lines kbps) + 2))
click btnRecordStop
expect_equal "files of the two hours that could be written" 32 "$(find "$FOLDER/disk" -name '*.rec' -size +0 | wc -l)"

# Catches: a crash when a read-only disk leaves the program without any file.
rm -r "$FOLDER"/disk/*
mount -o remount,ro "$FOLDER/disk"
use_root "$FOLDER/disk"
click btnRecordStart
wait_line 'Disk free percentage' $(($(lines 'Disk free percentage') + 3))
expect_equal "files on a read-only disk" 0 "$(find "$FOLDER/disk" -type f | wc -l)"
click btnRecordStop

# Back to a good root: the dialog still records.
use_root "$FOLDER/work/Data"
click btnRecordStart
wait_line kbps $(($(lines kbps) + 2))
click btnRecordStop
expect "the recordings stay open after Stop" wait_until 10 files_closed
mapfile -t files < <(find "$FOLDER/work/Data" -name '*.rec')
expect_equal "files in the good root" 16 "${#files[@]}"
expect_decodes "${files[@]}"
end_program

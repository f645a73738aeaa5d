#!/usr/bin/env bash
# The disk fills up, or its folders vanish, while the dialog records; and a root that cannot be written.
# The dialog lives on and says what it must, and no descriptor stays open.
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

# use_root FOLDER: as the operator enters it, with a look at the disk every second.
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

# The whole tree vanishes under a running recording, the root included.
mkdir "$FOLDER/vanishing"
use_root "$FOLDER/vanishing"
click btnRecordStart
wait_line kbps $(($(lines kbps) + 2))
rm -r "$FOLDER/vanishing"
wait_line '^No enough disk space$' 3
expect "recordings of a deleted root stay open" wait_until 10 files_closed

# The root turns read-only under a running recording: nothing can be opened at the change of the hour, and
# everything at the next one, when it can be written again.
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

# Nothing can be made on a read-only disk: no file, and no crash on the missing ones.
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

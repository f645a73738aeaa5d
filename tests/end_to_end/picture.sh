#!/usr/bin/env bash
# The operator changes the hue of camera 6 and masks camera 7. Three cameras show the same plain red film, so
# every difference in the decoded recordings (MPEG-4 and Motion JPEG) comes from these two settings.
. "$(dirname "$0")/common.sh"

ffmpeg -nostdin -v error -f lavfi -i color=0xC03030:s=320x240:r=10:d=2 -pix_fmt yuv420p "$FOLDER/red.mp4"
export ZARVO_VIRTUAL_CARD="camera5=$FOLDER/red.mp4;camera6=$FOLDER/red.mp4;camera7=$FOLDER/red.mp4"

# colour PICTURE GEOMETRY: prints the mean colour of a rectangle.
colour() {
  local red green blue
  read -r red green blue < <(convert "$1" -crop "$2" +repage -format \
    '%[fx:round(255*mean.r)] %[fx:round(255*mean.g)] %[fx:round(255*mean.b)]\n' info:)
  if ((red > 130 && green < 90 && blue < 90)); then echo red
  elif ((green > 100 && red < 90 && blue < 60)); then echo green
  elif ((red == green && green == blue)); then echo grey
  else echo "$red,$green,$blue"; fi
}

# recording CAMERA: prints the path of its file.
recording() { find "$FOLDER/work/Data/Video" -path "*CH0$1*" -name '*.rec'; }

# enough_recorded: whether the file has the frame to compare. (For Motion JPEG the program prints no kbps line.)
enough_recorded() { [ "$(decoded_frames "$(recording 7)")" -gt 20 ]; }

# record_and_look CODEC: records with item CODEC of the list, decodes a frame of each camera.
record_and_look() {
  local camera file
  rm -rf "$FOLDER/work/Data"/*
  choose comboCodec "$1"
  click btnRecordStart
  expect "too few frames are recorded" wait_until 20 enough_recorded
  click btnRecordStop
  expect "the recordings stay open after Stop" wait_until 10 files_closed
  for camera in 5 6 7; do
    file=$(recording "$camera")
    expect_decodes "$file"
    save_frame "$file" 20 "$FOLDER/$camera.png"
  done
  for camera in 5 7; do
    expect_equal "corner of camera $camera" red "$(colour "$FOLDER/$camera.png" 64x44+8+8)"
  done
  expect_equal "middle of camera 5" red "$(colour "$FOLDER/5.png" 184x104+84+68)"
  expect_equal "masked middle of camera 7" grey "$(colour "$FOLDER/7.png" 184x104+84+68)"
  expect_equal "camera 6 with another hue" green "$(colour "$FOLDER/6.png" 336x224+8+8)"
}

set_clock '2026-03-03 14:10:00' # far from a change of the hour
open_program
choose comboProperty 5
enter edtHue 90
click btnSetProperty
wait_line 'Hue = 90'
choose comboShield 6
for edge in Left=160 Top=120 Right=560 Bottom=360; do enter "edt${edge%=*}" "${edge#*=}"; done
click btnSetShield
choose comboQualityMode 1
record_and_look 0
record_and_look 1
end_program
expect "the card has refused a setting" test "$(lines ERROR)" = 0

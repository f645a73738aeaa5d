#!/usr/bin/env bash
# zarvo_motion: moving cameras are tagged, a lost one is not, and the pictures of picture-in-picture
# and zoom differ from the plain one where they must and nowhere else.
. "$(dirname "$0")/common.sh"

ZARVO_VIRTUAL_CARD="lost=2" "${ON_CARD[@]}" "$ZARVO_MOTION" "$FOLDER" >"$FOLDER/log"
for camera in 1 2 16; do
  sed -nE "s/^camera +$camera: motion in ([0-9]+) of .*/\\1/p" "$FOLDER/log" >"$FOLDER/camera$camera"
done
expect "camera 1 moves and is never tagged" test "$(cat "$FOLDER/camera1")" -gt 0
expect "camera 16 moves and is never tagged" test "$(cat "$FOLDER/camera16")" -gt 0
expect_equal "frames of the lost camera 2 with motion" 0 "$(cat "$FOLDER/camera2")"

# difference PICTURE GEOMETRY: mean difference to the plain picture in a rectangle, 0 to 100.
difference() {
  convert "$FOLDER/plain.ppm" "$FOLDER/$1.ppm" -crop "$2" +repage -compose difference -composite \
    -format '%[fx:round(100*mean)]' info:
}
expect "no picture-in-picture at its place" test "$(difference picture-in-picture 240x160+456+24)" -ge 10
expect "picture-in-picture has changed the rest" test "$(difference picture-in-picture 240x160+24+296)" -le 4
expect "picture-in-picture has not moved" test "$(difference picture-in-picture-moved 240x160+24+296)" -ge 10
expect "zoom shows the plain picture" test "$(difference zoom 720x480+0+0)" -ge 10

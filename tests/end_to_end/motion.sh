#!/usr/bin/env bash
# zarvo_motion tags moving cameras, drawn ones and films; it tags neither a lost camera nor a still film. Its
# pictures of picture-in-picture and zoom differ from the plain picture where they must and nowhere else.
. "$(dirname "$0")/common.sh"

ffmpeg -nostdin -v error -f lavfi -i testsrc2=s=320x240:r=25:d=2 -pix_fmt yuv420p "$FOLDER/moving.mp4"
ffmpeg -nostdin -v error -f lavfi -i smptebars=s=320x240:r=25:d=2 -pix_fmt yuv420p "$FOLDER/still.mp4"
ZARVO_VIRTUAL_CARD="lost=2;camera3=$FOLDER/moving.mp4;camera4=$FOLDER/still.mp4" \
  "${ON_CARD[@]}" "$ZARVO_MOTION" "$FOLDER" >"$FOLDER/log"
# tagged CAMERA: how many of its frames carry the motion flag.
tagged() { sed -nE "s/^camera +$1: motion in ([0-9]+) of .*/\\1/p" "$FOLDER/log"; }
for camera in 1 3 16; do expect "camera $camera moves and is never tagged" test "$(tagged "$camera")" -gt 0; done
expect_equal "frames of the lost camera 2 with motion" 0 "$(tagged 2)"
expect_equal "frames of the still camera 4 with motion" 0 "$(tagged 4)"

# difference PICTURE GEOMETRY: mean difference to the plain picture in a rectangle, 0 to 100.
difference() {
  convert "$FOLDER/plain.ppm" "$FOLDER/$1.ppm" -crop "$2" +repage -compose difference -composite \
    -format '%[fx:round(100*mean)]' info:
}
expect "no picture-in-picture at its place" test "$(difference picture-in-picture 240x160+456+24)" -ge 10
expect "picture-in-picture has changed the rest" test "$(difference picture-in-picture 240x160+24+296)" -le 4
expect "picture-in-picture has not moved" test "$(difference picture-in-picture-moved 240x160+24+296)" -ge 10
expect "zoom shows the plain picture" test "$(difference zoom 720x480+0+0)" -ge 10

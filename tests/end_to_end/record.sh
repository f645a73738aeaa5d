#!/usr/bin/env bash
# zarvo_record on the virtual card in real time: every file decodes without an error line and has the
# picture size of the options and 150 frames (PAL: 125) for 5 seconds.
. "$(dirname "$0")/common.sh"

# case: options | files | codec,width,height | frames
case $1 in
  mpeg4) row='|16|mpeg4,352,240|150' ;;
  mjpeg) row='--codec mjpeg|16|mjpeg,352,240|150' ;;
  d1) row='--scale d1 --channels 1-4|4|mpeg4,720,480|150' ;;
  half_d1) row='--scale half-d1 --channels 3,5-11|8|mpeg4,720,240|150' ;;
  pal) row='--standard pal|16|mpeg4,352,288|125' ;;
  mjpeg_d1_pal) row='--codec mjpeg --scale d1 --standard pal|4|mjpeg,720,576|125' ;;
  film) row='--channels 2,3|2|mpeg4,352,240|150' ;;
esac
IFS='|' read -r options files format frames <<<"$row"

# A film that looks like no drawn camera: plain green.
if [ "$1" = film ]; then
  ffmpeg -nostdin -v error -f lavfi -i color=0x00C000:s=320x240:r=10:d=2 -pix_fmt yuv420p "$FOLDER/green.mp4"
  export ZARVO_VIRTUAL_CARD="camera3=$FOLDER/green.mp4"
fi

# shellcheck disable=SC2086 # options are words
"${ON_CARD[@]}" "$ZARVO_RECORD" --seconds 5 --output "$FOLDER/out" $options

videos=("$FOLDER"/out/ch*)
expect_equal "video files" "$files" "${#videos[@]}"
expect_decodes "${videos[@]}" "$FOLDER"/out/audio{1,2,3,4}.g726
for file in "${videos[@]}"; do
  got=$(probe "$file")
  expect_equal "format of $file" "$format" "${got%,*}"
  expect "$file has ${got##*,} frames instead of $frames" \
    test "${got##*,}" -ge $((frames - 2)) -a "${got##*,}" -le $((frames + 2))
done
# 24 kbit/s are 3000 bytes a second.
for file in "$FOLDER"/out/audio*.g726; do
  expect "$file has $(stat -c %s "$file") bytes instead of about 15000" test "$(stat -c %s "$file")" -ge 14400
done

# Catches: interlaced pictures without the interlaced flag: players show combs where something moves.
if [ "$1" = d1 ]; then
  expect "D1 is not marked as interlaced" grep -q 'interlaced_frame=1' \
    <(ffprobe -v error -f m4v -show_frames -read_intervals '%+#30' "${videos[0]}")
fi

if [ "$1" = film ]; then
  save_frame "${videos[1]}" 20 "$FOLDER/film.png"
  red=$(convert "$FOLDER/film.png" -format '%[fx:round(255*mean.r)]' info:)
  green=$(convert "$FOLDER/film.png" -format '%[fx:round(255*mean.g)]' info:)
  expect "camera 3 does not show the film: red $red, green $green" test "$green" -gt 150 -a "$red" -lt 60
fi

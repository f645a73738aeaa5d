# shellcheck shell=bash
# What ffmpeg says about a recorded stream. To be sourced, not run.

readonly RECORD_HEADER_BYTES=32

# le32 FILE OFFSET: a little-endian word of a file.
le32() { od -A n -t u4 -j "$2" -N 4 --endian=little "$1" | tr -d ' '; }

# record_header FILE: prints the header of a .rec file as text.
record_header() {
  printf '%s %sx%s, %s fps, "%s"' "$(head -c 4 "$1")" "$(le32 "$1" 4)" "$(le32 "$1" 8)" "$(le32 "$1" 12)" \
    "$(tail -c +17 "$1" | head -c 16 | tr -d '\0')"
}

# stream_input FILE: sets the array STREAM to the input options with which ffmpeg and ffprobe read the file.
stream_input() {
  case $1 in
    *.m4v) STREAM=(-f m4v) ;;
    *.mjpeg) STREAM=(-f mjpeg) ;;
    *.g726 | *.aud) STREAM=(-f g726 -code_size 3 -sample_rate 8000) ;;
    *.rec)
      case $(head -c 4 "$1") in
        MPG4) STREAM=(-f m4v) ;;
        MJPG) STREAM=(-f mjpeg) ;;
        *) return 1 ;;
      esac
      STREAM+=(-skip_initial_bytes "$RECORD_HEADER_BYTES")
      ;;
    *) return 1 ;;
  esac
  STREAM+=(-i "$1")
}

# decode_errors FILE: prints ffmpeg's errors from decoding the whole file; nothing if there are none.
decode_errors() {
  stream_input "$1" || { echo "not a recording of this system"; return; }
  ffmpeg -nostdin -v error "${STREAM[@]}" -f null - 2>&1 || echo "ffmpeg failed"
}

# probe FILE: "codec,width,height,frames" of a video file, "codec,rate,blocks" of an audio file.
probe() {
  local fields=codec_name,width,height,nb_read_frames
  stream_input "$1" || return 1
  case $1 in
    *.g726 | *.aud)
      echo "adpcm_g726,8000,$(($(stat -c %s "$1") / 48))"
      return
      ;;
  esac
  ffprobe -v error -count_frames -show_entries "stream=$fields" -of csv=p=0 "${STREAM[@]}"
}

# decoded_frames FILE: number of video frames that decode.
decoded_frames() { probe "$1" | cut -d , -f 4; }

# save_frame FILE NUMBER PNG: saves the frame with that number, counted from 0.
save_frame() {
  stream_input "$1" &&
    ffmpeg -nostdin -y -v error "${STREAM[@]}" -vf "select=eq(n\,$2)" -frames:v 1 "$3"
}

# report_streams FILE...: prints a line for each file: header fields if it has any, contents, ffmpeg's verdict.
# Fails if a file is missing, empty or does not decode without an error line.
report_streams() {
  local file errors bad=0
  for file in "$@"; do
    if [ ! -s "$file" ]; then
      printf '%-44s missing or empty\n' "$file"
      bad=1
      continue
    fi
    errors=$(decode_errors "$file")
    printf '%-44s %s%s  %s\n' "$file" "$(case $file in *.rec) record_header "$file"; printf '  ' ;; esac)" \
      "$(probe "$file")" "${errors:-decodes without an error}"
    [ -z "$errors" ] || bad=1
  done
  return $bad
}

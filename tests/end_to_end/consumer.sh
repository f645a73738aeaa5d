#!/usr/bin/env bash
# The ten-line project of the README: by add_subdirectory, and by find_package after an install into an
# empty prefix. Both programs run on the virtual card, the installed one on the installed card.
. "$(dirname "$0")/common.sh"

run_consumer() { # BUILD-FOLDER CARD
  use_card "$2"
  expect_equal "channels with video that $1 sees" "16 channels with video" "$("${ON_CARD[@]}" "$1/consumer")"
}

cmake -G Ninja -S "$HERE/consumer" -B "$FOLDER/sub" -DZARVO_SOURCE="$ZARVO_ROOT" >"$FOLDER/log" || die "$(cat "$FOLDER/log")"
cmake --build "$FOLDER/sub" >"$FOLDER/log" || die "$(cat "$FOLDER/log")"
run_consumer "$FOLDER/sub" "$CARD"

cmake --install "$ZARVO_BUILD" --prefix "$FOLDER/prefix" >"$FOLDER/log" || die "$(cat "$FOLDER/log")"
cmake -G Ninja -S "$HERE/consumer" -B "$FOLDER/found" -DCMAKE_PREFIX_PATH="$FOLDER/prefix" >"$FOLDER/log" || die "$(cat "$FOLDER/log")"
cmake --build "$FOLDER/found" >"$FOLDER/log" || die "$(cat "$FOLDER/log")"
run_consumer "$FOLDER/found" "$(find "$FOLDER/prefix" -name libzarvo_virtual_card.so)"

#!/usr/bin/env bash
# Builds the project that README.md shows, word for word, in three ways: with this tree as a subfolder, with
# the installed static SDK, and with the installed shared SDK. Each build records on the virtual card. The
# shared install is moved first, and its programs must run from the new place.
. "$(dirname "$0")/common.sh"

# quietly COMMAND...: runs it and shows its output only if it fails.
quietly() { "$@" >"$FOLDER/log" 2>&1 || die "$*: $(cat "$FOLDER/log")"; }

# block LANGUAGE: the code block of the README in that language.
block() { awk -v begin="\`\`\`$1" '$0 == "```" { inside = 0 } inside; $0 == begin { inside = 1 }' "$ZARVO_ROOT/README.md"; }

# project NAME [SED-SCRIPT]: puts the README's project into a folder of that name.
project() {
  mkdir "$FOLDER/$1"
  block cmake | sed "${2:-}" >"$FOLDER/$1/CMakeLists.txt"
  block cpp >"$FOLDER/$1/main.cpp"
}

# build_and_record NAME CARD [CMAKE-OPTION...]
build_and_record() {
  local folder=$FOLDER/$1 frames
  use_card "$2"
  quietly cmake -G Ninja -S "$folder" -B "$folder/build" "${@:3}"
  quietly cmake --build "$folder/build"
  (cd "$folder" && quietly "${ON_CARD[@]}" build/recorder)
  frames=$(decoded_frames "$folder/camera1.m4v")
  expect "the README's program ($1) has recorded $frames frames instead of 150" test "$frames" -ge 145 -a "$frames" -le 155
}

project sub "s|^find_package(.*|add_subdirectory(\"$ZARVO_ROOT\" zarvo)|"
expect "the README's project does not find the package" grep -q add_subdirectory "$FOLDER/sub/CMakeLists.txt"
build_and_record sub "$CARD"

quietly cmake --install "$ZARVO_BUILD" --prefix "$FOLDER/static prefix"
project static
build_and_record static "$(find "$FOLDER/static prefix" -name libzarvo_virtual_card.so)" "-DCMAKE_PREFIX_PATH=$FOLDER/static prefix"

options=(-DBUILD_SHARED_LIBS=ON)
for part in VIRTUAL_CARD APP TESTS BENCH; do options+=("-DZARVO_BUILD_$part=OFF"); done
quietly cmake -G Ninja -S "$ZARVO_ROOT" -B "$FOLDER/shared build" "${options[@]}"
quietly cmake --build "$FOLDER/shared build"
quietly cmake --install "$FOLDER/shared build" --prefix "$FOLDER/prefix"
rm -r "$FOLDER/shared build"
mv "$FOLDER/prefix" "$FOLDER/shared prefix"
project shared
build_and_record shared "$CARD" "-DCMAKE_PREFIX_PATH=$FOLDER/shared prefix"
quietly "${ON_CARD[@]}" "$FOLDER/shared prefix/bin/zarvo_record" --seconds 1 --channels 1 --output "$FOLDER/out"
expect "the installed zarvo_record does not use the shared SDK" \
  grep -q 'libzarvo_sdk.so.* => /' <(ldd "$FOLDER/shared prefix/bin/zarvo_record")

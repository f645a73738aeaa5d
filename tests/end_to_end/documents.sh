#!/usr/bin/env bash
# Runs the command lines of all documents as a reader would: the lines of the blocks marked "sh", in order,
# with the plain shell, in a new tree that keeps only the built SDK of the run before. Lines whose comment
# begins with "needs" are left out.
. "$(dirname "$0")/common.sh"

# commands DOCUMENT
commands() { awk '/^ *```sh$/ { inside = 1; next } /^ *```$/ { inside = 0 } inside && !/# needs /' "$1"; }

# A line outside of a block marked sh is never tried.
unmarked=$(cd "$ZARVO_ROOT" && grep -nE '^    +(\./|bench/|cmake|ctest|cc |make|sudo |LD_PRELOAD=|ZARVO_|ff(mpeg|play|probe) |tail )' \
  README.md CONTRIBUTING.md docs/*.md || true)
expect "command lines outside of a block marked sh: $unmarked" test -z "$unmarked"

tree=$ZARVO_BUILD/documents
mkdir -p "$tree/build" "$FOLDER/home"
find "$tree" -mindepth 1 -maxdepth 1 ! -name build -exec rm -rf {} +
for entry in "$ZARVO_ROOT"/*; do
  case ${entry##*/} in build | demo) ;; *) ln -s "$entry" "$tree/" ;; esac
done
ln -sfn "$ZARVO_BUILD" "$tree/build/product"

# What the documents speak of: the program of the README, and recordings of the dialog.
mkdir "$tree/recorder"
readme_block cmake >"$tree/recorder/CMakeLists.txt"
readme_block c >"$tree/recorder/main.c"
"${ON_CARD[@]}" "$ZARVO_RECORD" --seconds 1 --channels 1 --audio 1 --output "$FOLDER/recordings"
{ head -c 32 /dev/zero; cat "$FOLDER/recordings/ch01.m4v"; } >"$tree/FILE.rec"
mv "$FOLDER/recordings/audio1.g726" "$tree/FILE.aud"

export CMAKE_BUILD_PARALLEL_LEVEL CMAKE_C_COMPILER_LAUNCHER CMAKE_CXX_COMPILER_LAUNCHER
CMAKE_BUILD_PARALLEL_LEVEL=$(nproc)
CMAKE_C_COMPILER_LAUNCHER=$(command -v ccache || true)
CMAKE_CXX_COMPILER_LAUNCHER=$CMAKE_C_COMPILER_LAUNCHER
for document in "$ZARVO_ROOT"/*.md "$ZARVO_ROOT"/docs/*.md; do
  commands "$document" >"$FOLDER/commands"
  (cd "$tree" && HOME=$FOLDER/home sh -eux "$FOLDER/commands" </dev/null >"$FOLDER/log" 2>&1) ||
    die "$document: this command line fails: $(tail -n 20 "$FOLDER/log")"
done

expect_decodes "$tree/recorder/camera1.m4v" "$tree/recordings/ch02.m4v"
for file in build/demo/record/frames.png recorder/recorder FILE.wav; do
  expect "the documents' lines have made no $file" test -s "$tree/$file"
done

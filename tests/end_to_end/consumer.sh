#!/usr/bin/env bash
# Builds the program that README.md shows, word for word, in all the ways to link the SDK: as a C program with
# this tree as a subfolder, with the installed static and shared SDK by CMake and by pkg-config, and as C++. Each
# records on the virtual card; no C program needs the C++ runtime. The installed trees are moved first, and the
# programs in them must run from the new place.
. "$(dirname "$0")/common.sh"

# quietly COMMAND...: runs it and shows its output only if it fails.
quietly() { "$@" >"$FOLDER/log" 2>&1 || die "$*: $(cat "$FOLDER/log")"; }

# record_with NAME: the program recorder in the folder NAME must record 150 frames.
record_with() {
  local frames
  (cd "$FOLDER/$1" && quietly "${ON_CARD[@]}" ./recorder)
  frames=$(decoded_frames "$FOLDER/$1/camera1.m4v")
  expect "the README's program ($1) has recorded $frames frames instead of 150" test "$frames" -ge 145 -a "$frames" -le 155
  [ "$1" = cpp ] || expect "$1 needs the C++ runtime" test -z "$(ldd "$FOLDER/$1/recorder" | grep 'libstdc++')"
}

# with_cmake NAME SED-SCRIPT [CMAKE-OPTION...]: builds the README's project, with changes to its CMakeLists.txt.
with_cmake() {
  local folder=$FOLDER/$1
  mkdir "$folder"
  readme_block cmake | sed "$2" >"$folder/CMakeLists.txt"
  readme_block c | tee "$folder/main.c" >"$folder/main.cpp"
  quietly cmake -G Ninja -S "$folder" -B "$folder" "${@:3}"
  quietly cmake --build "$folder"
  record_with "$1"
}

# with_pkg_config NAME PREFIX [PKG-CONFIG-OPTION]: the command of the README; eval, since the prefix has a blank.
with_pkg_config() {
  local flags
  mkdir "$FOLDER/$1"
  readme_block c >"$FOLDER/$1/main.c"
  flags=$(PKG_CONFIG_PATH=$2/lib/pkgconfig pkg-config --cflags --libs "${@:3}" zarvo-sdk)
  (cd "$FOLDER/$1" && eval "quietly cc main.c $flags -o recorder '-Wl,-rpath,$2/lib'")
  record_with "$1"
}

# install_moved BUILD NAME: installs into a prefix and moves that to "NAME prefix".
install_moved() {
  quietly cmake --install "$1" --prefix "$FOLDER/prefix"
  mv "$FOLDER/prefix" "$FOLDER/$2 prefix"
}

with_cmake subfolder "s|^find_package(.*|add_subdirectory(\"$ZARVO_ROOT\" zarvo)|"
expect "the README's project does not find the package" grep -q add_subdirectory "$FOLDER/subfolder/CMakeLists.txt"

static="$FOLDER/static prefix"
install_moved "$ZARVO_BUILD" static
use_card "$static/lib/libzarvo_virtual_card.so"
with_cmake static-cmake '' "-DCMAKE_PREFIX_PATH=$static"
with_pkg_config static-pkg-config "$static" --static
use_card "$CARD"

# The test that docs/virtual-card.md shows, with the installed card.
mkdir "$FOLDER/card-test"
readme_block cmake docs/virtual-card.md >"$FOLDER/card-test/CMakeLists.txt"
readme_block cpp docs/virtual-card.md >"$FOLDER/card-test/main.cpp"
quietly cmake -G Ninja -S "$FOLDER/card-test" -B "$FOLDER/card-test" "-DCMAKE_PREFIX_PATH=$static"
quietly cmake --build "$FOLDER/card-test"
quietly "$FOLDER/card-test/my_test"

options=(-DBUILD_SHARED_LIBS=ON)
for part in VIRTUAL_CARD APP PROGRAMS TESTS BENCH; do options+=("-DZARVO_BUILD_$part=OFF"); done
quietly cmake -G Ninja -S "$ZARVO_ROOT" -B "$FOLDER/shared build" "${options[@]}"
quietly cmake --build "$FOLDER/shared build"
shared="$FOLDER/shared prefix"
install_moved "$FOLDER/shared build" shared
rm -r "$FOLDER/shared build"
with_cmake shared-cmake '' "-DCMAKE_PREFIX_PATH=$shared"
! cmake -S "$FOLDER/card-test" -B "$FOLDER/no-card" "-DCMAKE_PREFIX_PATH=$shared" >"$FOLDER/log" 2>&1 ||
  die "the package without the card claims to have it"
with_pkg_config shared-pkg-config "$shared"
with_cmake cpp 's/LANGUAGES C/LANGUAGES CXX/; s/main\.c/main.cpp/' "-DCMAKE_PREFIX_PATH=$shared"
quietly "${ON_CARD[@]}" "$shared/bin/zarvo_record" --seconds 1 --channels 1 --output "$FOLDER/out"
expect "the installed zarvo_record does not use the shared SDK" \
  grep -q 'libzarvo_sdk.so.1 => /' <(ldd "$shared/bin/zarvo_record")

# The compiler lists the functions that the installed headers declare.
printf '#include "%s"\n' "$shared"/include/zarvo/*.h >"$FOLDER/all.c"
cc -fsyntax-only -aux-info "$FOLDER/declared" "$FOLDER/all.c"
declared=$(sed -nE 's|^/\* [^*]*/include/zarvo/.* \*/ extern .*[ *]([a-z][A-Za-z0-9_]*) \(.*|\1|p' "$FOLDER/declared" | sort)
expect "only these functions are declared: $declared" grep -q zv_Open <<<"$declared"
expect_equal "exported names" "$declared" "$(nm -D --defined-only "$shared/lib/libzarvo_sdk.so" | awk '{ print $3 }' | sort)"

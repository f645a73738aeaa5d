#!/usr/bin/env bash
# The one command that tests everything: ./test.sh
#   ./test.sh quick    the release build and its tests only
#   ./test.sh tidy     clang-tidy over all sources
# Stops at the first step that fails, so that its last line is ctest's summary of the release build
# only when all steps before it have passed.
set -euo pipefail
# shellcheck source=tools/common.sh
. "$(dirname "${BASH_SOURCE[0]}")/tools/common.sh"
cd "$ZARVO_ROOT"

# ThreadSanitizer of this compiler cannot live with the address randomisation of newer kernels.
if [ -z "${ZARVO_PLAIN_ADDRESSES:-}" ] && setarch -R true 2>/dev/null; then
  export ZARVO_PLAIN_ADDRESSES=1
  exec setarch -R ./test.sh "$@"
fi

export CTEST_OUTPUT_ON_FAILURE=1
export ASAN_OPTIONS=strict_string_checks=1:detect_stack_use_after_return=1
export UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1
export TSAN_OPTIONS=halt_on_error=1:second_deadlock_stack=1:suppressions=$ZARVO_ROOT/tests/tsan.supp

sources() {
  if git rev-parse --git-dir >/dev/null 2>&1; then git ls-files '*.cpp' '*.h' '*.c'; else
    find app bench examples include programs recording sdk tests virtual_card -name '*.cpp' -o -name '*.h' -o -name '*.c'
  fi
}

check_format() {
  say "Format of the sources (clang-format)"
  sources | xargs clang-format --dry-run -Werror
}

# Warnings are errors here: what a user's compiler says must not stop his build, ours must.
build_and_test() { # PRESET CTEST-OPTION...
  local preset=$1
  shift
  say "Building $preset"
  build "$preset" -- -DZARVO_WERROR=ON
  say "Testing $preset"
  ctest --test-dir "build/$preset" -j "$(nproc)" "$@"
}

# What a newcomer runs first; the folder has a blank on purpose.
smoke_demo() {
  say "Recording with demo.sh"
  ./demo.sh record --force --seconds 3 --output "build/smoke test"
}

run_tidy() {
  build release
  say "clang-tidy"
  run-clang-tidy -quiet -p build/release '^(?!.*(_autogen|/headers/)).*/(app|bench|examples|programs|recording|sdk|tests|virtual_card)/.*\.cpp$'
}

mode=${1:-all}
case $mode in
  all | quick | tidy) ;;
  *) die "'$mode' is unknown; possible are quick and tidy, or nothing for everything" ;;
esac
install_missing
case $mode in
  tidy) run_tidy ;;
  quick) build_and_test release ;;
  all)
    check_format
    build_and_test asan -LE real_time
    build_and_test tsan -LE real_time
    smoke_demo
    build_and_test release
    ;;
esac

// The library as a file: what it exports, what it leans on, and how it behaves when preloaded.

#include <sys/stat.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>

#include "node_test.h"

namespace {

using testing::HasSubstr;

std::string output_of(const std::string &command) {
  std::string text;
  FILE *pipe = popen(command.c_str(), "r");
  for (int character; (character = std::fgetc(pipe)) != EOF;) text += static_cast<char>(character);
  pclose(pipe);
  return text;
}

/// The names that the library takes from libc, sorted.
constexpr char kTaken[] =
    "__open64_2 __open_2 __openat64_2 __openat_2 __read_chk close close_range closefrom dup dup2 dup3 fcntl "
    "fcntl64 ioctl mmap mmap64 munmap open open64 openat openat64 read ";

// Catches: a symbol too many, which takes a call of the host's or of another library's for good.
TEST(Library, ExportsTheTakenNamesAndTheControlInterfaceOnly) {
  EXPECT_EQ(output_of(NM " -D --defined-only --format=just-symbols " CARD_LIBRARY
                         " | grep -v ^_ZN12virtual_card | LC_ALL=C sort | tr '\\n' ' '"),
            kTaken);
}

// Catches: a plain name in the card's own code, which leads back into the card. real_calls uses dlsym.
TEST(Library, TheCardCallsNoNameThatItTakes) {
  EXPECT_EQ(
      output_of(NM " -u --format=just-symbols " CARD_ROOMS " | sort -u | grep -xF \"$(echo memfd_create " +
                std::string(kTaken) + " | tr ' ' '\\n')\""),
      "memfd_create\n");
}

/// What a program prints that knows nothing of the card, with the library in front of it. Behind a sanitizer
/// the sanitizer's runtime must be the first.
std::string preloaded(const std::string &command, const std::string &options = "",
                      const std::string &other_libraries = "") {
  return output_of("export LC_ALL=C ASAN_OPTIONS=detect_leaks=0 ZARVO_VIRTUAL_CARD='" + options +
                   "'; runtime=$(ldd " CARD_LIBRARY
                   " | grep -o '/.*/lib[at]san[^ ]*'); LD_PRELOAD=\"$runtime " CARD_LIBRARY +
                   other_libraries + "\" " + command + " 2>&1");
}
std::string opened(const std::string &nodes, const std::string &options = "") {
  return preloaded("head -qc0 " + nodes, options);
}

// Catches: a line too many on standard output, a list that puts the card in front of the players, too.
TEST(Preload, TheCardIsThereForThisProgramOnlyAndSilent) {
  EXPECT_EQ(opened("/dev/zarvo_enc0 /dev/zarvo_disp0 /dev/null"), "");
  EXPECT_THAT(opened("/dev/zarvo_dec0"), HasSubstr("No such file"));
  const std::string child = "sh -c 'exec 3</dev/zarvo_enc0; echo $LD_PRELOAD; env'";
  EXPECT_THAT(preloaded(child), testing::Not(HasSubstr("libzarvo_virtual_card")));
  EXPECT_THAT(preloaded(child, "", ":libdl.so.2 libm.so.6"), HasSubstr("libdl.so.2:libm.so.6\n"));
}

TEST(Preload, OptionsComeFromTheEnvironment) {
  EXPECT_THAT(opened("/dev/zarvo_enc0", "absent"), HasSubstr("No such file"));
  EXPECT_THAT(opened("/dev/zarvo_enc0", "@0 vanish"), HasSubstr("No such device"));
  EXPECT_THAT(
      opened("/dev/zarvo_enc0 /dev/zarvo_disp0", "lots=3"),
      testing::MatchesRegex("virtual card: ZARVO_VIRTUAL_CARD: item \"lots\" is unknown; possible are "
                            "[^\n]*\n[^\n]*Invalid argument\n[^\n]*Invalid argument\n"));
  EXPECT_THAT(opened("/dev/zarvo_enc0", "camera2=/no/such.mp4"), HasSubstr("item \"camera2\": "));
  const std::string file = testing::TempDir() + "card_log_" + std::to_string(getpid());
  std::ofstream(file) << std::string(1000, 'x');  // an earlier log, which the new one replaces
  opened("/dev/zarvo_vin0 /dev/zarvo_dec0", "log=" + file);
  EXPECT_THAT(
      output_of("cat " + file),
      testing::MatchesRegex("[0-9.]+ video_input open = [0-9]+\n[^\n]*\n[0-9.]+ none open = -1 ENOENT\n"));
  unlink(file.c_str());
}

// Catches: a limit that ends the program by a signal; a pipe without a reader that holds it for ever.
TEST(Preload, WhatTheCardCannotHaveIsNamed) {
  const std::string limited = "'ulimit -f 100; exec head -qc0 /dev/zarvo_enc0'";
  EXPECT_THAT(preloaded("bash -c " + limited), HasSubstr("file size limit"));
  const std::string pipe = testing::TempDir() + "card_pipe_" + std::to_string(getpid());
  mkfifo(pipe.c_str(), 0600);
  EXPECT_THAT(opened("/dev/zarvo_enc0", "log=" + pipe), HasSubstr("not a regular file"));
  unlink(pipe.c_str());
}

}  // namespace

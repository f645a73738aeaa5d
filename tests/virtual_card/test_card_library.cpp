// The library as a file: what it exports, what it leans on, and how it behaves when preloaded.

#include <cstdio>
#include <cstdlib>
#include <regex>
#include <sstream>

#include "card_fixture.h"

namespace {

using ::testing::HasSubstr;
using ::testing::Not;

std::string output_of(const std::string &command) {
  std::string text;
  FILE *pipe = popen(command.c_str(), "r");
  char part[4096];
  while (const auto size = std::fread(part, 1, sizeof part, pipe)) text.append(part, size);
  pclose(pipe);
  return text;
}

/// Names of a listing whose lines match, one a line of the result.
std::string offenders(const std::string &listing, const std::regex &line) {
  std::istringstream lines(listing);
  std::string found;
  for (std::string text; std::getline(lines, text);)
    if (std::regex_search(text, line)) found += text + "\n";
  return found;
}

const char kTakenNames[] =
    "(__)?(open|open64|openat|openat64|close|close_range|closefrom|ioctl|read|mmap|mmap64|munmap|dup|dup2|"
    "dup3|"
    "fcntl|fcntl64)(_2|_chk)?";

// A symbol too many can take a call of the host's, or of another library's, for good.
TEST(Library, ExportsTheTakenNamesAndTheControlInterfaceOnly) {
  const std::string listing = output_of(NM " -D --defined-only --format=just-symbols " CARD_LIBRARY);
  EXPECT_THAT(listing, HasSubstr("__openat64_2\n"));
  EXPECT_THAT(listing, HasSubstr("virtual_card7advance"));
  const std::regex foreign("^(?!(" + std::string(kTakenNames) + "|_ZN12virtual_card\\w+)$)");
  EXPECT_EQ(offenders(listing, foreign), "");
}

// A plain name in the card's own code would lead back into the card. real_calls finds its way by dlsym.
TEST(Library, TheCardCallsNoNameThatItTakes) {
  const std::string listing = output_of(NM " -u --format=just-symbols " CARD_CORE);
  EXPECT_THAT(listing, HasSubstr("memfd_create"));
  EXPECT_EQ(offenders(listing, std::regex("^(" + std::string(kTakenNames) + ")$")), "");
}

/// Runs the probe with the library in front of it; its standard output, or error.
std::string probe(const std::string &options, const std::string &arguments, bool error = false,
                  const std::string &other_preloads = "") {
  return output_of("ASAN_OPTIONS=verify_asan_link_order=0:detect_leaks=0 ZARVO_VIRTUAL_CARD='" + options +
                   "' LD_PRELOAD='" + CARD_LIBRARY + other_preloads + "' " + CARD_PROBE + " " + arguments +
                   (error ? " 2>&1 >/dev/null" : " 2>/dev/null"));
}

// The exact text: a line too many on standard output would end up in a recording's listing.
TEST(Preload, TheCardIsThereForThisProgramOnlyAndSilent) {
  EXPECT_EQ(probe("", "/dev/zarvo_enc0 /dev/zarvo_disp0 /dev/zarvo_dec0 /dev/null"),
            "/dev/zarvo_enc0 opened\n/dev/zarvo_disp0 opened\n/dev/zarvo_dec0 absent\n/dev/null opened\n"
            "preload \"\"\nchild \"\"\n");
  const std::string with_others = probe("", "", false, ":libdl.so.2 libm.so.6");
  EXPECT_THAT(with_others, HasSubstr("child \"libdl.so.2:libm.so.6\"\n"));
}

TEST(Preload, OptionsComeFromTheEnvironment) {
  EXPECT_THAT(probe("absent", "/dev/zarvo_enc0"), HasSubstr("/dev/zarvo_enc0 absent"));
  EXPECT_THAT(probe("vanish=0-1000", "/dev/zarvo_enc0"), HasSubstr("/dev/zarvo_enc0 refused"));
  EXPECT_THAT(probe("lots=3", "/dev/zarvo_enc0"), HasSubstr("/dev/zarvo_enc0 refused"));
  EXPECT_THAT(probe("lots=3", "/dev/zarvo_enc0 /dev/zarvo_disp0", true),
              ::testing::MatchesRegex("virtual card: ZARVO_VIRTUAL_CARD: option \"lots\" is unknown; "
                                      "possible are [^\n]*\n"));
  EXPECT_THAT(probe("camera2=/no/such.mp4", "/dev/zarvo_enc0", true), HasSubstr("option \"camera2\": "));
  const std::string file = ::testing::TempDir() + "card_log_" + std::to_string(getpid());
  probe("log=" + file, "/dev/zarvo_vin0");
  EXPECT_THAT(output_of("cat " + file), HasSubstr("video_input open = "));
  unlink(file.c_str());
}

}  // namespace

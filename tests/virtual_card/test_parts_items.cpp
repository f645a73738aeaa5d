// Lines of items, as the environment variable ZARVO_VIRTUAL_CARD and zarvo_card give them.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "nodes/script.h"
#include "support.h"

namespace {

using card::PowerUp, card::Script;
using testing::AllOf, testing::HasSubstr;
using namespace std::chrono_literals;

TEST(ItemLine, SetsWhatItSays) {
  Script script;
  PowerUp power_up;
  EXPECT_EQ(
      script.add(
          " lost=3,7-9; lost=1;silent=2;still=1,16;black=5;speed=2.5;nowait;absent;board=dd;log=/tmp/l=1;;"
          "state=/s;control=/c;slow=20;seed=9",
          0s, &power_up),
      "");
  const card::Conditions conditions = script.conditions(0s);
  EXPECT_EQ(conditions.lost, 0x01C5u);
  EXPECT_EQ(conditions.silent, 0x2u);
  EXPECT_EQ(conditions.still, 0x8001u);
  EXPECT_EQ(conditions.black, 0x10u);
  EXPECT_TRUE(conditions.nowait && conditions.absent && !conditions.vanished);
  EXPECT_EQ(conditions.board_version, 0xDDu);
  EXPECT_EQ(conditions.delay, 20ms);
  EXPECT_EQ(conditions.seed, 9u);
  EXPECT_EQ(power_up.speed, 2.5);
  EXPECT_EQ(power_up.log_file, "/tmp/l=1");
  EXPECT_EQ(power_up.state_file, "/s");
  EXPECT_EQ(power_up.control_socket, "/c");
  // A later line replaces what earlier ones said of its names, and nothing else.
  EXPECT_EQ(script.add("lost=2;black=", 0s, nullptr), "");
  EXPECT_EQ(script.conditions(0s).lost, 0x2u);
  EXPECT_EQ(script.conditions(0s).black, 0u);
  EXPECT_EQ(script.conditions(0s).silent, 0x2u);
}

// The error names what was typed and what is possible.
TEST(ItemLine, WhatIsWrongIsNamedWithWhatIsPossible) {
  const struct {
    const char *text, *named, *possible;
  } cases[] = {
      {"sped=4", "\"sped\" is unknown", "cameraN, lost"},
      {"speed=4;;Lost=1", "\"Lost\" is unknown", "vanish"},
      {"lost=0-17", "\"lost\": value \"0-17\"", "1-16"},
      {"lost", "\"lost\"", "1-16"},
      {"lost=3,", "\"3,\"", "1-16"},
      {"lost=4-2", "\"4-2\"", "1-16"},
      {"lost=3;silent=5", "\"silent\": value \"5\"", "1-4"},
      {"speed=fast", "\"speed\": value \"fast\"", "0.01 to 1000"},
      {"speed=nan", "\"speed\"", "0.01 to 1000"},
      {"@1 speed=2", "\"speed\"", "power-up only"},
      {"nowait=1", "\"nowait\": value \"1\"", "no value"},
      {"board=aa", "\"board\": value \"aa\"", "bb, cc or dd"},
      {"log=", "\"log\"", "a regular file"},
      {"@8-5 vanish", "@8-5 vanish", "@FROM-TO"},
      {"@every 5 for 6 vanish", "@every", "SECONDS for SECONDS"},
      {"@5", "\"@5\"", "a time is"},
      {"camera17=/x", "\"camera17\"", "1-16"},
      {"camera3", "\"camera3\"", "camera3=/path/clip.mp4"},
      {"camera3=/nowhere", "\"camera3\"", "No such file"},
      {"fail=disk/read:EIO", "\"fail\"", "encoder, display"},
      {"fail=audio/ioctl/DISP_IOC_GET_WIDTH:EIO", "\"fail\"", "a command name"},
      {"fail=any/read:EWRONG", "\"fail\"", "an error name"},
      {"fail=any/read:EIO:0", "\"fail\"", "everyN"},
      {"stall=tape", "\"stall\"", "mpeg4, mjpeg, audio, preview"},
      {"noeoi=mpeg4", "\"noeoi\"", "mjpeg"},
      {"late=mpeg4", "\"late\"", "milliseconds"},
      {"channel=mpeg4:17", "\"channel\"", "1-16"},
      {"flicker=3", "\"flicker\"", "3:10"},
      {"stuck=310", "\"stuck\"", "0x310"},
  };
  for (const auto &each : cases) {
    Script script;
    PowerUp power_up;
    EXPECT_THAT(script.add(each.text, 0s, &power_up), AllOf(HasSubstr(each.named), HasSubstr(each.possible)))
        << each.text;
    EXPECT_EQ(script.conditions(0s).lost, 0u) << each.text;
    EXPECT_EQ(power_up.speed, 1.0) << each.text;
  }
}

}  // namespace

// The text of the environment variable ZARVO_VIRTUAL_CARD.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "nodes/options.h"
#include "support.h"

using namespace std::chrono_literals;

TEST(OptionsText, SetsWhatItSays) {
  const card::Options options = card::parse_options(
      "lost=3,7-9;silent=2;still=1,16;black=5;speed=2.5;camera3=/a b/clip.mp4;camera16=x;nowait;absent;"
      "board=dd;log=/tmp/l=1;vanish=0.5-3;");
  EXPECT_EQ(options.error, "");
  EXPECT_EQ(options.lost, 0x01C4u);
  EXPECT_EQ(options.silent, 0x2u);
  EXPECT_EQ(options.still, 0x8001u);
  EXPECT_EQ(options.black, 0x10u);
  EXPECT_EQ(options.speed, 2.5);
  EXPECT_THAT(options.films, testing::ElementsAre(std::pair(2u, "/a b/clip.mp4"), std::pair(15u, "x")));
  EXPECT_TRUE(options.nowait && options.absent);
  EXPECT_EQ(options.board_version, 0xDDu);
  EXPECT_EQ(options.log_file, "/tmp/l=1");
  EXPECT_EQ(options.vanish_from, 500ms);
  EXPECT_EQ(options.vanish_to, 3s);
}

// The error names what was typed and what is possible.
TEST(OptionsText, WhatIsWrongIsNamedWithWhatIsPossible) {
  const struct {
    const char *text, *named, *possible;
  } cases[] = {
      {"sped=4", "\"sped\" is unknown", "cameraN, lost, silent"},
      {"speed=4;;Lost=1", "\"Lost\" is unknown", "vanish"},
      {"lost=0-17", "\"lost\": value \"0-17\"", "1-16"},
      {"lost", "\"lost\"", "1-16"},
      {"lost=3,", "\"3,\"", "1-16"},
      {"lost=4-2", "\"4-2\"", "1-16"},
      {"lost=3;silent=5", "\"silent\": value \"5\"", "1-4"},
      {"black=-1", "\"black\"", "1-16"},
      {"speed=fast", "\"speed\": value \"fast\"", "0.01 to 1000"},
      {"speed=nan", "\"speed\"", "0.01 to 1000"},
      {"nowait=1", "\"nowait\": value \"1\"", "no value"},
      {"board=aa", "\"board\": value \"aa\"", "bb, cc or dd"},
      {"log=", "\"log\"", "a file"},
      {"vanish=5", "\"vanish\": value \"5\"", "FROM-TO"},
      {"vanish=8-5", "\"vanish\"", "FROM-TO"},
      {"camera17=/x", "\"camera17=/x\"", "1-16"},
      {"camera3", "\"camera3\"", "camera3=/path/clip.mp4"},
  };
  for (const auto &[text, named, possible] : cases)
    EXPECT_THAT(card::parse_options(text).error,
                testing::AllOf(testing::HasSubstr(named), testing::HasSubstr(possible)))
        << text;
}

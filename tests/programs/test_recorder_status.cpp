// What the recorder says of itself while it records from the virtual card.
#include <gmock/gmock.h>
#include <stdlib.h>

#include <filesystem>
#include <sstream>

#include "programs/recorder/status.h"
#include "support.h"
#include "virtual_card.h"

namespace recorder {
namespace {

// Catches: a column that tells another count or another channel's, a stream that is left out or told although
// it is not recorded, and a card that gets other settings than the options say.
TEST(RecorderStatus, TellsWhatCame) {
  char folder[] = "/tmp/zarvo_recorder_XXXXXX";
  Options options;
  options.root = mkdtemp(folder);
  options.channels = 0b1010;
  options.audio = 0b100;
  options.two_fields = true;
  options.min_free = 0;
  card::reset();
  card::set_clock(card::ClockMode::manual);
  card::apply("lost=4");
  {
    Recorder recording(options);
    Status status(recording);
    recording.start();
    card::advance_frames(30);
    ASSERT_TRUE(eventually([&] { return recording.frames() >= 116; }));
    recording.stop();
    EXPECT_THAT(
        status.line(),
        testing::MatchesRegex("20[^,]*: 3 of 3 streams, 1[12][0-9] frames, [0-9]+ MiB, 0 lost, [0-9]+ gaps, "
                              "buffer 0 %, disk [0-9.]+ % free"));
    std::vector<std::string> streams;
    std::istringstream table(status.table());
    std::string row;
    std::getline(table, row);
    EXPECT_THAT(row, testing::MatchesRegex(
                         "stream +frames +expected +missing +lost +gaps +longest ms +kbit/s +motion "
                         "+no signal"));
    while (std::getline(table, row)) {
      streams.push_back(row.substr(0, row.find("  ")));
      std::istringstream columns(row.substr(14));
      std::uint64_t frames, expected, missing, lost, gaps, longest, rate, motion, no_signal;
      columns >> frames >> expected >> missing >> lost >> gaps >> longest >> rate >> motion >> no_signal;
      const bool video = row.starts_with("channel");
      EXPECT_NEAR(static_cast<double>(frames), video ? 60 : 62, 4) << row;
      EXPECT_EQ(lost, 0u);
      EXPECT_GT(rate, 0u);
      EXPECT_EQ(no_signal > 0, row.starts_with("channel 4")) << row;
      EXPECT_EQ(motion > 0, row.starts_with("channel 2")) << row;
    }
    EXPECT_THAT(streams, testing::ElementsAre("channel 2", "channel 4", "audio input 3"));
  }
  card::reset();
  std::filesystem::remove_all(options.root);
}

}  // namespace
}  // namespace recorder

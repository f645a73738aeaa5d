// Frames on their way to the host: order, bounds, losses, waits, supplies.

#include "node_test.h"

namespace {

using card::ReadyFrame;
using testing::Each;
using testing::ElementsAre;

constexpr std::size_t kJpegStart = driver::kMjpegAreaOffset + driver::kMjpegDescriptorOffset;

// The descriptors byte by byte, written by hand: a host parses exactly these.
TEST_F(NodeTest, ReadyFramesCarryRightDescriptors) {
  card::queue_mpeg4(card::mpeg4_frame(11, 2, std::vector<u8>(0x12345, 0xAB), 3000005us));
  EXPECT_GT(read_mpeg4(), 0);
  EXPECT_THAT(area(0, 4), ElementsAre(0x45, 0x23, 0x81, 0x0B));
  EXPECT_THAT(area(20, 8), ElementsAre(3, 0, 0, 0, 5, 0, 0, 0));
  EXPECT_THAT(area(64, 0x12345), Each(0xAB));

  card::queue_mjpeg(card::mjpeg_frame(15, 352, 240, {1, 2, 0xFF, 0xD9}));
  EXPECT_EQ(read_mjpeg(), 20);
  EXPECT_THAT(area(kJpegStart, 20),
              ElementsAre(15, 0, 0, 0, 0x60, 1, 0, 0, 240, 0, 0, 0, 0, 0, 0, 0, 1, 2, 0xFF, 0xD9));
}

// A card that lies is played as it is told to, but only inside its own regions.
TEST_F(NodeTest, ReadyFramesAreNotCheckedAndDoNotOverflow) {
  card::queue_mpeg4({std::vector<u8>(driver::kMpeg4AreaSize + 5000, 1), 3L << 20});
  card::queue_mjpeg({std::vector<u8>(driver::kMjpegAreaSize, 2), -100000});
  card::queue_mpeg4({{}, -EIO});
  EXPECT_EQ(read_mpeg4(), 3L << 20);
  EXPECT_THAT(area(driver::kMjpegAreaOffset, 5000), Each(0));
  EXPECT_EQ(read_mjpeg(), -100000);
  EXPECT_THAT(area(driver::kMjpegAreaOffset, driver::kMjpegDescriptorOffset), Each(0));
  EXPECT_EQ(region[driver::kStreamRegionSize - 1], 2);
  EXPECT_EQ(read_mpeg4(), -EIO);
  EXPECT_EQ(read_node(encoder, nullptr, 4096), -EINVAL);
  EXPECT_EQ(read_node(video_input, nullptr, 4), -EINVAL);
}

TEST_F(NodeTest, AudioGoesToTheHostsBuffer) {
  std::array<u8, 256> buffer{};
  card::queue_audio({std::vector<u8>(200, 9), 4});
  EXPECT_EQ(read_audio(buffer.data()), 4);
  EXPECT_EQ(std::count(buffer.begin(), buffer.end(), 9), 4 * 48);
  card::queue_audio({std::vector<u8>(192, 9), 4});
  EXPECT_EQ(read_audio(nullptr), -EFAULT);
  EXPECT_EQ(read_node(audio, buffer.data(), 192), -EINVAL);
}

// The host's slowness must never hold up the card, only cost frames, and each of them is counted.
TEST_F(NodeTest, AHostThatDoesNotReadLosesFrames) {
  card::Supply supply;
  supply.mpeg4 = {card::mpeg4_frame(0, 0, std::vector<u8>(1 << 20, 1))};
  supply.audio = {{std::vector<u8>(192), 4}};
  supply.video_rate = 10;
  supply.audio_rate = 62.5;
  card::set_supply(supply);
  start();
  card::advance(4s);
  EXPECT_EQ(card::counters().mpeg4.made, 40u);
  EXPECT_EQ(card::counters().mpeg4.lost, 37u);
  EXPECT_EQ(card::counters().audio.made, 250u);
  EXPECT_EQ(card::counters().audio.lost, 250u - 64u);
}

TEST_F(NodeTest, ASupplyIsDeliveredRoundAndRoundUpToItsLimit) {
  for (const double rate : {0.0, 100.0}) {
    card::Supply supply;
    supply.mpeg4 = {card::mpeg4_frame(1, 0, {1}), card::mpeg4_frame(2, 1, {2}), card::mpeg4_frame(3, 1, {3})};
    supply.video_rate = rate;
    supply.limit = 7;
    card::set_supply(supply);
    EXPECT_EQ(read_mpeg4(), 0) << "before the start";
    start();
    card::advance(1s);
    std::vector<int> channels;
    while (read_mpeg4() > 0) channels.push_back(region[3] & 0xF);
    EXPECT_THAT(channels, ElementsAre(1, 2, 3, 1, 2, 3, 1));
    stop();
  }
  EXPECT_EQ(card::counters().mpeg4.delivered, 14u);
  EXPECT_EQ(card::counters().mjpeg.made, 0u) << "the card's own encoders rest meanwhile";
  card::clear_supply();
  encode_channel(0);
  start();
  card::advance_frames(2);
  EXPECT_EQ(card::counters().mjpeg.made, 2u);
  stop();
  EXPECT_EQ(read_mjpeg(), 0) << "a stop forgets what was encoded";
}

}  // namespace

// Frames on their way to the host: order, bounds, losses, supplies, and what the commands do to them.

#include "node_test.h"

namespace {

using testing::Each, testing::ElementsAre;

class NodeStreams : public NodeTest {
 protected:
  std::vector<u8> area(std::size_t offset, std::size_t size) {
    return {region + offset, region + offset + size};
  }
};

// The descriptors byte by byte, written by hand: a host parses exactly these.
TEST_F(NodeStreams, ReadyFramesCarryRightDescriptors) {
  card::queue_mpeg4(card::mpeg4_frame(11, 2, std::vector<u8>(0x12345, 0xAB), 3000005us));
  EXPECT_GT(read_mpeg4(), 0);
  EXPECT_THAT(area(0, 4), ElementsAre(0x45, 0x23, 0x81, 0x0B));
  EXPECT_THAT(area(20, 8), ElementsAre(3, 0, 0, 0, 5, 0, 0, 0));
  EXPECT_THAT(area(64, 0x12345), Each(0xAB));

  card::queue_mjpeg(card::mjpeg_frame(15, 352, 240, {1, 2, 0xFF, 0xD9}));
  EXPECT_EQ(read_mjpeg(), 20);
  EXPECT_THAT(area(driver::kMjpegAreaOffset + driver::kMjpegDescriptorOffset, 20),
              ElementsAre(15, 0, 0, 0, 0x60, 1, 0, 0, 240, 0, 0, 0, 0, 0, 0, 0, 1, 2, 0xFF, 0xD9));
}

// A card that lies is played as it is told to, but only inside its own regions.
TEST_F(NodeStreams, ReadyFramesAreNotCheckedAndDoNotOverflow) {
  card::queue_mpeg4({std::vector<u8>(driver::kMpeg4AreaSize + 5000, 1), 3L << 20});
  card::queue_mjpeg({std::vector<u8>(driver::kMjpegAreaSize, 2), -100000});
  card::queue_mpeg4({{}, -EIO});
  EXPECT_EQ(read_mpeg4(), 3L << 20);
  EXPECT_THAT(area(driver::kMjpegAreaOffset, 5000), Each(0));
  EXPECT_EQ(read_mjpeg(), -100000);
  EXPECT_THAT(area(driver::kMjpegAreaOffset, driver::kMjpegDescriptorOffset), Each(0));
  EXPECT_EQ(region[kRegion - 1], 2);
  EXPECT_EQ(read_mpeg4(), -EIO);
  EXPECT_EQ(read_node(encoder, nullptr, 4096), -EINVAL);
  EXPECT_EQ(read_node(video_input, nullptr, 4), -EINVAL);
}

TEST_F(NodeStreams, AudioGoesToTheHostsBuffer) {
  card::queue_audio({std::vector<u8>(200, 9), 4});
  EXPECT_EQ(read_audio(), 4);
  EXPECT_EQ(std::count(audio_blocks.begin(), audio_blocks.end(), 9), 4 * 48);
  card::queue_audio({std::vector<u8>(192, 9), 4});
  EXPECT_EQ(read_node(audio, nullptr, 4), -EFAULT);
  EXPECT_EQ(read_node(audio, audio_blocks.data(), 192), -EINVAL);
}

// Catches: a slow host that holds up the card, frames lost without being counted, a queue that stays full
// once it was.
TEST_F(NodeStreams, AHostThatDoesNotReadLosesFrames) {
  card::Supply supply;
  supply.mpeg4 = {card::mpeg4_frame(0, 0, std::vector<u8>(1 << 20, 1))};
  supply.audio = {{std::vector<u8>(192), 4}};
  supply.video_rate = 10;
  supply.audio_rate = 62.5;
  card::set_supply(supply);
  start();
  for (const unsigned read : {0u, 3u}) {
    card::advance(4s);
    const card::Counters counters = card::counters();
    EXPECT_EQ(counters.mpeg4.made - counters.mpeg4.lost, read + 3);
    EXPECT_EQ(counters.audio.made - counters.audio.lost, 64u);
    while (read_mpeg4() > 0) continue;
  }
  EXPECT_EQ(card::counters().mpeg4.made, 80u);
  EXPECT_EQ(card::counters().audio.made, 500u);
}

TEST_F(NodeStreams, ASupplyIsDeliveredRoundAndRoundUpToItsLimit) {
  encode(0);
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
  EXPECT_EQ(card::counters().mjpeg.made, 0u) << "the card's own encoders work beside the supply";
  card::clear_supply();
  start();
  card::advance_frames(2);
  EXPECT_EQ(card::counters().mjpeg.made, 2u);
  stop();
  EXPECT_EQ(read_mjpeg(), 0) << "a stop forgets what was encoded";
}

// Catches: encoder commands that are kept but reach no frame.
TEST_F(NodeStreams, EncoderCommandsChangeTheFrames) {
  encode(2, 1);
  card::apply("still=3");
  start();
  const auto sizes = [&] {
    card::advance_frames(1);
    const long mpeg4 = read_mpeg4();
    return std::pair(mpeg4, read_mjpeg());
  };
  const auto usual = sizes();
  const auto check = [&](u32 code, auto on, auto off, auto stream) {
    EXPECT_EQ(send(encoder, code, on), 0);
    EXPECT_GT(std::abs(sizes().*stream - usual.*stream), usual.*stream / 10) << code;
    EXPECT_EQ(send(encoder, code, off), 0);
    const auto restored = sizes();
    EXPECT_TRUE(restored.second == usual.second && std::abs(restored.first - usual.first) < 8) << code;
  };
  using Sizes = std::pair<long, long>;
  using driver::ChannelValue, driver::Cbr, driver::QpRange, driver::Register;
  check(driver::ENC_IOC_SET_QP, ChannelValue{2, 31}, ChannelValue{2, 10}, &Sizes::first);
  check(driver::ENC_IOC_SET_QP_RANGE, QpRange{2, 31, 31, 1}, QpRange{2, 0, 0, 0}, &Sizes::first);
  check(driver::ENC_IOC_SET_CBR, Cbr{2, 16000, 1}, Cbr{2, 0, 0}, &Sizes::first);
  check(driver::ENC_IOC_WRITE_REG, Register{driver::kRegMjpegQuality, driver::kMjpegCoarse},
        Register{driver::kRegMjpegQuality, driver::kMjpegFine}, &Sizes::second);
  EXPECT_EQ(send(encoder, driver::ENC_IOC_CHANNEL_NUMBER_ON, 2u), 0);
  EXPECT_NE(sizes().second, usual.second) << "the number";
  EXPECT_EQ(send(encoder, driver::ENC_IOC_CHANNEL_NUMBER_OFF, 2u), 0);
  EXPECT_EQ(sizes().second, usual.second);
}

}  // namespace

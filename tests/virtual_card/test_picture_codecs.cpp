// The two video streams, decoded: formats, intervals, times, settings.

#include <algorithm>

#include "picture/encoded_picture.h"
#include "picture_test.h"

namespace {

constexpr u32 kDropMode = 0x200;

struct Format {
  u32 scale_code, standard, input_width;
  u32 width, height;

  bool interlaced() const { return scale_code == kD1; }
  u32 interval() const { return interlaced() ? 0 : 1; }
};

class EveryFormat : public PictureTest, public testing::WithParamInterface<Format> {
 protected:
  EveryFormat() {
    state.standard = GetParam().standard;
    state.width = GetParam().input_width;
  }
};

// A header that does not match the stream, a frame out of order or of another channel, a drifting
// prediction, fields the wrong way up.
TEST_P(EveryFormat, BothStreamsDecodeBehindTheHostsHeaders) {
  const Format &format = GetParam();
  encode(11, format.scale_code, format.interval(), 7, 3);
  fields(40);
  const auto frames = take_mpeg4();
  const auto jpeg = take_jpeg();
  ASSERT_EQ(frames.size(), 20u);
  ASSERT_EQ(jpeg.size(), 20u);
  const auto pictures = decode_mpeg4(frames, format.width, format.height, format.interlaced());
  for (u32 i = 0; i < 20; ++i) {
    const Decoded still = decode_jpeg(jpeg[i]);
    for (const Decoded *picture : {&pictures[i], &still}) {
      ASSERT_EQ(std::pair(picture->width, picture->height), std::pair(format.width, format.height));
      ASSERT_EQ(picture->mark(), (FrameMark{11, i, false})) << "frame " << i;
    }
    EXPECT_TRUE(pictures[i].intra == (i % 7 == 0) && frames[i].intra == pictures[i].intra);
    EXPECT_EQ(pictures[i].interlaced, format.interlaced());
    EXPECT_TRUE(near(pictures[i].at(85, 60), still.at(85, 60)) &&
                near(pictures[i].at(18, 5), still.at(18, 5)));
  }
}

// A mark, or a picture, that only good settings bring through.
TEST_P(EveryFormat, CoarseStreamsAreSmallerAndKeepTheMark) {
  const Format &format = GetParam();
  const auto sizes = [&](u32 qp, u32 quality_word) {
    state.mjpeg_quality = quality_word;
    encode(2, format.scale_code, format.interval(), 5, qp);
    fields(10);
    const auto frames = take_mpeg4();
    const auto jpeg = take_jpeg();
    EXPECT_TRUE(frames.at(0).intra);
    const FrameMark first{2, static_cast<u32>(next / 2 - 5), false};
    EXPECT_EQ(decode_mpeg4(frames, format.width, format.height, format.interlaced()).at(0).mark(), first);
    EXPECT_EQ(decode_jpeg(jpeg.at(0)).mark(), first);
    return std::pair(frames[0].bytes.size(), jpeg[0].bytes.size());
  };
  const auto fine = sizes(2, driver::kMjpegFine);
  const auto coarse = sizes(31, driver::kMjpegCoarse);
  EXPECT_LT(coarse.first * 2, fine.first);
  EXPECT_LT(coarse.second * 10, fine.second * 9);
}

INSTANTIATE_TEST_SUITE_P(Formats, EveryFormat,
                         testing::Values(Format{kHalfD1, 0, 720, 720, 240}, Format{kCif, 1, 720, 352, 288},
                                         Format{kD1, 0, 720, 720, 480}, Format{kHalfD1, 1, 704, 704, 288},
                                         Format{kCif, 0, 704, 352, 240}, Format{kD1, 1, 704, 704, 576}));

// A rate that is off by one, or counts frames where it should count fields.
TEST_F(PictureTest, IntervalsPickTheirShareOf600Frames) {
  const struct {
    u32 code;
    int one_field, interlaced;
  } intervals[] = {{0, 1200, 600},
                   {1, 600, 300},
                   {2, 300, 200},
                   {29, 21, 20},
                   {30, 20, 20},
                   {kDropMode | 0, 0, 0},
                   {kDropMode | 2, 400, 400},
                   {kDropMode | 9, 540, 540}};
  for (const auto &interval : intervals) {
    int one_field = 0, interlaced = 0;
    for (std::int64_t field = 0; field < 1200; ++field) {
      if (card::picture_due(interval.code, false, field)) ++one_field;
      if (card::picture_due(interval.code, true, field)) ++interlaced;
    }
    EXPECT_NEAR(one_field, interval.one_field, 1) << "code " << interval.code;
    EXPECT_EQ(interlaced, interval.interlaced) << "code " << interval.code;
    EXPECT_NEAR(card::picture_rate(interval.code, false, 1), interval.one_field / 24.0, 0.1);
  }
}

// Two-field streams that hold one field twice, and times that are not the fields' own.
TEST_F(PictureTest, TwoFieldStreamHoldsBothFieldsInOrder) {
  encode(0, kCif, 0);
  fields(8);
  const auto frames = take_mpeg4();
  const auto pictures = decode_mpeg4(frames, 352, 240, false);
  ASSERT_EQ(pictures.size(), 8u);
  for (u32 i = 0; i < 8; ++i) {
    EXPECT_EQ(pictures[i].mark(), (FrameMark{0, i / 2, i % 2 != 0}));
    EXPECT_NEAR(static_cast<double>(frames[i].microseconds - frames[0].microseconds), i * 1001e6 / 60000, 2);
  }
}

// Picture times that run backwards where a second begins with an intra frame.
TEST_F(PictureTest, EachSecondIsCountedOnceWhereverItBegins) {
  for (const u32 gop : {1u, 10u}) {
    power_up();
    encode(3, kCif, 1, gop);
    fields(2 * 70);
    const auto frames = take_mpeg4();
    std::size_t seconds = 0;
    for (std::size_t i = 0; i < frames.size(); ++i) {
      const std::vector<u8> &bytes = frames[i].bytes;
      for (std::size_t bit = 34; (bytes[bit / 8] >> (7 - bit % 8)) & 1; ++bit) ++seconds;
      ASSERT_EQ(seconds, i * 1001 / 30000) << "frame " << i << ", GOP " << gop;
    }
    decode_mpeg4(frames, 352, 240, false);
  }
}

// Settings that take effect late, or leave the host with frames that build on another stream.
TEST_F(PictureTest, ChangedSettingsAndRestartsBeginWithAnIntraFrame) {
  encode(0, kCif, 1, 100, 8);
  const auto first_intra = [&] {
    fields(4);
    const auto frames = take_mpeg4();
    EXPECT_EQ(frames.size(), 2u);
    EXPECT_FALSE(frames.at(1).intra);
    return frames.at(0).intra;
  };
  EXPECT_TRUE(first_intra());
  EXPECT_FALSE(first_intra());
  state.channel[0].encoder.qp = 20;
  EXPECT_TRUE(first_intra());
  state.encoding = false;
  fields(2);
  EXPECT_TRUE(take_mpeg4().empty());
  state.encoding = true;
  EXPECT_TRUE(first_intra());
  engine.reset();
  EXPECT_TRUE(first_intra());
}

// A bit rate that ignores the channel's own frame rate, and a range that constant bit rate ignores.
TEST_F(PictureTest, ConstantBitRateHoldsAtAnyFrameRate) {
  const auto bits_a_second = [&](u32 interval, u32 rate, u32 least_quantiser) {
    power_up();
    encode(0, kCif, interval, 15);
    state.channel[0].encoder.cbr = {0, rate, 1};
    if (least_quantiser != 0) state.channel[0].encoder.qp_range = {0, 29, least_quantiser, 1};
    fields(300);
    double bits = 0;
    for (const Encoded &frame : take_mpeg4()) bits += 8.0 * static_cast<double>(frame.bytes.size());
    return bits / (300 * card::video_standard(state.standard).field_seconds());
  };
  EXPECT_NEAR(bits_a_second(1, 262144, 0), 262144, 262144 * 0.25);
  EXPECT_NEAR(bits_a_second(3, 262144, 0), 262144, 262144 * 0.25);
  EXPECT_LT(bits_a_second(1, 1048576, 20), 524288 / 2);
}

// Results that depend on which worker was first, and a power-up that keeps something.
TEST_F(PictureTest, EveryPowerUpMakesTheSameBytes) {
  const auto run = [&] {
    power_up();
    for (unsigned i = 0; i < card::kChannels; ++i) encode(i, i % 4 == 0 ? kD1 : kCif, i % 3, 4);
    fields(12);
    std::vector<std::vector<u8>> bytes;
    for (const auto &stream : {take_mpeg4(), take_jpeg()}) {
      for (const Encoded &frame : stream) bytes.push_back(frame.bytes);
    }
    return bytes;
  };
  const auto once = run();
  EXPECT_GT(once.size(), 100u);
  EXPECT_EQ(once, run());
}

// A burnt-in number that shows up in the preview or at a neighbour.
TEST_F(PictureTest, NumberOverlayIsInTheEncodedPicturesOnly) {
  for (const unsigned channel : {4u, 5u}) encode(channel, kHalfD1, 1);
  state.channel[4].encoder.number_overlay = true;
  window(4, {0, 0, 720, 480});
  const Colour with = look(4).at(2, 4), without = look(5).at(2, 4);  // left of the figures
  compose();
  EXPECT_TRUE(near(with, card::kBlack) && !near(without, card::kBlack));
  EXPECT_TRUE(near(pixel(14, 19), without));
}

}  // namespace

#include <gtest/gtest.h>

#include <algorithm>

#include "picture/encoded_picture.h"
#include "picture_bench.h"

namespace virtual_card {
namespace {

constexpr u32 kHalfD1 = 1, kCif = 2, kD1 = 9, kDropMode = 0x200;

struct Format {
  u32 scale_code, standard, input_width;
  u32 width, height;
};

class EveryFormat : public testing::TestWithParam<Format> {
 protected:
  EveryFormat() {
    bench_.state.standard = GetParam().standard;
    bench_.state.width = GetParam().input_width;
  }
  const bool interlaced_ = GetParam().scale_code == kD1;
  const u32 interval_ = interlaced_ ? 0 : 1;
  PictureBench bench_;
};

// A header that does not match the stream, a frame out of order or of another channel, a drifting
// prediction, fields the wrong way up.
TEST_P(EveryFormat, BothStreamsDecodeBehindTheHostsHeaders) {
  const Format &format = GetParam();
  bench_.encode(11, format.scale_code, interval_, 7, 3);
  bench_.fields(40);
  const auto mpeg4 = bench_.take_mpeg4();
  const auto jpeg = bench_.take_jpeg();
  ASSERT_EQ(mpeg4.size(), 20u);
  ASSERT_EQ(jpeg.size(), 20u);
  const auto pictures = decode_mpeg4(mpeg4, format.width, format.height, interlaced_);
  for (u32 i = 0; i < 20; ++i) {
    const Decoded still = decode_jpeg(jpeg[i]);
    for (const Decoded *picture : {&pictures[i], &still}) {
      ASSERT_EQ(std::pair(picture->width, picture->height), std::pair(format.width, format.height));
      ASSERT_EQ(picture->mark(), (FrameMark{11, i, false})) << "frame " << i;
    }
    EXPECT_TRUE(pictures[i].intra == (i % 7 == 0) && mpeg4[i].intra == pictures[i].intra);
    EXPECT_EQ(pictures[i].interlaced, interlaced_);
    EXPECT_TRUE(near(pictures[i].at(85, 60), still.at(85, 60)) &&
                near(pictures[i].at(18, 5), still.at(18, 5)));
  }
}

// A mark, or a picture, that only good settings bring through.
TEST_P(EveryFormat, CoarseStreamsAreSmallerAndKeepTheMark) {
  const Format &format = GetParam();
  const auto sizes = [&](u32 qp, u32 quality_word) {
    bench_.state.mjpeg_quality = quality_word;
    bench_.encode(2, format.scale_code, interval_, 5, qp);
    bench_.fields(10);
    const auto mpeg4 = bench_.take_mpeg4();
    const auto jpeg = bench_.take_jpeg();
    EXPECT_TRUE(mpeg4.at(0).intra);
    const u32 frame = static_cast<u32>(bench_.next / 2 - 5);
    EXPECT_EQ(decode_mpeg4(mpeg4, format.width, format.height, interlaced_).at(0).mark(),
              (FrameMark{2, frame, false}));
    EXPECT_EQ(decode_jpeg(jpeg.at(0)).mark(), (FrameMark{2, frame, false}));
    return std::pair(mpeg4[0].bytes.size(), jpeg[0].bytes.size());
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
TEST(Intervals, PicturesIn600Frames) {
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
      if (picture_due(interval.code, false, field)) ++one_field;
      if (picture_due(interval.code, true, field)) ++interlaced;
    }
    EXPECT_NEAR(one_field, interval.one_field, 1) << "code " << interval.code;
    EXPECT_EQ(interlaced, interval.interlaced) << "code " << interval.code;
    EXPECT_NEAR(picture_rate(interval.code, false, 1), interval.one_field / 24.0, 0.1);
  }
}

// Two-field streams that hold one field twice, and times that are not the fields' own.
TEST(Intervals, TwoFieldStreamHoldsBothFieldsInOrder) {
  PictureBench bench;
  bench.encode(0, kCif, 0);
  bench.fields(8);
  const auto frames = bench.take_mpeg4();
  const auto pictures = decode_mpeg4(frames, 352, 240, false);
  ASSERT_EQ(pictures.size(), 8u);
  for (u32 i = 0; i < 8; ++i) {
    EXPECT_EQ(pictures[i].mark(), (FrameMark{0, i / 2, i % 2 != 0}));
    EXPECT_NEAR(static_cast<double>(frames[i].microseconds - frames[0].microseconds), i * 1001e6 / 60000, 2);
  }
}

// Picture times that run backwards where a second begins with an intra frame.
TEST(Mpeg4, EachSecondIsCountedOnceWhereverItBegins) {
  for (const u32 gop : {1u, 10u}) {
    PictureBench bench;
    bench.encode(3, kCif, 1, gop);
    bench.fields(2 * 70);
    const auto frames = bench.take_mpeg4();
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
TEST(Mpeg4, ChangedSettingsAndRestartsBeginWithAnIntraFrame) {
  PictureBench bench;
  bench.encode(0, kCif, 1, 100, 8);
  const auto first_intra = [&] {
    bench.fields(4);
    const auto frames = bench.take_mpeg4();
    EXPECT_EQ(frames.size(), 2u);
    EXPECT_FALSE(frames.at(1).intra);
    return frames.at(0).intra;
  };
  EXPECT_TRUE(first_intra());
  EXPECT_FALSE(first_intra());
  bench.state.channel[0].encoder.qp = 20;
  EXPECT_TRUE(first_intra());
  bench.state.encoding = false;
  bench.fields(2);
  EXPECT_TRUE(bench.take_mpeg4().empty());
  bench.state.encoding = true;
  EXPECT_TRUE(first_intra());
  bench.engine.reset();
  EXPECT_TRUE(first_intra());
}

// A bit rate that ignores the channel's own frame rate, and a range that constant bit rate ignores.
TEST(Mpeg4, ConstantBitRateHoldsAtAnyFrameRate) {
  const auto bits_a_second = [](u32 interval, u32 rate, u32 least_quantiser) {
    PictureBench bench;
    bench.encode(0, kCif, interval, 15);
    bench.state.channel[0].encoder.cbr = {0, rate, 1};
    if (least_quantiser != 0) bench.state.channel[0].encoder.qp_range = {0, 29, least_quantiser, 1};
    bench.fields(300);
    double bits = 0;
    for (const Encoded &frame : bench.take_mpeg4()) bits += 8.0 * static_cast<double>(frame.bytes.size());
    return bits / (300 * video_standard(bench.state.standard).field_seconds());
  };
  EXPECT_NEAR(bits_a_second(1, 262144, 0), 262144, 262144 * 0.25);
  EXPECT_NEAR(bits_a_second(3, 262144, 0), 262144, 262144 * 0.25);
  EXPECT_LT(bits_a_second(1, 1048576, 20), 524288 / 2);
}

// Results that depend on which worker was first.
TEST(Streams, TwoEnginesMakeTheSameBytes) {
  const auto run = [] {
    PictureBench bench;
    for (unsigned i = 0; i < kChannels; ++i) bench.encode(i, i % 4 == 0 ? kD1 : kCif, i % 3, 4);
    bench.fields(12);
    std::vector<std::vector<u8>> bytes;
    for (const auto &stream : {bench.take_mpeg4(), bench.take_jpeg()}) {
      for (const Encoded &frame : stream) bytes.push_back(frame.bytes);
    }
    return bytes;
  };
  const auto once = run();
  EXPECT_GT(once.size(), 100u);
  EXPECT_EQ(once, run());
}

// A burnt-in number that shows up in the preview or at a neighbour.
TEST(Streams, NumberOverlayIsInTheEncodedPicturesOnly) {
  PictureBench bench;
  for (const unsigned channel : {4u, 5u}) bench.encode(channel, kHalfD1, 1);
  bench.state.channel[4].encoder.number_overlay = true;
  bench.window(4, {0, 0, 720, 480});
  const Colour with = bench.look(4).at(2, 4), without = bench.look(5).at(2, 4);  // left of the figures
  bench.compose();
  EXPECT_TRUE(near(with, kBlack) && !near(without, kBlack));
  EXPECT_TRUE(near(bench.pixel(14, 19), without));
}

}  // namespace
}  // namespace virtual_card

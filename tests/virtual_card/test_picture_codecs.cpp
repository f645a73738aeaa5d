// The two video streams, decoded: formats, intervals, times, settings.

#include <algorithm>

#include "picture/encoded_picture.h"
#include "picture_test.h"

namespace {

constexpr u32 kDropMode = 0x200;

// Catches: a header that does not match the stream, a frame out of order or of another channel, a drifting
// prediction, fields the wrong way up, coarse settings that spoil the mark.
TEST_F(PictureTest, BothStreamsDecodeBehindTheHostsHeaders) {
  const struct {
    u32 scale_code, standard, input_width, width, height;
  } formats[] = {{kHalfD1, 0, 720, 720, 240}, {kCif, 1, 720, 352, 288}, {kD1, 0, 720, 720, 480},
                 {kHalfD1, 1, 704, 704, 288}, {kCif, 0, 704, 352, 240}, {kD1, 1, 704, 704, 576}};
  for (const auto &format : formats)
    for (const bool fine : {true, false}) {
      SCOPED_TRACE(testing::Message() << (&format - formats) << (fine ? " fine" : " coarse"));
      power_up();
      state.standard = format.standard;
      state.width = format.input_width;
      state.mjpeg_quality = fine ? driver::kMjpegFine : driver::kMjpegCoarse;
      const bool interlaced = format.scale_code == kD1;
      encode(11, format.scale_code, interlaced ? 0 : 1, 7, fine ? 3 : 31);
      fields(40);
      const auto pictures = take(mpeg4), stills = take(mjpeg);
      ASSERT_EQ(pictures.size(), 20u);
      ASSERT_EQ(stills.size(), 20u);
      for (u32 i = 0; i < 20; ++i) {
        for (const Frame &frame : {pictures[i], stills[i]}) {
          ASSERT_EQ(std::pair(frame.width, frame.height), std::pair(format.width, format.height));
          ASSERT_EQ(frame.mark(), (FrameMark{11, i, false})) << "frame " << i;
        }
        EXPECT_EQ(pictures[i].intra, i % 7 == 0);
        EXPECT_EQ(pictures[i].interlaced, interlaced);
        EXPECT_TRUE(near(pictures[i].at(85, 60), stills[i].at(85, 60)));
        EXPECT_TRUE(near(pictures[i].at(18, 5), {162, 44, 142}, fine ? 12 : 20)) << "the yellow bar";
      }
    }
}

// Catches: a rate that is off by one, or counts frames where it should count fields.
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
      one_field += card::picture_due(interval.code, false, field);
      interlaced += card::picture_due(interval.code, true, field);
    }
    EXPECT_NEAR(one_field, interval.one_field, 1) << "code " << interval.code;
    EXPECT_EQ(interlaced, interval.interlaced) << "code " << interval.code;
    EXPECT_NEAR(card::picture_rate(interval.code, false, 1), interval.one_field / 24.0, 0.1);
  }
}

// Catches: a two-field stream that holds one field twice, times that are not the fields' own.
TEST_F(PictureTest, TwoFieldStreamHoldsBothFieldsInOrder) {
  encode(0, kCif, 0);
  fields(8);
  const auto frames = take(mpeg4);
  ASSERT_EQ(frames.size(), 8u);
  for (u32 i = 0; i < 8; ++i) {
    EXPECT_EQ(frames[i].mark(), (FrameMark{0, i / 2, i % 2 != 0}));
    EXPECT_NEAR(static_cast<double>(frames[i].microseconds - frames[0].microseconds), i * 1001e6 / 60000, 2);
  }
}

// Catches: picture times that run backwards where a second begins with an intra frame.
TEST_F(PictureTest, EachSecondIsCountedOnceWhereverItBegins) {
  for (const u32 gop : {1u, 10u}) {
    power_up();
    encode(3, kCif, 1, gop);
    fields(2 * 70);
    const auto frames = take(mpeg4);
    std::size_t seconds = 0;
    for (std::size_t i = 0; i < frames.size(); ++i) {
      const std::vector<u8> &bytes = frames[i].bytes;
      for (std::size_t bit = 34; (bytes[bit / 8] >> (7 - bit % 8)) & 1; ++bit) ++seconds;
      ASSERT_EQ(seconds, i * 1001 / 30000) << "frame " << i << ", GOP " << gop;
    }
  }
}

// Catches: settings that take effect late, or leave the host with frames that build on another stream.
TEST_F(PictureTest, ChangedSettingsAndRestartsBeginWithAnIntraFrame) {
  encode(0, kCif, 1, 100, 8);
  const auto first_intra = [&] {
    fields(4);
    const auto frames = take(mpeg4);
    EXPECT_TRUE(frames.size() == 2 && !frames[1].intra);
    return frames.at(0).intra;
  };
  EXPECT_TRUE(first_intra());
  EXPECT_FALSE(first_intra());
  state.channel[0].encoder.qp = 20;
  EXPECT_TRUE(first_intra());
  state.encoding = false;
  fields(2);
  EXPECT_TRUE(take(mpeg4).empty());
  state.encoding = true;
  EXPECT_TRUE(first_intra());
  engine.reset();
  EXPECT_TRUE(first_intra());
}

// Catches: a bit rate that ignores the channel's own frame rate, and a range that constant bit rate ignores.
TEST_F(PictureTest, ConstantBitRateHoldsAtAnyFrameRate) {
  const auto bits_a_second = [&](u32 interval, u32 rate, u32 least_quantiser) {
    power_up();
    encode(0, kCif, interval, 15);
    state.channel[0].encoder.cbr = {0, rate, 1};
    if (least_quantiser != 0) state.channel[0].encoder.qp_range = {0, 29, least_quantiser, 1};
    fields(300);
    double bits = 0;
    for (const Frame &frame : take(mpeg4)) bits += 8.0 * static_cast<double>(frame.bytes.size());
    return bits / (300 * card::video_standard(state.standard).field_seconds());
  };
  EXPECT_NEAR(bits_a_second(1, 262144, 0), 262144, 262144 * 0.25);
  EXPECT_NEAR(bits_a_second(3, 262144, 0), 262144, 262144 * 0.25);
  EXPECT_LT(bits_a_second(1, 1048576, 20), 524288 / 2);
}

// Catches: results that depend on which worker was first, and a power-up that keeps something.
TEST_F(PictureTest, EveryPowerUpMakesTheSameBytes) {
  const auto run = [&] {
    power_up();
    for (unsigned i = 0; i < card::kChannels; ++i) encode(i, i % 4 == 0 ? kD1 : kCif, i % 3, 4);
    fields(12);
    std::vector<std::vector<u8>> frames;
    for (card::FrameQueue *stream : {&mpeg4, &mjpeg})
      while (const auto frame = stream->pop(std::chrono::microseconds{0})) frames.push_back(frame->area);
    return frames;
  };
  const auto once = run();
  EXPECT_GT(once.size(), 100u);
  EXPECT_EQ(once, run());
}

}  // namespace

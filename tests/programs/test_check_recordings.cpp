// What zarvo_check says of recordings: rates, groups, sizes, sound, and what decodes.
#include <random>

#include "check_test.h"
#include "programs/check/decode.h"
#include "programs/common/libav.h"

namespace contract {
namespace {

/// Frames of a size at a rate; intra frames come every `group` frames.
Track frames_of(double rate, double seconds, std::size_t bytes = 500, u32 group = 30) {
  Track track;
  for (u32 n = 0; n < rate * seconds; ++n) {
    Frame frame{10 + n / rate, 0, std::vector<u8>(bytes, 0x55)};
    frame.data[3] = n % group == 0 ? 0x00 : 0xB6;
    track.push_back(frame);
  }
  return track;
}

TEST(CheckRate, IsTheSlopeOfAllArrivals) {
  Track track = frames_of(29.97, 4);
  EXPECT_NEAR(rate_of(track), 29.97, 0.001);
  track[0].time -= 0.3;
  track[119].time += 0.3;
  EXPECT_NEAR(rate_of(track), 29.97, 0.45);
  for (std::size_t n = 60; n < track.size(); ++n) track[n].time += 1;  // a second without frames
  EXPECT_LT(rate_of(track), 25);
  track.resize(2);
  EXPECT_EQ(rate_of(track), 0);
}

struct Recordings {
  Recording settings, ntsc, pal;
  std::array<Recording, 3> quality;
};

Recordings good_recordings() {
  Recordings all;
  Recording &settings = all.settings;
  settings.start = 10;
  for (u32 n = 0; n < 3; ++n) settings.mpeg4[n] = frames_of(29.97, 4, 500, n == 0 ? 1 : n == 1 ? 5 : 30);
  for (u32 n = 0; n < 3; ++n) settings.mpeg4[3 + n] = frames_of(29.97, 4, (128 + 64 * n) * 1000 / 240);
  settings.mpeg4[6] = frames_of(59.94, 4);
  std::mt19937 random(1);
  for (Track &track : settings.audio) {
    track = frames_of(62.5, 4, 48);
    for (Frame &block : track) std::ranges::generate(block.data, [&] { return static_cast<u8>(random()); });
  }
  all.ntsc.mpeg4[4] = frames_of(22.477, 4);
  all.ntsc.mjpeg[7] = frames_of(9.99, 4);
  all.pal.mpeg4[7] = frames_of(8.333, 12);
  for (u32 step = 0; step < 3; ++step)
    for (u32 n = 0; n < 4; ++n) {
      all.quality[step].mpeg4[n] = frames_of(30, 1, 3000 - 1000 * step);
      all.quality[step].mjpeg[n] = frames_of(30, 1, step == 0 ? 1000 : 2000);
    }
  return all;
}

class CheckRecordings : public testing::Test {
 protected:
  const Checks checks = all_checks();
  PreparedBench bench;
};

TEST_F(CheckRecordings, RatesGroupsAndBits) {
  using R = Recordings;
  const auto present = [&](const R &recordings) -> const Checks & {
    bench.recordings = {
        {"settings", recordings.settings}, {"rates-ntsc", recordings.ntsc}, {"rates-pal", recordings.pal}};
    for (u32 step = 0; step < 3; ++step)
      bench.recordings["quality-" + std::to_string(step)] = recordings.quality[step];
    return checks;
  };
  expect_rows<R>(
      good_recordings(), bench, present,
      {
          {"mpeg4.rate.ntsc.22.5", kBroken, [](R &r) { r.ntsc.mpeg4[4] = frames_of(22.477 * 1.022, 4); }},
          {"mpeg4.rate.ntsc.22.5", kHeld, [](R &r) { r.ntsc.mpeg4[4] = frames_of(22.477 * 1.018, 4); }},
          {"mpeg4.rate.pal.8.33", kBroken, [](R &r) { r.pal.mpeg4[7] = frames_of(8.333 * 0.978, 12); }},
          {"mjpeg.rate.10", kBroken, [](R &r) { r.ntsc.mjpeg[7] = frames_of(9.99 * 1.022, 4); }},
          {"mpeg4.two-fields", kBroken, [](R &r) { r.settings.mpeg4[6] = frames_of(29.97, 4); }},
          {"audio.rate.input-4", kBroken, [](R &r) { r.settings.audio[3] = frames_of(62.5 * 1.011, 4); }},
          {"mpeg4.group.5", kBroken, [](R &r) { r.settings.mpeg4[1][50].data[3] = 0xB6; }},
          {"mpeg4.group.5", kBroken, [](R &r) { r.settings.mpeg4[1].erase(r.settings.mpeg4[1].begin()); }},
          {"mpeg4.group.30", kHeld, [](R &r) { r.settings.mpeg4[2].resize(60); }},
          {"mpeg4.group.30", kBroken,
           [](R &r) { r.settings.mpeg4[2][60].data[3] = r.settings.mpeg4[2][90].data[3] = 0xB6; }},
          {"mpeg4.bit-rate.192", kBroken,
           [](R &r) { r.settings.mpeg4[4] = frames_of(29.97, 4, 192000 / 240 * 122 / 100); }},
          {"mpeg4.bit-rate.192", kHeld,
           [](R &r) { r.settings.mpeg4[4] = frames_of(29.97, 4, 192000 / 240 * 118 / 100); }},
          {"mpeg4.bit-rate.256", kHeld,
           [](R &r) { r.settings.mpeg4[5][7].data.resize(90000); }},  // not yet settled
          {"mpeg4.quantiser", kBroken, [](R &r) { std::swap(r.quality[0].mpeg4, r.quality[2].mpeg4); }},
          {"mpeg4.quantiser", kBroken, [](R &r) { r.quality[2].mpeg4[3].clear(); }},
          {"mjpeg.qualities", kBroken, [](R &r) { r.quality[2].mjpeg[3] = r.quality[0].mjpeg[3]; }},
          {"mjpeg.qualities", kBroken, [](R &r) { r.quality[0].mjpeg[3].clear(); }},
      });
}

TEST_F(CheckRecordings, SoundAgreesWithTheStatus) {
  const Recordings good = good_recordings();
  auto &audio = bench.recordings["settings"].audio;
  const auto silence = [&](u32 input) {
    for (Frame &block : audio[input]) std::ranges::fill(block.data, u8{0xFF});
  };
  const struct {
    const char *check;
    u32 signals;
    Outcome outcome;
    std::function<void()> change;
  } rows[] = {
      {"audio.sound.input-3", 0b1011, kSkipped, [] {}},
      {"audio.sound.input-3", 0b1111, kBroken, [&] { silence(2); }},
      {"audio.sound.input-3", 0b1111, kBroken, [&] { audio[2][7].data.resize(45); }},
      {"audio.silence", 0b0111, kBroken, [] {}},
      {"audio.silence", 0b0111, kHeld, [&] { silence(3); }},
      {"audio.block", 0b1111, kBroken, [&] { audio[3].back().data.resize(47); }},
      {"audio.block", 0b1111, kBroken, [&] { audio = {}; }},
      {"audio.apart", 0b0100, kSkipped, [] {}},
      {"audio.apart", 0b1001, kBroken, [&] { audio[3] = audio[0]; }},
  };
  for (std::size_t n = 0; n < std::size(rows); ++n) {
    bench.recordings["settings"] = good.settings;
    bench.sound_mask = rows[n].signals;
    rows[n].change();
    expect_outcome(checks, rows[n].check, bench, rows[n].outcome, n);
  }
}

/// Encodes ten pictures with stripes that move; Cb is 100, Cr is 180.
Track encoded(AVCodecID id, int width, int height, bool interlaced = false) {
  const libav::CodecContext encoder(avcodec_alloc_context3(avcodec_find_encoder(id)));
  encoder->width = width;
  encoder->height = height;
  encoder->time_base = {1, 25};
  encoder->pix_fmt = id == AV_CODEC_ID_MJPEG ? AV_PIX_FMT_YUVJ420P : AV_PIX_FMT_YUV420P;
  encoder->bit_rate = 4000000;
  encoder->flags = interlaced ? AV_CODEC_FLAG_INTERLACED_DCT : 0;
  libav::checked(avcodec_open2(encoder.get(), nullptr, nullptr), "encoder");
  const libav::PacketOwner packet(av_packet_alloc());
  Track track;
  for (int n = 0; n < 10; ++n) {
    const libav::FrameOwner picture(av_frame_alloc());
    picture->width = width;
    picture->height = height;
    picture->format = encoder->pix_fmt;
    picture->pts = n;
    libav::checked(av_frame_get_buffer(picture.get(), 0), "picture");
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x)
        picture->data[0][y * picture->linesize[0] + x] = (x + y + 4 * n) / 16 % 2 == 0 ? 60 : 140;
    for (const auto &[plane, value] : {std::pair(1, 100), std::pair(2, 180)})
      std::fill_n(picture->data[plane], picture->linesize[plane] * height / 2, static_cast<u8>(value));
    avcodec_send_frame(encoder.get(), picture.get());
    while (avcodec_receive_packet(encoder.get(), packet.get()) >= 0)
      track.push_back({0, 0, {packet->data, packet->data + packet->size}});
  }
  return track;
}

TEST_F(CheckRecordings, DamagedFramesAndWrongSizesAreNoticed) {
  constexpr auto kMpeg4 = AV_CODEC_ID_MPEG4, kMjpeg = AV_CODEC_ID_MJPEG;
  const Track film = encoded(kMpeg4, 352, 240), stills = encoded(kMjpeg, 352, 240);
  const auto damaged = [](Track track) {
    for (std::size_t n = 0; n < 40; ++n) track[5].data[track[5].data.size() / 3 + n] ^= 0xA7;
    return track;
  };
  const auto torn = [](Track track) {
    track[5].data.resize(track[5].data.size() / 2);
    return track;
  };
  Track two_sizes = encoded(kMpeg4, 352, 288);
  two_sizes.insert(two_sizes.end(), film.begin(), film.end());
  const struct {
    const char *check, *recording;
    u32 channel;
    Track mpeg4, mjpeg;
    Outcome outcome;
  } rows[] = {
      {"mpeg4.size.ntsc.720.cif", "size-ntsc-720", 1, film, {}, kHeld},
      {"mpeg4.size.ntsc.720.cif", "size-ntsc-720", 1, torn(film), {}, kBroken},
      {"mpeg4.size.ntsc.720.cif", "size-ntsc-720", 1, damaged(film), {}, kBroken},
      {"mpeg4.size.ntsc.720.cif", "size-ntsc-720", 1, two_sizes, {}, kBroken},
      {"mpeg4.size.pal.704.d1", "size-pal-704", 2, encoded(kMpeg4, 704, 576, true), {}, kHeld},
      {"mpeg4.decodes.settings", "settings", 6, film, {}, kHeld},
      {"mpeg4.decodes.settings", "settings", 15, torn(film), {}, kBroken},
      {"mjpeg.size.ntsc.720.cif", "size-ntsc-720", 1, {}, stills, kHeld},
      {"mjpeg.size.ntsc.720.cif", "size-ntsc-720", 1, {}, torn(stills), kBroken},
      {"mjpeg.size.ntsc.720.cif", "size-ntsc-720", 1, {}, damaged(stills), kBroken},
      {"mjpeg.size.ntsc.720.cif", "size-ntsc-720", 1, {}, {}, kBroken},
      {"mjpeg.size.pal.720.d1", "size-pal-720", 2, {}, encoded(kMjpeg, 720, 576), kHeld},
  };
  for (std::size_t n = 0; n < std::size(rows); ++n) {
    bench.recordings.clear();
    bench.recordings[rows[n].recording].mpeg4[rows[n].channel] = rows[n].mpeg4;
    bench.recordings[rows[n].recording].mjpeg[rows[n].channel] = rows[n].mjpeg;
    expect_outcome(checks, rows[n].check, bench, rows[n].outcome, n);
  }
  const Image image = decode_jpeg(stills[0]);
  ASSERT_EQ(std::tuple(image.width, image.height), std::tuple(352u, 240u));
  const Tones found = tones(image, image.all());
  EXPECT_NEAR(found.luma, 100, 3);
  EXPECT_NEAR(found.cb, 100, 3);
  EXPECT_NEAR(found.cr, 180, 3);
  EXPECT_TRUE(decode_jpeg(torn(stills)[5]).empty());
}

}  // namespace
}  // namespace contract

// Hours of recording on a fast card: every byte a callback was given is in its channel's files, through all
// rotations, and the card loses nothing. ZARVO_LONG_MINUTES of card time (1) are recorded with the card
// ZARVO_LONG_SPEED times as fast as real time (8).
#include <map>

#include "recording_fixture.h"
#include "zv_lib.h"

namespace {

constexpr int kRotations = 4;
constexpr double kVideoRate = 480;  // frames a second of sixteen channels

double setting(const char *name, double otherwise) {
  const char *text = std::getenv(name);
  return text != nullptr ? std::atof(text) : otherwise;
}

// A hash of all bytes of a channel, by the name of its folder.
using Hashes = std::map<std::string, std::uint64_t>;

void add(std::uint64_t &hash, std::string_view bytes) {
  for (const char byte : bytes) hash = hash * 0x100000001B3 + static_cast<std::uint8_t>(byte) + 1;
}

// What the callbacks were given; each belongs to one thread of the SDK.
Hashes video, audio;

template <auto &kHashes, auto kCallback>
void given(u32 channel, u8 *data, i32 length, i32 flags) {
  add(kHashes[(channel < 9 ? "CH0" : "CH") + std::to_string(channel + 1)],
      {reinterpret_cast<const char *>(data), static_cast<std::size_t>(length)});
  kCallback(channel, data, length, flags);
}

// Frames of all sizes up to a kilobyte, no two alike.
virtual_card::Supply frames() {
  virtual_card::Supply supply;
  std::uint32_t noise = 1;
  const auto bytes = [&noise](std::size_t size) {
    std::vector<std::uint8_t> data(size);
    for (std::uint8_t &byte : data)
      byte = static_cast<std::uint8_t>((noise = noise * 1664525 + 1013904223) >> 24);
    return data;
  };
  for (unsigned n = 0; n < 16 * 31; ++n) {
    supply.mpeg4.push_back(virtual_card::mpeg4_frame(n % 16, n / 16 % 8, bytes(100 + n * 2)));
    supply.mjpeg.push_back(virtual_card::mjpeg_frame(n % 16, 352, 240, {0x00, 0xFF, 0xD9}));
    supply.audio.push_back({bytes(192), 192});
  }
  supply.video_rate = kVideoRate;
  supply.audio_rate = 62.5;
  return supply;
}

// Waits until the card has handed out so many frames; false when none came for half a minute.
bool delivered(std::uint64_t due) {
  const auto handed_out = [] { return virtual_card::counters().mpeg4.delivered; };
  for (std::uint64_t seen = handed_out(); seen < due; seen = handed_out())
    if (!eventually([&] { return handed_out() > seen; })) return false;
  return true;
}

TEST_F(RecordingTest, EveryByteGivenToACallbackIsInTheFiles) {
  const double seconds = setting("ZARVO_LONG_MINUTES", 1) * 60;
  dialog.reset();
  video = audio = {};
  virtual_card::set_clock(virtual_card::ClockMode::fast, setting("ZARVO_LONG_SPEED", 8));
  virtual_card::set_supply(frames());
  dialog = std::make_unique<OpenDialog>();
  ASSERT_EQ(
      zv_RegisterCallBack(zv_handle, given<video, mpeg4_call_back>, nullptr, given<audio, audio_call_back>),
      ZV_OK);
  dialog->PreviewSplit16();
  dialog->StartPreview();
  start(1, 0xFFFF, 0xF);
  ASSERT_EQ(g_finish_record, 0);
  for (int part = 1;; ++part) {
    ASSERT_TRUE(delivered(static_cast<std::uint64_t>(kVideoRate * seconds * part / (kRotations + 1))));
    if (part > kRotations) break;
    fake_system::clock_now += 3600;
    printed_by([this] { dialog->TimerTick(); });
  }
  const virtual_card::Counters counters = virtual_card::counters();
  dialog->StopRecord();
  dialog->StopPreview();
  EXPECT_EQ(counters.mpeg4.lost + counters.audio.lost, 0u);
  EXPECT_GT(counters.previews, 0u);
  Hashes in_video, in_audio;
  for (const fs::path path : files()) {
    const bool rec = path.extension() == ".rec";
    add((rec ? in_video : in_audio)[path.parent_path().filename()], content_of(path).substr(rec ? 32 : 0));
  }
  EXPECT_EQ(in_video, video);
  EXPECT_EQ(in_audio, audio);
  EXPECT_EQ(files().size(), 20u * (kRotations + 1));
}

}  // namespace

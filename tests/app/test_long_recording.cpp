// Hours of recording on a fast card: every byte a callback was given is in its channel's files, through all
// rotations, and the card loses nothing. ZARVO_LONG_MINUTES of card time (1) are recorded with the card
// ZARVO_LONG_SPEED times as fast as real time (8).
#include "long_recording.h"
#include "recording_fixture.h"
#include "zv_lib.h"

namespace {

constexpr int kRotations = 4;

// What the callbacks were given; each belongs to one thread of the SDK.
Hashes video, audio;

template <auto &kHashes, auto kCallback>
void given(u32 channel, u8 *data, i32 length, i32 flags) {
  add(kHashes[folder_name(channel)],
      {reinterpret_cast<const char *>(data), static_cast<std::size_t>(length)});
  kCallback(channel, data, length, flags);
}

TEST_F(RecordingTest, EveryByteGivenToACallbackIsInTheFiles) {
  const double seconds = setting("ZARVO_LONG_MINUTES", 1) * 60;
  dialog.reset();
  video = audio = {};
  virtual_card::set_clock(virtual_card::ClockMode::fast, setting("ZARVO_LONG_SPEED", 8));
  virtual_card::set_supply(long_recording_frames());
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

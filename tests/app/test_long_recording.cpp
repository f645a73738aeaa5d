// Hours of recording on a fast card: every byte a callback was given is in its channel's files, through all
// rotations, and the card loses nothing. ZARVO_LONG_MINUTES of card time (1) are recorded with the card
// ZARVO_LONG_SPEED times as fast as real time (8).
#include <QCryptographicHash>
#include <QFile>
#include <array>
#include <memory>

#include "recording_fixture.h"
#include "zv_lib.h"

namespace {

constexpr int kRotations = 4;
constexpr double kVideoRate = 480;  // frames a second of sixteen channels
constexpr double kAudioRate = 62.5;
constexpr qint64 kHeaderBytes = 32;

double setting(const char *name, double otherwise) {
  const char *text = std::getenv(name);
  return text != nullptr ? std::atof(text) : otherwise;
}

using Hashes = std::array<std::unique_ptr<QCryptographicHash>, 16>;

void start_afresh(Hashes &hashes) {
  for (auto &hash : hashes) hash = std::make_unique<QCryptographicHash>(QCryptographicHash::Sha256);
}

void add(QCryptographicHash &hash, const u8 *data, i32 length) {
  hash.addData(QByteArrayView(data, length));
}

// What the callbacks were given; each array belongs to one thread of the SDK.
Hashes video;
Hashes audio;

void video_given(u32 channel, u8 *data, i32 length, i32 flags) {
  add(*video[channel], data, length);
  mpeg4_call_back(channel, data, length, flags);
}

void audio_given(u32 input, u8 *data, i32 length, i32 flags) {
  add(*audio[input], data, length);
  audio_call_back(input, data, length, flags);
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
  supply.audio_rate = kAudioRate;
  return supply;
}

std::string hash_of_files(const fs::path &root, const std::string &kind, unsigned number, qint64 header) {
  char folder[8];
  std::snprintf(folder, sizeof folder, "CH%02u", number + 1);
  std::set<fs::path> parts;
  for (const auto &entry : fs::recursive_directory_iterator(root / kind))
    if (entry.is_regular_file() && entry.path().parent_path().filename() == folder)
      parts.insert(entry.path());
  QCryptographicHash hash(QCryptographicHash::Sha256);
  for (const fs::path &part : parts) {
    QFile file(QString::fromStdString(part));
    EXPECT_TRUE(file.open(QIODevice::ReadOnly) && file.seek(header));
    hash.addData(&file);
  }
  EXPECT_EQ(parts.size(), kRotations + 1u);
  return hash.result().toHex().toStdString();
}

// Waits until the card has handed out so many frames; false when none came for half a minute.
bool delivered(std::uint64_t due) {
  const auto handed_out = [] { return virtual_card::counters().mpeg4.delivered; };
  for (std::uint64_t seen = handed_out(); seen < due; seen = handed_out())
    if (!eventually([&] { return handed_out() > seen; })) return false;
  return true;
}

class LongRecording : public RecordingTest {
 protected:
  void SetUp() override {
    start_afresh(video);
    start_afresh(audio);
    RecordingTest::SetUp();
  }
};

TEST_F(LongRecording, EveryByteGivenToACallbackIsInTheFiles) {
  const double speed = setting("ZARVO_LONG_SPEED", 8);
  const double seconds = setting("ZARVO_LONG_MINUTES", 1) * 60;
  dialog.reset();
  virtual_card::set_clock(virtual_card::ClockMode::fast, speed);
  virtual_card::set_supply(frames());
  dialog = std::make_unique<OpenDialog>();
  ASSERT_EQ(zv_RegisterCallBack(zv_handle, video_given, nullptr, audio_given), ZV_OK);
  dialog->PreviewSplit16();
  dialog->StartPreview();
  start(1, 0xFFFF, 0xF);
  ASSERT_EQ(g_finish_record, 0);
  for (int part = 1; part <= kRotations + 1; ++part) {
    const auto due = static_cast<std::uint64_t>(kVideoRate * seconds * part / (kRotations + 1));
    ASSERT_TRUE(delivered(due));
    if (part > kRotations) break;
    fake_system::clock_now += 3600;
    printed_by([this] { dialog->TimerTick(); });
  }
  const virtual_card::Counters counters = virtual_card::counters();
  dialog->StopRecord();
  dialog->StopPreview();
  EXPECT_EQ(counters.mpeg4.lost, 0u);
  EXPECT_EQ(counters.audio.lost, 0u);
  EXPECT_GT(counters.previews, 0u);
  for (unsigned n = 0; n < 16; ++n)
    EXPECT_EQ(hash_of_files(g_filepath, "Video", n, kHeaderBytes), video[n]->result().toHex().toStdString());
  for (unsigned n = 0; n < 4; ++n)
    EXPECT_EQ(hash_of_files(g_filepath, "Audio", n, 0), audio[n]->result().toHex().toStdString());
}

}  // namespace

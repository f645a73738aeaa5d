// Reads the blocks of an audio input.
#include "audio_reader.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>

namespace clips {
namespace {

constexpr Milliseconds kBlockLength = kBlockSamples * 1000 / kSampleRate;
/// How far from the change of the hour the file before may seem to end, if it was recorded through: the clock
/// of the samples is not that of the wall.
constexpr Milliseconds kSameRun = 2000;

Milliseconds start_of(const Recording &audio, const std::vector<Recording> &video) {
  for (const Recording &beside : video)
    if (beside.hour == audio.hour && beside.part == audio.part) return beside.start.value_or(*audio.hour);
  return *audio.hour;
}

std::int64_t blocks_of(const Recording &audio) {
  return static_cast<std::int64_t>(std::filesystem::file_size(audio.path) / kBlockBytes);
}

}  // namespace

std::vector<Stretch> audio_stretches(const std::vector<Recording> &audio,
                                     const std::vector<Recording> &video) {
  std::vector<Stretch> stretches;
  const Recording *before = nullptr;
  for (const Recording &recording : audio) {
    // A video file begins with an intra frame, so the audio of a new hour is there first.
    const bool goes_on = recording.part == 0 && before != nullptr && before->number == recording.number &&
                         std::abs(stretches.back().to - *recording.hour) <= kSameRun;
    const Milliseconds start = goes_on ? *recording.hour : start_of(recording, video);
    stretches.push_back({start, start + blocks_of(recording) * kBlockLength});
    before = &recording;
  }
  return stretches;
}

AudioReader::AudioReader(const std::vector<Recording> &audio, const std::vector<Recording> &video,
                         Milliseconds from, Report &report) {
  const std::vector<Stretch> stretches = audio_stretches(audio, video);
  for (std::size_t i = 0; i < audio.size(); ++i) {
    if (stretches[i].to <= from) continue;
    files_.push_back({audio[i].path, stretches[i], blocks_of(audio[i])});
    if (std::filesystem::file_size(audio[i].path) % kBlockBytes != 0)
      report.skipped(audio[i].path + ": the last block is torn: skipped");
  }
}

void AudioReader::seek(Milliseconds time) {
  file_ = 0;
  while (file_ < files_.size() && files_[file_].recorded.to <= time) ++file_;
  const Milliseconds into =
      file_ < files_.size() ? std::max<Milliseconds>(time - files_[file_].recorded.from, 0) : 0;
  block_ = (into + kBlockLength - 1) / kBlockLength;
  stream_.close();
}

bool AudioReader::next(AudioBlock &block, Milliseconds until) {
  while (file_ < files_.size() && block_ >= files_[file_].blocks) {
    ++file_;
    block_ = 0;
    stream_.close();
  }
  if (file_ == files_.size()) return false;
  const File &file = files_[file_];
  block.time = file.recorded.from + block_ * kBlockLength;
  if (block.time >= until) return false;
  if (!stream_.is_open()) {
    stream_.open(file.path, std::ios::binary);
    stream_.seekg(block_ * static_cast<std::streamoff>(kBlockBytes));
  }
  if (!stream_.read(block.data.data(), kBlockBytes)) throw std::runtime_error(file.path + ": cannot be read");
  ++block_;
  return true;
}

}  // namespace clips

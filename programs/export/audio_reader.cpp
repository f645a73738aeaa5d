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

/// Returns how many blocks a file has; 0 if it has vanished.
std::int64_t blocks_of(const Recording &audio) {
  std::error_code error;
  const std::uintmax_t size = std::filesystem::file_size(audio.path, error);
  return error ? 0 : static_cast<std::int64_t>(size / kBlockBytes);
}

/// Returns when the audio of a file without an index begins.
Milliseconds start_of(const Recording &audio, const std::vector<Recording> &video) {
  for (const Recording &beside : video)
    if (beside.hour && beside.hour->overlaps(*audio.hour) && beside.part == audio.part)
      return beside.start.value_or(audio.hour->from);
  return audio.hour->from;
}

/// Adds the runs that an index tells.
void add_runs(const std::vector<Recording> &audio, std::size_t file, std::vector<AudioRun> &runs) {
  using Kind = recording::IndexEntry::Kind;
  AudioRun run{file};
  bool begun = false, gap = false;
  const auto end_run = [&](std::int64_t block) {
    run.blocks = block - run.block;
    if (run.blocks <= 0) return;
    // Without an index, the time in front is an estimate.
    run.set_back =
        !runs.empty() && !audio[runs.back().file].index.empty() && run.start < runs.back().end() - kSetBack;
    runs.push_back(run);
  };
  for (const recording::IndexEntry &entry : audio[file].index) {
    gap = gap || entry.kind == Kind::gap || entry.kind == Kind::buffer;
    if (entry.kind != Kind::intra) continue;
    const std::int64_t block = entry.offset / static_cast<std::int64_t>(kBlockBytes);
    // The time is that of the block's end.
    const Milliseconds start = entry.time - kBlockLength;
    const Milliseconds late = start - run.start - (block - run.block) * kBlockLength;
    if (begun && !gap && late <= kJitter && late >= -kSetBack) continue;
    if (begun) end_run(block);
    run = {file, block, 0, start};
    begun = true;
    gap = false;
  }
  end_run(blocks_of(audio[file]));
}

}  // namespace

Milliseconds AudioRun::end() const {
  return start + blocks * kBlockLength;
}

std::vector<AudioRun> audio_runs(const std::vector<Recording> &audio, const std::vector<Recording> &video) {
  std::vector<AudioRun> runs;
  for (std::size_t file = 0; file < audio.size(); ++file) {
    const Recording &recording = audio[file];
    if (!recording.index.empty()) {
      add_runs(audio, file, runs);
      continue;
    }
    // A video file begins with an intra frame, so the audio of a new hour is there first.
    const bool goes_on = recording.part == 0 && !runs.empty() &&
                         audio[runs.back().file].number == recording.number &&
                         std::abs(runs.back().end() - recording.hour->from) <= kSameRun;
    runs.push_back(
        {file, 0, blocks_of(recording), goes_on ? recording.hour->from : start_of(recording, video)});
  }
  return runs;
}

AudioReader::AudioReader(const std::vector<Recording> &audio, const std::vector<Recording> &video,
                         Milliseconds from, Report &report)
    : runs_(audio_runs(audio, video)), report_(report) {
  std::erase_if(runs_, [from](const AudioRun &run) { return run.end() <= from; });
  for (std::size_t file = 0; file < audio.size(); ++file) {
    paths_.push_back(audio[file].path);
    const auto needs_it = [file](const AudioRun &run) { return run.file == file; };
    std::error_code error;
    const std::uintmax_t size = std::filesystem::file_size(paths_.back(), error);
    if (error)
      report.skipped(paths_.back() + ": " + error.message());
    else if (std::ranges::any_of(runs_, needs_it) && size % kBlockBytes != 0)
      report.skipped(paths_.back() + ": the last block is torn: skipped");
  }
}

void AudioReader::seek(Milliseconds time) {
  run_ = pass_;
  while (run_ < runs_.size() && runs_[run_].end() <= time) ++run_;
  const Milliseconds into = run_ < runs_.size() ? std::max<Milliseconds>(time - runs_[run_].start, 0) : 0;
  block_ = (into + kBlockLength - 1) / kBlockLength;
  stream_.close();
}

void AudioReader::set_back() {
  for (std::size_t run = pass_ + 1; run < runs_.size(); ++run)
    if (runs_[run].set_back) {
      pass_ = run;
      return;
    }
}

bool AudioReader::next(AudioBlock &block, Milliseconds until) {
  while (run_ < runs_.size() && block_ >= runs_[run_].blocks) {
    if (run_ + 1 < runs_.size() && runs_[run_ + 1].set_back) return false;
    ++run_;
    block_ = 0;
    stream_.close();
  }
  if (run_ == runs_.size()) return false;
  AudioRun &run = runs_[run_];
  block.time = run.start + block_ * kBlockLength;
  if (block.time >= until) return false;
  if (!stream_.is_open()) {
    stream_.open(paths_[run.file], std::ios::binary);
    stream_.seekg((run.block + block_) * static_cast<std::streamoff>(kBlockBytes));
  }
  if (!stream_.read(block.data.data(), kBlockBytes)) {
    report_.skipped(paths_[run.file] + ": cannot be read from " + local_text(block.time) + " on: skipped");
    run.blocks = block_;
    return next(block, until);
  }
  ++block_;
  return true;
}

}  // namespace clips

// Makes a clip of recordings.
#include "clip.h"

#include <unistd.h>

#include <algorithm>
#include <utility>

#include "programs/common/stop_signal.h"

namespace clips {
namespace {

/// Bytes of the MPEG-4 stream header in front of each intra frame.
constexpr std::size_t kStreamHeader = 20;
/// A clip that misses less than this at its ends has what was asked for.
constexpr Milliseconds kNear = 1000;
/// The offset of the first frame of a recording.
constexpr std::int64_t kFirstFrame = sizeof(RECORD_FILE_HEADER);

/// The longest time that a frame is shown in mp4. It counts in 32 bits, of up to 60000 ticks a second.
constexpr Milliseconds kLongestInMp4 = kHour;

/// Returns the offset of the last intra frame at or before a time, but of none behind a place where the clock
/// was set back; 0 without an index.
std::int64_t intra_before(const Recording &recording, Milliseconds time) {
  std::int64_t offset = 0;
  Milliseconds before = Stretch().from;
  for (const recording::IndexEntry &entry : recording.index) {
    if (entry.kind != recording::IndexEntry::Kind::intra) continue;
    if (entry.time > time || entry.time + kSetBack < before) break;
    offset = entry.offset;
    before = entry.time;
  }
  return offset;
}

/// Returns the offset of the last intra frame in front of a time, wherever the clock was set back; -1 without
/// one and without an index.
std::int64_t last_before(const Recording &recording, Milliseconds time) {
  std::int64_t offset = -1;
  for (const recording::IndexEntry &entry : recording.index)
    if (entry.kind == recording::IndexEntry::Kind::intra && entry.time < time) offset = entry.offset;
  return offset;
}

}  // namespace

Clip::Clip(const Options &options, std::vector<Stretch> stretches, AudioReader *audio, Report &report)
    : options_(options),
      stretches_(std::move(stretches)),
      audio_(audio),
      report_(report),
      output_(options.output, options.force) {}

void Clip::add(const Recording &recording) try {
  StreamReader reader(recording.path);
  if (!accept(recording, reader)) return;
  timeline_->begin_file(recording.index, recording.start);
  // Files that the user names follow each other, whatever is between them.
  if (!options_.files.empty()) writing_ = false;
  if (!recording.index.empty()) choose_stretch(*recording.start);
  stray_.clear();
  const std::int64_t last = last_before(recording, stretches_.back().to);
  Group group;
  bool seek = true;
  while (!stopping && (stretch_ < stretches_.size() || group.end() <= last)) {
    // Between two stretches, and in front of the first, the index tells where to go on.
    seek = seek && stretch_ < stretches_.size();
    const std::int64_t target = seek ? intra_before(recording, stretches_[stretch_].from) : 0;
    if (target > group.end()) reader.seek(target);
    if (!reader.next(group)) break;
    const std::size_t before = stretch_;
    add_group(recording, group);
    seek = stretch_ != before;
  }
  report_stray(recording);
} catch (const RecordingError &error) {
  report_.skipped(error.what());
}

/// Returns whether a recording has the format of the clip.
bool Clip::accept(const Recording &recording, const StreamReader &reader) {
  const VideoFormat format = format_of(reader, recording, options_.two_fields);
  if (format_ && !same(*format_, format)) {
    report_.skipped(recording.path +
                    ": skipped, its size, codec or rate is not that of the recordings before");
    return false;
  }
  const std::string label = recording::label_of(reader.header());
  if (format_ && label != label_)
    report_.note(recording.path + " is of " + label + ", the first recording of " + label_ +
                 ": joined all the same");
  if (format_) return true;
  format_ = format;
  label_ = label;
  timeline_.emplace(format.rate);
  checker_.emplace(format.codec);
  return true;
}

/// Chooses the first stretch that ends behind a time. The clock may have been set back.
void Clip::choose_stretch(Milliseconds time) {
  const auto chosen =
      std::ranges::partition_point(stretches_, [time](const Stretch &stretch) { return stretch.to <= time; });
  const auto number = static_cast<std::size_t>(chosen - stretches_.begin());
  if (number != stretch_) writing_ = false;
  stretch_ = number;
}

/// Reports bytes at the end of a recording that belong to no frame, if the recording is asked for.
void Clip::report_stray(const Recording &recording) {
  if (stray_.empty() || stretch_ == stretches_.size()) return;
  if (!recording.hour || recording.hour->overlaps(stretches_[stretch_])) report_.skipped(stray_);
}

void Clip::add_group(const Recording &recording, Group &group) {
  if (group.sizes.empty() && group.lost == 0) {
    stray_ = recording.path + ": bytes " + std::to_string(group.offset) + " to " +
             std::to_string(group.end()) + " belong to no intra frame: skipped";
    return;
  }
  const std::string stray = std::exchange(stray_, "");
  place_frames(group);
  report_clock(group);
  anew_ = anew_ || places_.front().back > kSetBack;
  const Milliseconds end = places_.back().end;
  choose_stretch(places_.front().time);
  if (stretch_ == stretches_.size() || end <= stretches_[stretch_].from) {
    anew_ = true;
    return;
  }
  // Stretches that meet in this group become one.
  Stretch &stretch = stretches_[stretch_];
  const auto later = stretches_.begin() + static_cast<std::ptrdiff_t>(stretch_) + 1;
  while (later != stretches_.end() && later->from < end) {
    stretch.to = later->to;
    stretches_.erase(later);
  }
  if (!stray.empty()) report_.skipped(stray);
  check_frames(recording, group);
  if (group.sizes.empty()) return;
  const bool joined = writing_;
  if (!writing_ || anew_) begin_stretch(recording, group);
  write_frames(group, stretch.to, joined);
  show_progress();
}

/// Writes the frames in front of a time. `joined`: the clip should have no hole in front of them.
void Clip::write_frames(const Group &group, Milliseconds until, bool joined) {
  std::size_t at = 0;
  for (std::size_t frame = 0; frame < group.sizes.size(); at += group.sizes[frame++]) {
    const Timeline::Place &place = places_[frame];
    if (place.time >= until) break;
    if (joined || frame > 0) {
      if (place.hole > 0) report_hole(place);
      shorten_hole(place);
      audio_shift_ -= place.back;
      if (audio_ != nullptr && place.back > kSetBack) audio_->seek(place.time);
    }
    write_audio(place.time);
    end_ = place.end;
    next_ = place.period - shift_;
    muxer_->write_video(group.data.subspan(at, group.sizes[frame]), next_++, frame == 0);
  }
}

void Clip::report_hole(const Timeline::Place &place) {
  char seconds[32];
  std::snprintf(seconds, sizeof seconds, "%.2f",
                static_cast<double>(timeline_->length_of(place.hole)) / 1000);
  report_.skipped("no pictures from " + local_text(place.time - timeline_->length_of(place.hole)) + " to " +
                  local_text(place.time) + ", for " + seconds + " seconds");
}

/// In mp4, leaves out what is longer than an hour of the time in front of a frame.
void Clip::shorten_hole(const Timeline::Place &place) {
  const std::int64_t longest = timeline_->periods_in(kLongestInMp4);
  const std::int64_t excess = place.period - shift_ - next_ - longest;
  if (excess <= 0 || !options_.output.ends_with(".mp4")) return;
  report_.skipped("the hole before " + local_text(place.time) +
                  " lasts an hour in the clip: mp4 holds no longer one, mkv does");
  write_audio(end_ + timeline_->length_of(longest));
  shift_ += excess;
  audio_shift_ += timeline_->length_of(excess);
  if (audio_ != nullptr) audio_->seek(place.time);
}

/// Says where the clock was set back. Files that the user names may be in any order.
void Clip::report_clock(const Group &group) {
  if (!options_.files.empty() && group.offset == kFirstFrame) return;
  for (const Timeline::Place &place : places_) {
    if (place.back <= kSetBack) continue;
    report_.note("the clock was set back to " + local_text(place.time) + ", by " + length_text(place.back));
    if (audio_ != nullptr) audio_->set_back();
  }
}

void Clip::place_frames(const Group &group) {
  places_.clear();
  std::int64_t offset = group.offset;
  for (const std::size_t size : group.sizes) {
    places_.push_back(timeline_->place(offset));
    offset += static_cast<std::int64_t>(size);
  }
  std::size_t lost = group.lost;
  if (places_.empty()) {
    places_.push_back(timeline_->place(group.offset));
    --lost;
  }
  timeline_->skip(lost);
}

/// Takes damaged frames off a group, and says so.
void Clip::check_frames(const Recording &recording, Group &group) {
  const bool mpeg4 = format_->codec == VIDEO_CODEC_ZV_MPEG4;
  if (options_.check || (mpeg4 && group.last)) group.keep(checker_->whole_frames(group));
  if (mpeg4 && !group.sizes.empty() && muxer_ &&
      !std::ranges::equal(stream_header_, group.data.first(std::min(kStreamHeader, group.sizes[0]))))
    group.keep(0);
  std::int64_t offset = group.offset;
  for (const std::size_t size : group.sizes) offset += static_cast<std::int64_t>(size);
  if (offset == group.end()) return;
  const std::string place = recording.path + ": the frame at byte " + std::to_string(offset);
  if (group.last && group.lost == 1)
    report_.skipped(place + ", the last one, is torn: skipped");
  else
    report_.skipped(place + " is damaged: " + std::to_string(group.lost) + " frames skipped");
}

/// The stretch begins with the intra frame of a group; it follows the stretch before without a gap.
void Clip::begin_stretch(const Recording &recording, const Group &group) {
  const Milliseconds begin = places_.front().time;
  if (audio_ != nullptr && muxer_ != nullptr) write_audio(end_);
  shift_ = places_.front().period - next_;
  audio_shift_ = begin - timeline_->length_of(next_);
  if (audio_ != nullptr) audio_->seek(begin);
  places_.front().back = 0;
  writing_ = true;
  anew_ = false;
  if (muxer_ != nullptr) return;
  begin_ = begin;
  if (format_->codec == VIDEO_CODEC_ZV_MPEG4) {
    const auto header = group.data.first(std::min(kStreamHeader, group.sizes[0]));
    stream_header_.assign(header.begin(), header.end());
  }
  const bool dated = recording.start.has_value();
  ClipFormat format{*format_, stream_header_, options_.output.ends_with(".mp4"), audio_ != nullptr, "", {}};
  if (dated) format.created = begin;
  format.title = label_ + (dated ? ", " + local_text(begin) : "");
  muxer_ = std::make_unique<Muxer>(output_.path(), format);
}

/// Writes the audio in front of a time.
void Clip::write_audio(Milliseconds until) {
  AudioBlock block;
  while (audio_ != nullptr && audio_->next(block, until))
    muxer_->write_audio({reinterpret_cast<const std::uint8_t *>(block.data.data()), block.data.size()},
                        (block.time - audio_shift_) * kSampleRate / 1000);
}

void Clip::finish() {
  if (stopping) throw std::runtime_error("stopped; no clip is written");
  if (muxer_ == nullptr) throw std::runtime_error("no picture is recorded there; no clip is written");
  write_audio(end_);
  muxer_->finish();
  output_.commit();
  if (!options_.motion && begin_ > options_.range.from + kNear && options_.range.from > Stretch().from)
    report_.note("nothing is recorded before " + local_text(begin_));
  if (!options_.motion && end_ < options_.range.to - kNear && options_.range.to < Stretch().to)
    report_.note("nothing is recorded after " + local_text(end_));
  if (shown_ >= 0) std::fprintf(stderr, "\r%s  done\n", length_text(timeline_->length_of(next_)).c_str());
}

/// Shows the length of the clip so far on a terminal, every minute of it.
void Clip::show_progress() {
  const Milliseconds length = timeline_->length_of(next_);
  if (length < shown_ + 60000 || isatty(STDERR_FILENO) == 0) return;
  shown_ = length;
  std::fprintf(stderr, "\r%s", length_text(length).c_str());
}

}  // namespace clips

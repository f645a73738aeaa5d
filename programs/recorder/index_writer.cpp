// Writes an index.
#include "index_writer.h"

#include <unistd.h>

#include <cerrno>
#include <utility>

namespace recorder {

using recording::IndexEntry;
using Kind = IndexEntry::Kind;

namespace {

/// The most bytes and events kept for a disk that takes nothing. Further lines are not written.
constexpr std::size_t kMostText = 65536;
constexpr std::size_t kMostEarly = 100;

}  // namespace

void IndexWriter::add(const IndexEntry &entry) {
  if (text_.size() < kMostText) text_ += to_line(entry);
}

void IndexWriter::add(Kind kind, std::int64_t time, std::int64_t offset) {
  group_.kind = kind;
  group_.time = time;
  group_.offset = offset;
  add(group_);
  group_ = {};
}

void IndexWriter::begin(int file, std::int64_t time, std::int64_t offset) {
  file_ = file;
  error_taken_ = false;
  text_.clear();
  group_ = {};
  start_.kind = Kind::start;
  start_.time = end_ = time;
  start_.offset = offset;
  add(start_);
  for (IndexEntry &event : early_) {
    event.offset = offset;
    add(event);
  }
  early_.clear();
}

void IndexWriter::add_frame(const Frame &frame, std::int64_t offset, std::uint32_t lost) {
  if (file_ < 0) return;
  IndexEntry event;
  event.time = frame.time;
  event.offset = offset;
  if (lost > 0) {
    event.kind = Kind::buffer;
    event.frames = lost;
    add(event);
  }
  if (frame.gap_ms > 0) {
    event.kind = Kind::gap;
    event.ms = frame.gap_ms;
    add(event);
  }
  const bool anew = group_.frames == 0 || group_.frames >= least_group_ || lost > 0 || frame.gap_ms > 0;
  if (frame.intra && anew) add(Kind::intra, frame.time, offset);
  ++group_.frames;
  group_.bytes += frame.length;
  group_.motion += frame.motion ? 1 : 0;
  group_.lost += frame.no_signal ? 1 : 0;
  end_ = frame.time + period_;
}

void IndexWriter::add_last_gap(std::int64_t time, std::int64_t offset, std::uint32_t gap_ms) {
  IndexEntry event;
  event.kind = Kind::gap;
  event.time = end_ = time;
  event.offset = offset;
  event.ms = gap_ms;
  add(event);
}

void IndexWriter::add_last_loss(std::int64_t offset, std::uint32_t lost) {
  IndexEntry event;
  event.kind = Kind::buffer;
  event.time = end_;
  event.offset = offset;
  event.frames = lost;
  add(event);
}

void IndexWriter::add_disk_error(std::int64_t time, std::int64_t offset, const std::string &error) {
  IndexEntry event;
  event.kind = Kind::disk;
  event.time = time;
  event.offset = offset;
  event.error = error;
  if (file_ >= 0)
    add(event);
  else if (early_.size() < kMostEarly)
    early_.push_back(event);
}

int IndexWriter::end(std::int64_t offset) {
  if (file_ < 0) return -1;
  add(Kind::stop, end_, offset);
  write();
  return std::exchange(file_, -1);
}

void IndexWriter::write() {
  if (file_ < 0 || text_.empty()) return;
  const ssize_t written = ::write(file_, text_.data(), text_.size());
  if (written > 0) text_.erase(0, static_cast<std::size_t>(written));
  if (written < 0 && !error_taken_) error_ = errno;
}

int IndexWriter::take_error() {
  if (error_ != 0) error_taken_ = true;
  return std::exchange(error_, 0);
}

}  // namespace recorder

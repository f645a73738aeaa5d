// Places frames in time, by the index of their file or by the frame rate alone.
#include "timeline.h"

#include <algorithm>
#include <cmath>

namespace clips {
void Timeline::begin_file(const std::vector<recording::IndexEntry> &index,
                          std::optional<Milliseconds> start) {
  index_ = &index;
  entry_ = 0;
  start_ = index.empty() ? start : std::nullopt;
}

Milliseconds Timeline::length_of(std::int64_t periods) const {
  return std::llround(static_cast<double>(periods) * 1000 * rate_.denominator / rate_.numerator);
}

std::int64_t Timeline::periods_in(Milliseconds length) const {
  return std::llround(static_cast<double>(length) * rate_.numerator / rate_.denominator / 1000);
}

Milliseconds Timeline::jitter() const {
  return std::max(kJitter, length_of(2));
}

/// Moves the next period to a time that is behind it. Never moves it back, because frames must stay in order:
/// if the clock was set back, the periods have earlier times from here on. Returns how much earlier.
Milliseconds Timeline::meet(Milliseconds time, bool gap) {
  if (!epoch_) epoch_ = time - length_of(next_);
  const Milliseconds late = time - time_of(next_);
  if (late > (gap ? length_of(1) / 2 : jitter())) next_ += periods_in(late);
  // Without an index the time is an estimate.
  if (late >= -jitter() || index_->empty()) return 0;
  *epoch_ += late;
  return -late;
}

Timeline::Place Timeline::place(std::int64_t offset) {
  using Kind = recording::IndexEntry::Kind;
  std::optional<Milliseconds> time = start_;
  start_.reset();
  bool gap = false;
  for (; entry_ < index_->size() && (*index_)[entry_].offset <= offset; ++entry_) {
    const recording::IndexEntry &entry = (*index_)[entry_];
    gap = gap || entry.kind == Kind::gap || entry.kind == Kind::buffer;
    if (gap || (entry.kind == Kind::intra && entry.offset == offset)) time = entry.time;
  }
  const std::int64_t expected = next_;
  const Milliseconds back = time ? meet(*time, gap) : 0;
  const std::int64_t period = next_++;
  // A small step without an event is the clock, which drifts against that of the card.
  const bool missing = gap || length_of(period - expected) > 2 * jitter();
  return {period, missing ? period - expected : 0, time_of(period), time_of(next_), back};
}

}  // namespace clips

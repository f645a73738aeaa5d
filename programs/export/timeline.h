/**
 * @file timeline.h
 * Places frames in time. Time is counted in periods of the frame rate: in an uninterrupted recording frames
 * follow each other by one period; gaps take whole periods.
 */
#ifndef EXPORT_TIMELINE_H
#define EXPORT_TIMELINE_H

#include <optional>
#include <vector>

#include "recording/frame_rates.h"
#include "recording/index.h"
#include "wall_time.h"

namespace clips {

class Timeline {
 public:
  explicit Timeline(recording::FrameRate rate) : rate_(rate) {}

  /// The next frames come from another file. `index` must stay valid; `start` is when its first frame was
  /// recorded, if known.
  void begin_file(const std::vector<recording::IndexEntry> &index, std::optional<Milliseconds> start);

  struct Place {
    std::int64_t period;  ///< the number of the period that shows the frame
    std::int64_t hole;    ///< how many periods in front of it have no frame, since frames are missing
    Milliseconds time;    ///< when the period began, by the clock of the recording
    Milliseconds end;     ///< and ended
    Milliseconds back;    ///< how far the clock was set back in front of it
  };
  /// Places the next frame, which is at an offset of the file.
  Place place(std::int64_t offset);
  /// Leaves out the periods of frames that are lost.
  void skip(std::size_t frames) { next_ += static_cast<std::int64_t>(frames); }

  /// Returns when a period begins, by the clock of the last frame.
  Milliseconds time_of(std::int64_t period) const { return epoch_.value_or(0) + length_of(period); }
  Milliseconds length_of(std::int64_t periods) const;
  std::int64_t periods_in(Milliseconds length) const;

 private:
  Milliseconds meet(Milliseconds time, bool gap);
  Milliseconds jitter() const;

  recording::FrameRate rate_;
  const std::vector<recording::IndexEntry> *index_ = nullptr;
  std::size_t entry_ = 0;              ///< the first entry that is not used yet
  std::optional<Milliseconds> start_;  ///< of a file without an index, until its first frame is placed
  std::optional<Milliseconds> epoch_;  ///< when period 0 begins
  std::int64_t next_ = 0;
};

}  // namespace clips

#endif

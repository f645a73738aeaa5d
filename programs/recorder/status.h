/**
 * @file status.h
 * What the recorder tells about itself while it records.
 */
#ifndef RECORDER_STATUS_H
#define RECORDER_STATUS_H

#include <array>
#include <string>

#include "recorder.h"
#include "shortfall.h"

namespace recorder {

class Status {
 public:
  explicit Status(const Recorder &recorder) : recorder_(recorder) {}

  /// Call it once a second. Says when a stream brings nothing for some seconds.
  void look_for_silence(Messages &messages);
  /// Call it once a second. Says at once, not only when the disk takes frames again, that the buffer is full.
  void look_for_overrun(Messages &messages);
  /// Call it once a minute. Says how many frames a stream is short of in this minute, and each hour, in this
  /// hour.
  void compare_with_expected(Messages &messages);

  /// Returns the state in a line.
  std::string line() const;
  /// Returns a table of all streams.
  std::string table() const;

 private:
  Shortfall::Counts counts(unsigned stream) const;

  const Recorder &recorder_;
  std::array<bool, kStreams> silent_{};
  std::uint64_t lost_ = 0;  ///< what the buffer had no space for, a second ago
  bool overrun_ = false;
  std::array<Shortfall, kStreams> shortfalls_;
};

}  // namespace recorder

#endif

/**
 * @file shortfall.h
 * How many frames of a stream have not come.
 */
#ifndef RECORDER_SHORTFALL_H
#define RECORDER_SHORTFALL_H

#include <cstdint>
#include <string>

namespace recorder {

/// Compares the frames of a stream with those that are due by the computer's clock. The card's clock runs up
/// to 200 millionths slower, which is no loss: what is due is counted anew each hour.
class Shortfall {
 public:
  /// What has come and what is due, since the first frame.
  struct Counts {
    std::uint64_t frames = 0, expected = 0;
  };

  /// Call it once a minute. Returns a text, such as "90 of 1798 were missing in the last minute", if more
  /// than 1 % were missing in this minute, or more than 0.05 % in an hour that ends, without what such
  /// minutes told.
  std::string end_minute(Counts now);

  /// Returns how many frames are missing in all.
  std::uint64_t missing(Counts now) const;

 private:
  std::uint64_t missing_in_hour(Counts now) const;

  Counts minute_, hour_;     ///< when they began
  unsigned minutes_ = 0;     ///< of this hour
  std::uint64_t told_ = 0;   ///< in the texts of this hour's minutes
  std::uint64_t hours_ = 0;  ///< missing in the hours before
};

}  // namespace recorder

#endif

/**
 * @file motion_detector.h
 * Motion of one channel: blocks of 16 x 16 pixels compared with the channel's threshold map.
 */
#ifndef VIRTUAL_CARD_MOTION_DETECTOR_H
#define VIRTUAL_CARD_MOTION_DETECTOR_H

#include <array>
#include <cstdint>
#include <mutex>
#include <vector>

#include "card_state.h"
#include "picture.h"

namespace virtual_card {

/// The blocks of a picture in which something moved.
struct MovedBlocks {
  u32 columns = 0;
  u32 rows = 0;
  std::vector<u8> moved;  ///< columns x rows

  bool at(u32 column, u32 row) const {
    return column < columns && row < rows && moved[std::size_t{row} * columns + column] != 0;
  }
};

class MotionDetector {
 public:
  MotionDetector();

  /// Writes a rectangle of thresholds, which must lie inside the map. Any thread.
  void set_thresholds(const driver::MotionMap &map);
  /// Sets the whole map. Any thread.
  void set_threshold(u16 level);

  /// Whether the detector looks at this field: the top field of every third frame.
  static bool looks_at(std::int64_t field);
  /// Compares the top field with the one looked at before.
  void look(const Picture &picture, std::int64_t field);
  /// Forgets what was seen: the next look has nothing to compare with.
  void forget();

  /// Motion is reported from the look that found it until the hold time is over.
  bool motion(std::int64_t field) const { return field < moving_until_; }
  const MovedBlocks &blocks() const { return blocks_; }

 private:
  std::mutex mutex_;  ///< guards the map, which commands write while the card looks
  std::array<u16, std::size_t{driver::kMotionMapSide} * driver::kMotionMapSide> map_{};
  Picture seen_;  ///< luma lines of the field looked at before; empty: none
  MovedBlocks blocks_;
  std::int64_t moving_until_ = INT64_MIN;
};

}  // namespace virtual_card

#endif

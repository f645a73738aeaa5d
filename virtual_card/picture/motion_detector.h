/**
 * @file motion_detector.h
 * Motion detection of one channel: compares the change of each 16 x 16 block with the block's threshold.
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

/// The blocks of a picture that show motion.
struct MovedBlocks {
  u32 columns = 0;
  u32 rows = 0;
  std::vector<u8> moved;  ///< columns x rows values, row by row; non-zero: motion

  /// Clears all blocks. On bad_alloc nothing has changed.
  void resize(u32 new_columns, u32 new_rows);
  bool at(u32 column, u32 row) const {
    return column < columns && row < rows && moved[std::size_t{row} * columns + column] != 0;
  }
};

/// The thresholds of a whole map, row by row.
using MotionThresholds = std::array<u16, std::size_t{driver::kMotionMapSide} * driver::kMotionMapSide>;

class MotionDetector {
 public:
  MotionDetector();

  /// Writes thresholds into a rectangle, which must lie inside the map. Any thread.
  void set_thresholds(const driver::MotionMap &map);
  /// Sets all thresholds of the map. Any thread.
  void set_threshold(u16 level);
  /// Any thread.
  MotionThresholds thresholds() const;

  /// Returns whether the detector looks at this field: the top field of every third frame.
  static bool looks_at(std::int64_t field);
  /// Compares the top field with the top field of the previous look.
  void look(const Picture &picture, std::int64_t field);
  /// Discards the previous field: the next look compares nothing and finds no motion.
  void forget();

  /// Returns whether there is motion: from the look that found it until the hold time is over.
  bool motion(std::int64_t field) const { return field < moving_until_; }
  const MovedBlocks &blocks() const { return blocks_; }

 private:
  mutable std::mutex mutex_;  ///< guards map_, which commands may write during a look
  MotionThresholds map_{};
  Picture seen_;  ///< luma of the previous field looked at; empty: none
  MovedBlocks blocks_;
  std::int64_t moving_until_ = INT64_MIN;
};

}  // namespace virtual_card

#endif

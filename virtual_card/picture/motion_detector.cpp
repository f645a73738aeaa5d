// Compares top fields block by block.
#include "motion_detector.h"

#include <algorithm>
#include <cstring>

#include "pixel_ops.h"

namespace virtual_card {

namespace {

constexpr std::int64_t kFramesPerLook = 3;
/// 300 ms of NTSC fields, so that steady motion is reported without gaps.
constexpr std::int64_t kHoldFields = 18;
constexpr u32 kBlockLines = driver::kMotionBlock / 2;  ///< lines of a block in one field
constexpr u32 kBlockSamples = driver::kMotionBlock * kBlockLines;
constexpr u32 kMaxColumns = driver::kMotionMapSide;

}  // namespace

void MovedBlocks::resize(u32 new_columns, u32 new_rows) {
  moved.assign(std::size_t{new_columns} * new_rows, 0);
  columns = new_columns;
  rows = new_rows;
}

MotionDetector::MotionDetector() {
  map_.fill(kDefaultMotionLevel);
}

void MotionDetector::set_thresholds(const driver::MotionMap &map) {
  const std::lock_guard lock(mutex_);
  for (u32 row = 0; row < map.rows; ++row) {
    std::copy_n(map.thresholds + std::size_t{row} * map.columns, map.columns,
                map_.begin() + (map.row + row) * driver::kMotionMapSide + map.column);
  }
}

void MotionDetector::set_threshold(u16 level) {
  const std::lock_guard lock(mutex_);
  map_.fill(level);
}

MotionThresholds MotionDetector::thresholds() const {
  const std::lock_guard lock(mutex_);
  return map_;
}

bool MotionDetector::looks_at(std::int64_t field) {
  return field % (2 * kFramesPerLook) == 0;
}

void MotionDetector::look(const Picture &picture, std::int64_t field) {
  const u32 field_height = picture.lines / 2;
  const bool comparable = seen_.width == picture.width && seen_.lines == field_height;
  blocks_.resize(picture.width / driver::kMotionBlock, picture.lines / driver::kMotionBlock);
  if (!comparable) {
    seen_.y.resize(std::size_t{picture.width} * field_height);
    seen_.width = picture.width;
    seen_.lines = field_height;
  }

  const std::lock_guard lock(mutex_);
  for (u32 row = 0; row < blocks_.rows; ++row) {
    std::array<u32, kMaxColumns> sums{};
    for (u32 line = row * kBlockLines; line < (row + 1) * kBlockLines; ++line) {
      if (comparable)
        add_differences(seen_.y_line(line), picture.y_line(2 * line), sums.data(), blocks_.columns);
      std::memcpy(seen_.y_line(line), picture.y_line(2 * line), picture.width);
    }
    for (u32 column = 0; column < blocks_.columns; ++column) {
      const u16 threshold = map_[row * driver::kMotionMapSide + column];
      if (threshold == driver::kNeverMoves || sums[column] <= threshold * kBlockSamples) continue;
      blocks_.moved[std::size_t{row} * blocks_.columns + column] = 1;
      moving_until_ = field + kHoldFields;
    }
  }
}

void MotionDetector::forget() {
  seen_ = {};
  blocks_ = {};
  moving_until_ = INT64_MIN;
}

}  // namespace virtual_card

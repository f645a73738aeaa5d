// Returns the field that precedes a field, and builds the clock text that a field shows.
#include "field.h"

#include <ctime>

namespace virtual_card {

namespace {

std::chrono::microseconds field_time(u32 standard) {
  return std::chrono::duration_cast<std::chrono::microseconds>(video_standard(standard).duration(1));
}

}  // namespace

Field Field::before() const {
  return {standard, number - 1, wall_time - field_time(standard)};
}

ClockText::ClockText(const Field &field) {
  // A bottom field shows the time of its top field, so that both fields of a frame have the same digits.
  const auto time = field.parity() != 0 ? field.before().wall_time : field.wall_time;
  const auto second = std::chrono::floor<std::chrono::seconds>(time);
  const auto frame = (time - second).count() * video_standard(field.standard).nominal_frames / 1'000'000;
  const std::time_t clock = second.count();
  std::tm local{};
  localtime_r(&clock, &local);
  const int pairs[] = {local.tm_hour, local.tm_min, local.tm_sec, static_cast<int>(frame)};
  constexpr char kSeparators[] = {':', ':', '.'};
  for (std::size_t i = 0; i < 4; ++i) {
    text_[3 * i] = static_cast<char>('0' + pairs[i] / 10);
    text_[3 * i + 1] = static_cast<char>('0' + pairs[i] % 10);
    if (i < 3) text_[3 * i + 2] = kSeparators[i];
  }
}

}  // namespace virtual_card

#include "field_moment.h"

#include <ctime>

namespace virtual_card {

namespace {

struct Rate {
  double field_seconds;
  int frames_a_second;  ///< as the clock counts them
};

constexpr Rate rate_of(u32 standard) {
  return standard == VIDEO_STANDARD_ZV_NTSC ? Rate{1001.0 / 60000.0, 30} : Rate{1.0 / 50.0, 25};
}

std::chrono::microseconds field_time(u32 standard) {
  return std::chrono::microseconds(static_cast<std::int64_t>(rate_of(standard).field_seconds * 1e6));
}

}  // namespace

FieldMoment::FieldMoment(u32 standard, std::int64_t field, std::chrono::microseconds wall_time)
    : number(field),
      seconds(static_cast<double>(field) * rate_of(standard).field_seconds),
      standard_(standard),
      wall_time_(wall_time) {
  // The clock of a bottom field is that of its frame, so that a still frame shows whole figures.
  const auto frame_time = parity() != 0 ? wall_time - field_time(standard) : wall_time;
  const auto second = std::chrono::floor<std::chrono::seconds>(frame_time);
  const auto frame = (frame_time - second).count() * rate_of(standard).frames_a_second / 1'000'000;
  const std::time_t time = second.count();
  std::tm local{};
  localtime_r(&time, &local);
  const int pairs[] = {local.tm_hour, local.tm_min, local.tm_sec, static_cast<int>(frame)};
  constexpr char separators[] = {':', ':', '.'};
  for (std::size_t i = 0; i < 4; ++i) {
    clock_[3 * i] = static_cast<char>('0' + pairs[i] / 10);
    clock_[3 * i + 1] = static_cast<char>('0' + pairs[i] % 10);
    if (i < 3) clock_[3 * i + 2] = separators[i];
  }
}

FieldMoment FieldMoment::field_before() const {
  return {standard_, number - 1, wall_time_ - field_time(standard_)};
}

}  // namespace virtual_card

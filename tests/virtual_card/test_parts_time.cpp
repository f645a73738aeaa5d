// The due times of fields.

#include <gtest/gtest.h>

#include "nodes/clock.h"
#include "support.h"

using namespace std::chrono_literals;

// Catches: rounding errors that add up, numbers that overflow in a card that runs for years.
TEST(FieldSchedule, StaysExactOverYears) {
  const card::FieldSchedule schedule;
  for (const std::int64_t round : {1, 90, 24 * 3600, 300000}) {
    EXPECT_EQ(schedule.due(60000 * round), 1001s * round);
    EXPECT_EQ(schedule.first_at(1001s * round), 60000 * round);
  }
  for (std::int64_t field = 0; field < 7; ++field) {
    EXPECT_EQ(schedule.first_at(schedule.due(field)), field);
    EXPECT_EQ(schedule.first_at(schedule.due(field) + 1ns), field + 1);
  }
}

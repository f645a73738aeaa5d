// The due times of fields, and the queue that a slow host loses frames from.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "frame_queue.h"
#include "nodes/clock.h"

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using virtual_card::FieldSchedule;
using virtual_card::ReadyFrame;

namespace {

TEST(FieldSchedule, StaysExactOverYears) {
  FieldSchedule schedule;
  for (const std::int64_t round : {1, 90, 24 * 3600, 300000}) {
    EXPECT_EQ(schedule.due(60000 * round), 1001s * round);
    EXPECT_EQ(schedule.first_at(1001s * round), 60000 * round);
  }
  for (std::int64_t field = 0; field < 7; ++field) {
    EXPECT_EQ(schedule.first_at(schedule.due(field)), field);
    EXPECT_EQ(schedule.first_at(schedule.due(field) + 1ns), field + 1);
  }
}

TEST(FieldSchedule, AStandardChangeKeepsTheNextFieldsTime) {
  FieldSchedule schedule;
  const auto due = schedule.due(31);
  schedule.change_standard(VIDEO_STANDARD_ZV_PAL, 31);
  EXPECT_EQ(schedule.due(31), due);
  EXPECT_EQ(schedule.due(31 + 50), due + 1s);
  schedule.change_standard(VIDEO_STANDARD_ZV_NTSC, 81);
  EXPECT_EQ(schedule.due(81 + 60000), due + 1s + 1001s);
}

TEST(FrameQueue, AFullQueueLosesTheNewFrameAndCountsIt) {
  virtual_card::FrameQueue queue(100);
  const auto frame = [](std::uint8_t mark, std::size_t size) {
    return ReadyFrame{std::vector<std::uint8_t>(size, mark), mark};
  };
  EXPECT_TRUE(queue.push(frame(1, 60)));
  EXPECT_FALSE(queue.push(frame(2, 41)));
  EXPECT_TRUE(queue.push(frame(3, 40)));
  EXPECT_FALSE(queue.push(frame(4, 1)));
  for (const long result : {1, 3}) EXPECT_EQ(queue.pop(0us)->result, result);
  EXPECT_FALSE(queue.pop(0us));
  const auto [made, delivered, lost] = queue.counters();
  EXPECT_THAT((std::array{made, delivered, lost}), ElementsAre(4u, 2u, 2u));
}

}  // namespace

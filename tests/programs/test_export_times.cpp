// Times of zarvo_export: what the user writes, what an index says, where frames are shown.
#include <gmock/gmock.h>

#include <cstdlib>

#include "programs/common/command_line.h"
#include "programs/export/catalogue.h"
#include "programs/export/timeline.h"

namespace clips {
namespace {

using recording::IndexEntry;
using Kind = IndexEntry::Kind;
using testing::ElementsAre;

IndexEntry entry(Kind kind, Milliseconds time, std::int64_t offset) {
  IndexEntry made;
  made.kind = kind;
  made.time = time;
  made.offset = offset;
  return made;
}

// Catches: a time in UTC; a --to without a day on the day before or in front of --from; a day taken apart by
// the change of the clock.
TEST(ExportTimes, AreLocalAndTheDayOfTheSecondMayBeLeftOut) {
  setenv("TZ", "Europe/Berlin", 1);
  tzset();
  const auto read = [](const char *from, const char *to) {
    const Milliseconds begin = parse_time("--from", from, Pass::first);
    return utc_text(begin) + " " + utc_text(parse_time("--to", to, Pass::second, begin));
  };
  EXPECT_EQ(read("2026-11-25 14:58", "15:03"), "2026-11-25T13:58:00.000000Z 2026-11-25T14:03:00.000000Z");
  EXPECT_EQ(read("2026-12-31 23:59:30", "00:01"), "2026-12-31T22:59:30.000000Z 2026-12-31T23:01:00.000000Z");
  EXPECT_EQ(read("2026-10-24 12:00", "2026-10-25 12:00"),
            "2026-10-24T10:00:00.000000Z 2026-10-25T11:00:00.000000Z");
  // The clock shows 02:30 twice.
  EXPECT_EQ(read("2026-10-25 02:30", "2026-10-25 02:30"),
            "2026-10-25T00:30:00.000000Z 2026-10-25T01:30:00.000000Z");
  EXPECT_EQ(read("2026-10-25 02:30 +0100", "02:40+02:00"),
            "2026-10-25T01:30:00.000000Z 2026-10-26T00:40:00.000000Z");
  EXPECT_EQ(read("2026-10-25T03:00", "00:30 Z"), "2026-10-25T02:00:00.000000Z 2026-10-26T00:30:00.000000Z");
  EXPECT_EQ(read("2026-03-29 02:30", "02:30"), "2026-03-29T01:30:00.000000Z 2026-03-30T00:30:00.000000Z");
  EXPECT_EQ(local_text(parse_time("", "2026-10-25 02:59:59", Pass::second)), "2026-10-25 02:59:59 +0100");
  EXPECT_EQ(local_text(parse_time("", "2026-10-25 03:00", Pass::first)), "2026-10-25 03:00:00");
  for (const char *wrong : {"", "14", "2026-11-25", "2026-11-25 14:58x", "15:03 ", "15:03 +x"})
    EXPECT_THROW(parse_time("--to", wrong, Pass::second, Milliseconds{0}), UsageError) << wrong;
  EXPECT_THROW(parse_time("--from", "14:58", Pass::first), UsageError);
  EXPECT_EQ(length_text(parse_time("--to", "15:03", Pass::second, hour_begin(1795618800000)) % kHour),
            "0:03:00");
  unsetenv("TZ");
  tzset();
}

// Four frames at bytes 0, 10, 20, 30 and what an index says about the third.
TEST(ExportTimes, OnlyWhatIsNoJitterMovesAFrame) {
  const struct {
    const char *what;
    Kind kind;
    Milliseconds time;  // of the third frame, expected at 67 ms
    std::int64_t period, hole;
  } rows[] = {{"a frame that is handed over late", Kind::intra, 200, 2, 0},
              {"the clock set back", Kind::intra, -3600000, 2, 0},
              {"the clock drifts", Kind::intra, 300, 9, 0},
              {"frames lost without an event", Kind::intra, 1000, 30, 28},
              {"a short gap", Kind::gap, 134, 4, 2},
              {"half a period is the nearest one", Kind::gap, 80, 2, 0},
              {"frames lost by the buffer", Kind::buffer, 167, 5, 3},
              {"an hour without rounding errors", Kind::gap, 3600000, 107892, 107890}};
  for (const auto &row : rows) {
    const std::vector<IndexEntry> index = {entry(Kind::intra, 5000, 0), entry(row.kind, 5000 + row.time, 20)};
    Timeline timeline({30000, 1001});
    timeline.begin_file(index, 5000);
    EXPECT_EQ(timeline.place(0).period, 0);
    EXPECT_EQ(timeline.place(10).period, 1);
    const Timeline::Place third = timeline.place(20);
    EXPECT_EQ(third.period, row.period) << row.what;
    EXPECT_EQ(third.hole, row.hole) << row.what;
    EXPECT_EQ(timeline.place(30).period, row.period + 1) << row.what;
    EXPECT_EQ(third.time, row.time < 0 ? 5000 + row.time : timeline.time_of(row.period)) << row.what;
    EXPECT_EQ(third.back, row.time < 0 ? 67 - row.time : 0) << row.what;
  }
  EXPECT_EQ(Timeline({30000, 1001}).time_of(107892), 3599996);
}

// Catches: frames of the next file on top of those before; a gap between files that closes; a part without a
// time that leaves one.
TEST(ExportTimes, FilesFollowEachOther) {
  const std::vector<IndexEntry> none;
  Timeline timeline({25, 1});
  std::vector<std::int64_t> periods;
  for (const std::optional<Milliseconds> start :
       {std::optional<Milliseconds>(1000), {1100}, {}, {3000}, {2000}}) {
    timeline.begin_file(none, start);
    periods.push_back(timeline.place(32).period);
    timeline.skip(1);  // a damaged frame
  }
  EXPECT_THAT(periods, ElementsAre(0, 2, 4, 50, 52));
}

// An index without a stop line, of a recorder that was killed while something moved.
TEST(ExportTimes, TheLastGroupOfAKilledRecorderIsNotLost) {
  std::vector<IndexEntry> index = {entry(Kind::start, 0, 32), entry(Kind::intra, 0, 32),
                                   entry(Kind::intra, 1000, 50), entry(Kind::gap, 1900, 60),
                                   entry(Kind::intra, 2000, 70)};
  index[3].ms = 400;
  index[4].motion = 3;
  Contents contents = contents_of(index);
  EXPECT_EQ(contents.recorded.to, 3000);
  ASSERT_EQ(contents.motion.size(), 1u);
  EXPECT_EQ(contents.motion[0].from, 1000);
  EXPECT_EQ(contents.motion[0].to, 3000);
  ASSERT_EQ(contents.gaps.size(), 1u);
  EXPECT_EQ(contents.gaps[0].from, 1500);
  index.push_back(entry(Kind::stop, 2500, 90));
  contents = contents_of(index);
  EXPECT_EQ(contents.recorded.to, 2500);
  EXPECT_EQ(contents.motion[0].to, 2000);
}

}  // namespace
}  // namespace clips

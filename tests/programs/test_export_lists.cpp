// What zarvo_export lists: which files it takes for recordings, and what it says of them.
#include <nlohmann/json.hpp>

#include "export_tree.h"
#include "programs/export/listing.h"
#include "support.h"

namespace clips {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

class ExportList : public ExportTree {
 protected:
  std::vector<ListedRecording> rows(unsigned channel = 0) {
    Options options;
    options.root = root_;
    options.channel = channel;
    return list_recordings(options, report_);
  }
  Report report_;
};

// Catches: names that are nearly those of recordings, and parts in the order of their letters.
TEST_F(ExportList, OnlyRecordingsAreListedInTheirOrder) {
  for (const char *name : {"20261125-14.10", "20261125-14.2", "20261125-14", "20261125-09"})
    record(name, {{"14:00", 1}});
  fs::create_directories(root_ / "Video/20261125/CH01");
  fs::create_directories(root_ / "Video/notes/CH0x");
  std::ofstream(root_ / "Video/20261125/CH01/20261126-00.rec") << "";
  std::ofstream(root_ / "Video/20261125/CH01.rec") << "";
  std::ofstream(root_ / "Video/notes/CH0x/20261125-14.rec") << "";
  for (const char *name :
       {"20261125-24.rec", "20261125-14.x.rec", "20261125-14..rec", "20261125-1a.rec", "20261125.rec",
        "20261125-14.rec.part", "20261125-14.1.2.rec", "20261125-14.99999999999.rec", "-14.rec", ".rec",
        "20261125_14.rec", "K\xC3\xA4se.rec", "20261125-14.REC"})
    std::ofstream(video(name)) << "x";
  std::vector<std::string> names;
  for (const ListedRecording &row : rows()) names.push_back(fs::path(row.recording.path).filename());
  EXPECT_THAT(names, ElementsAre("20261126-00.rec", "20261125-09.rec", "20261125-14.rec", "20261125-14.2.rec",
                                 "20261125-14.10.rec"));
  EXPECT_EQ(rows(1).size(), 1u);
}

// Catches: times in UTC or of the wrong end; a gap that is counted as motion; an index that is torn or gone
// and takes the row with it; a bar at the wrong place.
TEST_F(ExportList, TellsTimesMotionAndGaps) {
  record("20261125-14", {{"14:00:10", 100}, {"14:00:14", 25, 1}, {"14:00:20", 125}});
  record("20261125-15", {{"15:00:00", 25}});
  record_audio("20261125-14", {{"14:00:10", 250}, {"14:00:15", 125}});
  record_audio("20261125-15", {{"15:00:00", 125}});
  std::ofstream(video("20261125-14.idx"), std::ios::app) << "{\"intra\":true,\"ti";
  fs::remove(video("20261125-15.idx"));
  fs::remove(audio("20261125-15.idx"));
  const auto list = rows();
  const auto json = nlohmann::json::parse(printed_by([&] { print_json(list); }));
  ASSERT_EQ(json.size(), 4u);
  EXPECT_EQ(list[0].recording.index.size(), 1u);  // a month of whole indexes does not fit into memory
  const nlohmann::json gap = {
      {"from", "2026-11-25 14:00:15"}, {"to", "2026-11-25 14:00:20"}, {"seconds", 5.0}};
  EXPECT_EQ(json[0]["from"], "2026-11-25 14:00:10");
  EXPECT_EQ(json[0]["to"], "2026-11-25 14:00:25");
  EXPECT_EQ(json[0]["gaps"], nlohmann::json::array({gap}));
  EXPECT_EQ(json[0]["motion"].size(), 1u);
  EXPECT_EQ(json[0]["motion"][0]["seconds"], 1.0);
  EXPECT_EQ(json[1]["index"], false);
  EXPECT_EQ(json[1]["to"], "2026-11-25 16:00:00");  // some time in this hour
  EXPECT_EQ(json[2]["audio"], 2);
  EXPECT_EQ(json[2]["gaps"][0]["seconds"], 1.0);
  EXPECT_FALSE(json[2].contains("motion"));
  EXPECT_EQ(json[3]["to"], "2026-11-25 15:00:02");
  const std::string table = printed_by([&] { print_table(list); });
  EXPECT_THAT(table, HasSubstr(" 14:00:10  2026-11-25 14:00:25   0:00:15   0:00:01      1   0:00:05  /"));
  EXPECT_THAT(table, HasSubstr(" 16:00:00  no index                             /"));
}

TEST_F(ExportList, AddsUpTheLosses) {
  std::vector<IndexEntry> index(4);
  for (IndexEntry &entry : index) entry.kind = Kind::buffer, entry.frames = 7;
  EXPECT_EQ(contents_of(index).lost_frames, 28);
}

// Catches: a bar at the wrong time or in the row of another channel.
TEST_F(ExportList, DrawsBarsAtTheirTimes) {
  record("20261125-14", {{"14:00:00", 250}, {"14:00:50", 250}});
  record_audio("20261125-14", {{"14:00:00", 6250}});
  draw(rows(), root_ / "list.svg", false);
  std::ifstream file(root_ / "list.svg");
  const std::string svg((std::istreambuf_iterator<char>(file)), {});
  const auto behind = [&svg](const std::string &mark, char end, std::size_t at) {
    const std::size_t begin = svg.find(mark, at) + mark.size();
    return svg.substr(begin, svg.find(end, begin) - begin);
  };
  std::vector<std::string> bars;
  for (std::size_t at = 0; (at = svg.find("<rect x='", at)) != std::string::npos; ++at) {
    const std::string title = behind("<title>", '<', at);
    if (svg.find("<title>", at) > svg.find('\n', at) || title.find("2026") == std::string::npos) continue;
    bars.push_back(title.substr(0, title.find("2026")) + "|" + behind("x='", '\'', at) + "+" +
                   behind("width='", '\'', at) + " " + behind(" y='", '\'', at));
  }
  EXPECT_THAT(bars, ElementsAre("|90+600 60", "gap |190+400 58", "|90+1000 86"));
  EXPECT_THROW(draw(rows(), root_ / "list.svg", false), std::runtime_error);
}

}  // namespace
}  // namespace clips

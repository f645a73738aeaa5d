// Clips of zarvo_export: which pictures and which audio are in them, and when.
#include <array>

#include "export_tree.h"
#include "programs/export/audio_reader.h"

namespace clips {
namespace {

using testing::HasSubstr;
using testing::Not;

// Two hours and a part, recorded through the change of the hour: pictures 0 to 49, 50 to 99, 100 to 124.
// Catches: a picture missing or doubled where files meet or at the ends of the range; a gap that closes or is
// silent; a piece of the range that is left out since its file has the name of another hour.
TEST_F(ExportTree, AClipHoldsEachPictureOnceAtItsTime) {
  record("20261125-13", {{"13:59:58", 50}});
  record("20261125-14", {{"14:00:00", 25}, {"14:00:03", 25}});
  record("20261125-14.1", {{"14:00:10.480", 25}});
  const struct {
    const char *from, *to, *pictures;
  } rows[] = {{"13:30", "14:30", "0-74@0 75-99@5000 100-124@12480 !"},
              {"13:59:59", "14:00:00.040", "25-50@0"},
              {"13:59:59.001", "14:00:00.041", "25-51@0"},
              {"14:00:00", "14:00:02", "50-74@0"},
              {"14:00:02", "14:00:10", "75-99@0"},
              {"14:00:03.999", "14:00:12", "99-99@0 100-124@6520 !"},
              {"14:00:05", "14:00:10", " !"}};
  for (const auto &row : rows) EXPECT_EQ(clip(row.from, row.to), row.pictures) << row.from << " " << lines_;
  clip("13:30", "14:30");
  for (const char *line : {"no pictures from 2026-11-25 14:00:01 to 2026-11-25 14:00:03, for 2.00 seconds\n",
                           "no pictures from 2026-11-25 14:00:04 to 2026-11-25 14:00:10, for 6.48 seconds\n",
                           "nothing is recorded before 2026-11-25 13:59:58\n",
                           "nothing is recorded after 2026-11-25 14:00:11\n"})
    EXPECT_THAT(lines_, HasSubstr(line));
  // Files that the user names follow each other; a gap in one of them is still one.
  Options options;
  options.files = {video("20261125-13.rec"), video("20261125-14.1.rec")};
  EXPECT_EQ(made(options), "0-49@0 100-124@2000");
  std::fstream(options.files[1], std::ios::in | std::ios::out).seekp(16).write("Channel 4", 9);
  options.files = {options.files[1], options.files[0]};
  EXPECT_EQ(made(options), "100-124@0 0-49@1000");
  EXPECT_THAT(lines_,
              HasSubstr("13.rec is of Channel 3, the first recording of Channel 4: joined all the same\n"));
  EXPECT_THAT(lines_, Not(HasSubstr("clock")));
  options.files = {video("20261125-14.rec")};
  EXPECT_EQ(made(options), "50-74@0 75-99@3000 !");
}

// Catches: pictures of mp4 that all come at once behind a hole of a day; audio that stays where they were.
TEST_F(ExportTree, AnMp4ShowsNoPictureForMoreThanAnHour) {
  record("20261125-14", {{"14:00:00", 25}});
  record("20261125-23", {{"23:00:00", 25}, {"23:30:01", 25}});
  clip_ = root_ / "clip.mp4";
  EXPECT_EQ(clip("14:00", "23:59"), "0-24@0 25-49@3601000 50-74@5402000 !");
  EXPECT_THAT(lines_, HasSubstr("the hole before 2026-11-25 23:00:00 lasts an hour in the clip"));
  clip_ = root_ / "clip.mkv";
  record_audio("20261125-23", {{"23:00:00.016", 62}});
  EXPECT_EQ(clip("14:00", "23:59", false, 2), "0-24@0 25-49@32400000 50-74@34201000 !");
  EXPECT_EQ(audio_, "0-61@32400000");
}

// The clock is set back by 30 minutes at 14:40:01, and by ten in a file.
// Catches: pictures, motion and sound of other minutes; a clip that ends where the clock was set back.
TEST_F(ExportTree, PicturesHaveTheTimesOfAClockThatWasSetBack) {
  record("20261125-14", {{"14:10:00", 25}, {"14:40:00", 25}});
  record("20261125-14.1", {{"14:10:01", 25, 1}, {"14:10:02", 25}, {"14:59:59", 25}});
  record("20261125-15", {{"15:00:00", 25}, {"15:20:00", 25, 1}, {"15:10:00", 25}});
  record_audio("20261125-14", {{"14:40:00.016", 62}});
  record_audio("20261125-14.1", {{"14:10:01.016", 62}, {"14:59:59.016", 62}});
  EXPECT_EQ(clip("14:10", "14:11"), "0-24@0 50-99@1000");
  EXPECT_THAT(lines_, HasSubstr("the clock was set back to 2026-11-25 14:10:01, by 0:29:59\n"));
  EXPECT_EQ(clip("14:59:59", "15:10:01", false, 2), "100-149@0 175-199@2000 !");
  EXPECT_EQ(audio_, "124-185@0");
  EXPECT_EQ(clip("14:39:59", "15:00", false, 2), "25-49@0 100-124@1000 !");
  EXPECT_EQ(audio_, "0-61@0 124-185@1000");
  EXPECT_EQ(clip("15:20", "15:30"), "150-174@0");
  EXPECT_EQ(clip("14:00", "16:00", true), "0-24@0 50-99@1000 150-174@3000");
}

// MPEG-4 in groups of five pictures; the last one of a file is decoded, and these are none.
// Catches: a clip that begins behind --from, or with a picture that needs one before it; a wrong place that
// the index sends the reader to; frames behind a damaged one that stay, move, or count as a gap.
TEST_F(ExportTree, AClipBeginsWithTheIntraFrameBeforeItsRange) {
  record("20261125-14", {{"14:00:00", 30}}, 5);
  EXPECT_EQ(clip("14:00:00.400", "14:00:00.920"), "10-22@0");
  EXPECT_EQ(clip("14:00:00.399", "14:00:00.920"), "5-22@0");
  EXPECT_EQ(clip("14:00", "14:00:00.920"), "0-22@0");
  std::fstream file(video("20261125-14.rec"), std::ios::in | std::ios::out | std::ios::binary);
  file.seekp(recording::read_index(video("20261125-14.idx"))[2].offset + 45);  // in the second of its group
  file.write("\0\0\0\0", 4).flush();
  EXPECT_EQ(clip("14:00:00", "14:00:00.920"), "0-5@0 10-22@400 !");
  EXPECT_THAT(lines_, HasSubstr("is damaged: 4 frames skipped\n"));
  EXPECT_THAT(lines_, Not(HasSubstr("no pictures")));
  record("20261125-15", {{"15:00:00", 7}, {"15:00:02", 10}}, 5);  // a gap within a group
  EXPECT_EQ(clip("15:00:00.200", "15:00:02.200"), "35-36@0 37-41@1800 !");
  EXPECT_THAT(lines_,
              HasSubstr("no pictures from 2026-11-25 15:00:00 to 2026-11-25 15:00:02, for 1.72 seconds"));
  record("20261125-16", {{"16:59:59", 5}, {"17:04:59", 10}});  // as far as 300 frames of one a second
  EXPECT_EQ(clip("17:04:59", "17:04:59.200"), "52-56@0 !");
}

// Catches: pictures of two fields at half their speed; sizes that are not shown as 4:3.
TEST_F(ExportTree, TwoFieldsAreTwiceAsManyPictures) {
  fields_ = 2;
  record("20261125-14", {{"14:00:00", 50}});
  for (const char *type : {"clip.mkv", "clip.mp4"}) {
    clip_ = root_ / type;
    EXPECT_EQ(clip("14:00:00.500", "14:00:00.700"), "25-34@0");
    EXPECT_EQ(shape_, "4:3");
  }
}

// Catches: stretches that overlap or touch and show pictures twice, that are joined with a gap, or that leave
// the range; motion that lasts as long as the gap behind it.
TEST_F(ExportTree, MotionIsJoinedWithWhatIsAroundIt) {
  record("20261125-14", {{"14:00:00", 500}, {"14:00:20.400", 25, 7}, {"14:00:24", 250}, {"14:00:40", 25, 1}});
  EXPECT_EQ(clip("14:00", "14:01", true), "460-499@0 500-524@2000 775-799@3000 !");
  EXPECT_EQ(clip("14:00:19", "14:00:20.600", true), "475-499@0 500-504@1400 !");
  record("20261125-15", {{"15:00:00", 75},
                         {"15:00:03", 5, 1},
                         {"15:00:03.200", 50},
                         {"15:00:05.200", 5, 1},
                         {"15:00:05.400", 500}});
  EXPECT_EQ(clip("15:00", "15:01", true), "825-984@0");
}

TEST_F(ExportTree, SaysWhyThereIsNoMotion) {
  record("20261125-14", {{"14:00:00", 50}});
  record("20261125-15", {{"15:00:00", 50, 1}});
  const std::pair<const char *, const char *> rows[] = {{"14:00", "there is no motion"},
                                                        {"14:30", "nothing is recorded there"},
                                                        {"15:00", "no index tells"},
                                                        {"17:00", "nothing is recorded there"}};
  fs::remove(video("20261125-15.idx"));
  for (const auto &[from, line] : rows) {
    EXPECT_EQ(clip(from, from + std::string(":30"), true), " !");
    EXPECT_THAT(lines_, HasSubstr(line));
  }
}

// The dialog has overwritten a recording of 14:00, and stopped at 14:30:04.
// Catches: times, places and motion of a recording that is gone.
TEST_F(ExportTree, AnIndexThatDoesNotFitIsNotUsed) {
  record("20261125-14", {{"14:00:00", 200, 1}});
  const std::string index = video("20261125-14.idx");
  fs::rename(index, root_ / "old.idx");
  pad_ = 12;
  record("20261125-14", {{"14:30:00", 100}});
  fs::rename(root_ / "old.idx", index);
  touch(video("20261125-14.rec"), "14:30:04");
  EXPECT_EQ(clip("14:30:01", "14:30:02"), "225-249@0");
  EXPECT_THAT(lines_, HasSubstr("14.rec: its index belongs to another recording: not used\n"));
  EXPECT_THAT(lines_,
              HasSubstr("14.rec: its times count from 2026-11-25 14:30:00, by the time of the file\n"));
  // Cut off by a copy: what the index tells of the rest stays.
  record("20261125-15", {{"15:00:00", 25}, {"15:00:02", 25}});
  fs::resize_file(video("20261125-15.rec"), fs::file_size(video("20261125-15.rec")) - 10);
  EXPECT_EQ(clip("15:00", "15:00:30"), "300-324@0 325-348@2000 !");
  EXPECT_THAT(lines_, HasSubstr("15.rec: its index does not fit from byte "));
  // Not one intra frame is left.
  std::ofstream(video("20261125-16.rec"), std::ios::binary)
      << std::ifstream(video("20261125-15.rec"), std::ios::binary).rdbuf();
  std::fstream(video("20261125-16.rec"), std::ios::in | std::ios::out | std::ios::binary)
      .seekp(32)
      .write(std::string(9000, 'x').data(), 9000);
  EXPECT_EQ(clip("15:00:02", "16:30"), "325-348@0 !");
  EXPECT_THAT(lines_, HasSubstr("16.rec: bytes 32 to 9032 belong to no intra frame: skipped\n"));
}

// Catches: two hours on top of each other; the second hour in the place of the first; a file of the dialog,
// which holds both hours, in one of them only.
TEST_F(ExportTree, InAutumnAnHourComesTwice) {
  record("20261025-02", {{"2026-10-25 02:30", 50}, {"2026-10-25 02:59:59", 25}});
  record("20261025-02.1", {{"2026-10-25 02:00 +0100", 25}, {"2026-10-25 02:30 +0100", 50}});
  const auto clip_of = [this](const std::string &from, const std::string &to) {
    const std::string day = "2026-10-25 ";
    return clip(day + from, day + to);
  };
  EXPECT_EQ(clip_of("02:30", "02:30:01 +0200"), "0-24@0");
  EXPECT_EQ(clip_of("02:30 +0100", "02:30:01 +0100"), "100-124@0");
  EXPECT_EQ(clip_of("02:59:59", "02:00:01 +0100"), "50-99@0");
  EXPECT_EQ(lines_, "");
  for (const char *name : {"20261025-02.idx", "20261025-02.1.idx", "20261025-02.1.rec"})
    fs::remove(video(name));
  touch(video("20261025-02.rec"), "2026-10-25 02:30:03 +0100");
  EXPECT_EQ(clip_of("02:30 +0100", "02:30:01 +0100"), "0-24@0");
  EXPECT_THAT(lines_, HasSubstr("count from 2026-10-25 02:30:00 +0100, by the time of the file\n"));
}

// Catches: audio that is placed by the number of its part; samples that move with each late block; a gap that
// closes; audio of a recorder that was killed, or of the dialog, that is lost or follows an old index.
TEST_F(ExportTree, AudioIsPlacedByTime) {
  record("20261125-14", {{"14:00:00", 100}});
  record("20261125-14.1", {{"14:10:00", 100}});
  record_audio("20261125-14", {{"14:10:00.016", 62}, {"14:10:01.108", 62}, {"14:10:03.108", 50}});
  clip("14:10", "14:10:04", false, 2);
  EXPECT_EQ(audio_, "0-61@0 62-123@1092 124-173@3092");
  clip("14:10:01.400", "14:10:02", false, 2);
  EXPECT_EQ(audio_, "82-118@12");
  // Blocks that are missing without an event, and blocks that come late.
  const auto index = recording::read_index(audio("20261125-14.idx"));
  std::ofstream without_gaps(audio("20261125-14.idx"));
  for (const IndexEntry &entry : index)
    if (entry.kind != Kind::gap) without_gaps << to_line(entry);
  without_gaps.close();
  clip("14:10", "14:10:04", false, 2);
  EXPECT_EQ(audio_, "0-123@0 124-173@3092");
  fs::remove(audio("20261125-14.idx"));
  clip("14:00", "14:00:04", false, 2);
  EXPECT_EQ(audio_, "0-173@0");
  // A file that cannot be read, and no folder.
  record_audio("20261125-14.1", {{"14:10:00.016", 62}});
  fs::remove(audio("20261125-14.aud"));
  fs::create_directory(audio("20261125-14.aud"));
  EXPECT_EQ(clip("14:00", "14:10:04", false, 2), "0-99@0 100-199@600000 !");
  EXPECT_EQ(audio_, "174-235@600000");
  EXPECT_THAT(lines_, HasSubstr("14.aud: Is a directory\n"));
  record_audio("20261125-14.2", {{"14:20:00.016", 62}});
  Report report;
  AudioReader reader(find_recordings(root_, recording::Kind::audio, 2, {}), {}, 0, report);
  fs::resize_file(audio("20261125-14.1.aud"), 480);
  AudioBlock first, block;
  EXPECT_TRUE(reader.next(first, Stretch().to) && reader.next(block, Stretch().to));
  reader.seek(first.time);
  EXPECT_TRUE(reader.next(block, Stretch().to));
  EXPECT_EQ(block.data, first.data);
  int blocks = 1;
  while (reader.next(block, Stretch().to)) ++blocks;
  EXPECT_EQ(blocks, 10 + 62);
  fs::remove_all(root_ / "Audio");
  clip_ = root_ / "clip.mp4";
  EXPECT_EQ(clip("14:10", "14:10:04", false, 2), "100-199@0 !");
  EXPECT_THAT(lines_, HasSubstr("no recording of audio input 2 from 2026-11-25 14:00:00"));
}

// Catches: a gap that closes in mp4, and samples that are lost at the end.
TEST(ExportAudio, SilenceFillsTheGapsOfAac) {
  std::vector<std::pair<std::int64_t, std::int64_t>> packets;  // where each begins and ends
  AacEncoder encoder(
      [&](AVPacket &packet) { packets.emplace_back(packet.pts, packet.pts + packet.duration); });
  const std::array<std::uint8_t, kBlockBytes> block{};
  for (const std::int64_t sample : {0, 128, 40000}) encoder.add(block, sample);
  encoder.finish();
  ASSERT_FALSE(packets.empty());
  EXPECT_LE(packets.front().first, 0);
  EXPECT_GE(packets.back().second, 40128);
  for (std::size_t i = 1; i < packets.size(); ++i) EXPECT_EQ(packets[i].first, packets[i - 1].second);
}

}  // namespace
}  // namespace clips

#include "recording_fixture.h"

namespace {

using Recording = RecordingTest;
using testing::ElementsAre;
using testing::HasSubstr;
enum { kNone, kCif, kHalfD1, kD1 };

constexpr char kNoSpace[] = "No enough disk space\n";
constexpr char kHalfFree[] = "Disk free percentage\t= 50.00%\n";
constexpr std::size_t kHeader = 32;

TEST_F(Recording, TreeNamesAndHeaderOfOneHour) {
  dialog->radioPAL->click();
  choose(dialog->comboQPvalue, 3);
  EXPECT_THAT(start(kD1, 0x11, 0x2),
              testing::StartsWith(std::string(kHalfFree) + "WriteEnableCh() : g_record_ch =   11\n"
                                                           "WriteEnableCh() : g_audio_ch=    2\n"));
  EXPECT_THAT(files(), ElementsAre("./Data/Audio/20090303/CH02/20090303-14.aud",
                                   "./Data/Video/20090303/CH01/20090303-14.rec",
                                   "./Data/Video/20090303/CH05/20090303-14.rec"));
  EXPECT_TRUE(fs::is_directory("Data/Video/20090303/CH16") && fs::is_directory("Data/Audio/20090303/CH04"));
  EXPECT_FALSE(fs::exists("Data/Video/20090303/CH17") || fs::exists("Data/Audio/20090303/CH05"));
  dialog->btnRecordStop->click();
  constexpr char kExpected[] =
      "MPG4\xD0\x02\x00\x00\x40\x02\x00\x00\x19\x00\x00\x00"
      "Channel 5\x00\x00\x00\x00\x00\x00";
  EXPECT_EQ(content_of("Data/Video/20090303/CH05/20090303-14.rec").substr(0, kHeader),
            std::string(kExpected, kHeader));
  EXPECT_EQ(fs::file_size("Data/Audio/20090303/CH02/20090303-14.aud") % 48, 0u);
}

TEST_F(Recording, HeaderTellsWhatThePanelShows) {
  const struct {
    int quality, standard, resolution, codec, rate;
    int width, height, frames;
  } rows[] = {{kCif, 0, 0, 1, 4, 352, 240, 22},
              {kHalfD1, 1, 1, 0, 5, 704, 288, 16},
              {kD1, 0, 0, 0, 14, 720, 480, 1},
              {kNone, 1, 1, 1, -1, 720, 480, 0}};
  dialog->CheckFolder(g_filepath);
  for (const auto &row : rows) {
    (row.standard ? dialog->radioPAL : dialog->radioNTSC)->click();
    (row.resolution ? dialog->radio704 : dialog->radio720)->click();
    choose(dialog->comboQualityMode, row.quality);
    choose(dialog->comboCodec, row.codec);
    choose(dialog->comboFrameRate, row.rate);
    g_record_ch = 0x8000;
    dialog->OpenFile();
    EXPECT_EQ((row.codec ? g_fp_mpg4 : g_fp_mjpg)[15], nullptr);
    dialog->CloseFile();
    dialog->CloseFile();
    const std::string header = content_of("Data/Video/20090303/CH16/20090303-14.rec");
    ASSERT_EQ(header.size(), kHeader);
    int numbers[3];
    std::memcpy(numbers, header.data() + 4, sizeof numbers);
    EXPECT_THAT(numbers, ElementsAre(row.width, row.height, row.frames));
    EXPECT_EQ(header.substr(0, 4), row.codec ? "MJPG" : "MPG4");
    EXPECT_STREQ(header.c_str() + 16, "Channel 16");
  }
}

// Fault: a buffered stream would keep frames whose callback has returned from the disk until the stop.
TEST_F(Recording, FramesAreInTheirFilesBeforeTheStop) {
  virtual_card::Supply supply;
  std::string expected[2];
  for (int n = 0; n < 20; ++n) {
    const std::string frame(static_cast<std::size_t>(100 + n), static_cast<char>('a' + n));
    supply.mpeg4.push_back(virtual_card::mpeg4_frame(n % 2 ? 9 : 3, 1, {frame.begin(), frame.end()}));
    expected[n % 2] += frame;
  }
  supply.limit = 20;
  virtual_card::set_supply(supply);
  start(kCif, 1u << 3 | 1u << 9);
  const fs::path paths[] = {"Data/Video/20090303/CH04/20090303-14.rec",
                            "Data/Video/20090303/CH10/20090303-14.rec"};
  for (int n = 0; n < 2; ++n) {
    EXPECT_TRUE(wait_until([&] { return fs::file_size(paths[n]) == kHeader + expected[n].size(); }));
  }
  dialog->StartRecord();  // a second start leaves the running one alone
  for (int n = 0; n < 2; ++n) EXPECT_EQ(content_of(paths[n]).substr(kHeader), expected[n]);
}

TEST_F(Recording, CallbacksWriteOnlyOpenFilesAndMeterTheMpeg4Rate) {
  g_record_ch = 1;
  dialog->CheckFolder(g_filepath);
  dialog->OpenFile();
  unsigned char data[1290] = {};
  const auto deliver = [&](auto callback, unsigned channel) {
    return printed_by([&] { callback(channel, data, sizeof data, 0); });
  };
  for (const unsigned channel : {1u, 16u, ~0u}) EXPECT_EQ(deliver(mpeg4_call_back, channel), "");
  EXPECT_EQ(deliver(mjpeg_call_back, 0) + deliver(audio_call_back, 4), "");
  EXPECT_EQ(lenlen, 0);
  EXPECT_EQ(deliver(mpeg4_call_back, 0), "10kbps\n");
  EXPECT_EQ(deliver(mpeg4_call_back, 0), "");
  ++fake_system::clock_now;
  EXPECT_EQ(deliver(mpeg4_call_back, 0), "20kbps\n");
  dialog->CloseFile();
  EXPECT_EQ(fs::file_size("Data/Video/20090303/CH01/20090303-14.rec"), kHeader + 3 * sizeof data);
}

TEST_F(Recording, RefusedStartsLeaveTheDialogIdle) {
  const struct {
    unsigned channels;
    unsigned long blocks, free;
    const char *root;
    std::string lines;
  } rows[] = {
      {0x1, 1000, 500, "./missing", kNoSpace},
      {0x1, 1000, 80, "./Data", std::string("Disk free percentage\t= 8.00%\n") + kNoSpace},
      {0x0, ~0ul, ~0ul, "./Data", "Disk free percentage\t= 100.00%\n"},
      {0x0, 0, 0, "./Data", ""},
      {0x1F, 1000, 500, "./Data",
       std::string(kHalfFree) + "Error: zv_CheckVideoEncodeConfig--Exceed maximum total frame rate!!\n"
                                "ERROR:zv_CheckVideoEncodeConfig Error!\n"}};
  for (const auto &row : rows) {
    EXPECT_TRUE(files().empty());
    std::strcpy(g_filepath, row.root);
    fake_system::disk_blocks = row.blocks;
    fake_system::disk_free = row.free;
    EXPECT_EQ(start(kD1, row.channels), row.lines);
    EXPECT_EQ(g_finish_record, 1);
    EXPECT_FALSE(timer.isActive());
    EXPECT_TRUE(dialog->btnRecordStart->isEnabled());
    std::strcpy(g_filepath, "./Data");
  }
  EXPECT_EQ(files().size(), 5u);
  for (const auto &path : files()) EXPECT_EQ(fs::file_size(path), kHeader);
}

// The files follow the wall clock wherever it goes: the next hour, the next day, back.
TEST_F(Recording, AChangedHourRotatesTheFilesAtTheNextTick) {
  set_clock("2009-03-03 14:59:55");
  start(kCif, 1);
  EXPECT_EQ(timer.interval(), 10000);
  EXPECT_THAT(printed_by([&] { dialog->TimerTick(); }), testing::Not(HasSubstr("Hour")));
  const char *const hours[][2] = {{"2009-03-03 15:00:05", "20090303/CH01/20090303-15"},
                                  {"2009-03-04 00:00:09", "20090304/CH01/20090304-00"},
                                  {"2009-03-03 13:59:59", "20090303/CH01/20090303-13"}};
  for (const auto &[clock, name] : hours) {
    set_clock(clock);
    EXPECT_THAT(printed_by([&] { dialog->TimerTick(); }), HasSubstr("Hour changed\n"));
    EXPECT_TRUE(files().contains("./Data/Video/" + std::string(name) + ".rec")) << name;
    EXPECT_TRUE(timer.isActive());
  }
  EXPECT_EQ(fake_system::slept, 3u);
  EXPECT_EQ(files().size(), 4u);
}

TEST_F(Recording, AFullOrVanishedDiskStopsTheRecording) {
  choose(dialog->comboCodec, 1);  // its deliveries print nothing
  for (const bool vanished : {false, true}) {
    for (const bool new_hour : {false, true}) {
      set_clock("2009-03-03 14:05:00");
      fake_system::disk_free = 500;
      start(kCif, 1);
      ASSERT_EQ(g_finish_record, 0);
      fake_system::disk_free = 50;
      if (vanished) fs::remove_all("Data");
      if (new_hour) set_clock("2009-03-03 15:00:00");
      const std::string refused = (vanished ? "" : "Disk free percentage\t= 5.00%\n") + std::string(kNoSpace);
      EXPECT_EQ(printed_by([&] { dialog->TimerTick(); }),
                refused + (new_hour ? "Hour changed\n" + refused : ""));
      EXPECT_EQ(g_finish_record, 1);
      EXPECT_FALSE(timer.isActive());
      fs::create_directory("Data");
    }
  }
}

TEST_F(Recording, SettingsOutOfRangeBecomeTen) {
  const auto apply = [&](const char *text, int limit, int period) {
    dialog->edtDiskLimit->setText(text);
    dialog->edtTime->setText(text);
    dialog->btnFolder->click();
    EXPECT_EQ(g_min_diskspace, limit) << text;
    EXPECT_EQ(g_time_interval, period * 1000) << text;
    EXPECT_EQ(dialog->edtDiskLimit->text(), limit == 10 ? "10" : text);
    EXPECT_EQ(dialog->edtTime->text(), period == 10 ? "10" : text);
  };
  const TypedNumber limits[] = {{"9", 10}, {"59", 59}, {"60", 60}, {"100", 100}, {"101", 10}, {"1.5", 10}};
  for (const auto &[text, limit] : limits) apply(text, limit, limit == 59 ? 59 : text[0] == '9' ? 9 : 10);
  for (const auto &[text, value] : kTypedNumbers) apply(text, 10, value == 5 ? 5 : 10);
}

TEST_F(Recording, OnlyAFolderOneCanEnterBecomesTheRoot) {
  std::ofstream("file") << "x";
  const auto enter = [&](const std::string &root) {
    dialog->edtRecordPath->setText(QString::fromStdString(root));
    EXPECT_EQ(printed_by([&] { dialog->btnFolder->click(); }), "");
    EXPECT_EQ(dialog->edtRecordPath->text().toStdString(), g_filepath);
    return g_filepath == root;
  };
  std::string deepest = fs::current_path() / std::string(100, 'd') / "";
  deepest += std::string(219 - deepest.size(), 'e');
  for (const std::string root :
       {"a b", "it's", "\"q\"", "$(touch x)", "a;b", "K\xC3\xA4mera \xE6\x97\xA5", deepest.c_str()}) {
    fs::create_directories(root);
    EXPECT_TRUE(enter(root)) << root;
    start(kCif, 0x8000);
    dialog->btnRecordStop->click();
    EXPECT_THAT(files(), ElementsAre(root + "/Video/20090303/CH16/20090303-14.rec"));
  }
  const std::string too_deep = deepest + "f";
  fs::create_directory(too_deep);
  for (const std::string root : {"", "~", "missing", "file", "file/..", "a b; echo", too_deep.c_str()}) {
    EXPECT_FALSE(enter(root)) << root;
  }
}

}  // namespace

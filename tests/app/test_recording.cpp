#include <fcntl.h>
#include <sys/stat.h>

#include "recording_fixture.h"
#include "zv_lib.h"

namespace {

using Recording = RecordingTest;
using testing::ElementsAre;
enum { kNone, kCif, kHalfD1, kD1 };

constexpr char kNoSpace[] = "No enough disk space\n";
constexpr char kHalfFree[] = "Disk free percentage\t= 50.00%\n";
constexpr std::size_t kHeader = 32;

TEST_F(Recording, TreeNamesAndHeaderOfOneHour) {
  dialog->radioPAL->click();
  choose(dialog->comboQPvalue, 3);
  const fs::path fifth = "Data/Video/20090303/CH05/20090303-14.rec";
  fs::create_directories(fifth.parent_path());
  std::ofstream(fifth) << std::string(1 << 20, 'x');  // of an earlier recording
  EXPECT_THAT(start(kD1, 0x11, 0x2),
              testing::StartsWith(std::string(kHalfFree) + "WriteEnableCh() : g_record_ch =   11\n"
                                                           "WriteEnableCh() : g_audio_ch=    2\n"));
  EXPECT_THAT(files(), ElementsAre("./Data/Audio/20090303/CH02/20090303-14.aud",
                                   "./Data/Video/20090303/CH01/20090303-14.rec",
                                   "./Data/Video/20090303/CH05/20090303-14.rec"));
  EXPECT_TRUE(fs::is_directory("Data/Video/20090303/CH16") && fs::is_directory("Data/Audio/20090303/CH04"));
  EXPECT_FALSE(fs::exists("Data/Video/20090303/CH17") || fs::exists("Data/Audio/20090303/CH05"));
  EXPECT_EQ(fcntl(fileno(g_fp_mpg4[4]), F_GETFD), FD_CLOEXEC);  // a player must not hold the file
  EXPECT_TRUE(eventually([&] { return fs::file_size(fifth) > kHeader; }));
  dialog->btnRecordStop->click();
  const std::string expected("MPG4\xD0\2\0\0\x40\2\0\0\x19\0\0\0Channel 5\0\0\0\0\0\0\0\0\0\1\0",
                             kHeader + 4);
  const std::string content = content_of(fifth);
  EXPECT_EQ(content.substr(0, expected.size()), expected);
  EXPECT_NE(content.back(), 'x');
  EXPECT_EQ(fs::file_size("Data/Audio/20090303/CH02/20090303-14.aud") % 48, 0u);
}

TEST_F(Recording, HeaderTellsWhatThePanelShows) {
  const struct {
    int quality, pal, codec, rate;
    std::string header;
  } rows[] = {{kCif, 0, 1, 4, "MJPG 352 240 22"},
              {kHalfD1, 1, 0, 5, "MPG4 704 288 16"},
              {kD1, 0, 0, 14, "MPG4 704 480 1"},
              {kNone, 1, 1, -1, "MJPG 704 480 0"}};
  dialog->CheckFolder(g_filepath);
  for (const auto &row : rows) {
    if (row.quality != kCif) dialog->radio704->click();  // CIF is 352 wide at both widths
    (row.pal ? dialog->radioPAL : dialog->radioNTSC)->click();
    choose(dialog->comboQualityMode, row.quality);
    choose(dialog->comboCodec, row.codec);
    choose(dialog->comboFrameRate, row.rate);
    g_record_ch = 0x8000;
    dialog->OpenFile();
    EXPECT_EQ((row.codec ? g_fp_mpg4 : g_fp_mjpg)[15], nullptr);
    for (int n = 0; n < 2; ++n) dialog->CloseFile();
    const std::string header = content_of("Data/Video/20090303/CH16/20090303-14.rec");
    std::string shown = header.substr(0, 4);
    for (const unsigned at : {4u, 8u, 12u})
      shown += ' ' + std::to_string(static_cast<unsigned char>(header[at]) + 256 * header[at + 1]);
    EXPECT_EQ(shown, row.header);
  }
}

// Catches: a buffered stream, which writes a callback's data only at the stop; a pipe in the place of a file,
// which blocks the dialog.
TEST_F(Recording, CallbacksWriteOnlyOpenFilesAndMeterTheMpeg4Rate) {
  g_record_ch = 3;
  dialog->CheckFolder(g_filepath);
  ASSERT_EQ(mkfifo("Data/Video/20090303/CH02/20090303-14.rec", 0600), 0);
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
  mpeg4_call_back(0, data, sizeof data, 0);  // reading what is printed would flush the file
  EXPECT_EQ(fs::file_size("Data/Video/20090303/CH01/20090303-14.rec"), kHeader + 4 * sizeof data);
  dialog->CloseFile();
}

TEST_F(Recording, RefusedStartsLeaveTheDialogIdle) {
  const std::string too_long = "./Data/" + std::string(220, '/');
  const struct {
    unsigned channels;
    unsigned long blocks, free;
    const char *root;
    std::string lines;
  } rows[] = {
      {0x1, 1000, 500, "./missing", kNoSpace},
      {0x1, 1000, 500, too_long.c_str(), kNoSpace},
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

// Catches: a bit rate that is sent although the operator has chosen a quantiser too.
TEST_F(Recording, AQuantiserWinsOverABitRate) {
  dialog->comboCBRValue->setCurrentIndex(3);
  dialog->comboQPvalue->setCurrentIndex(5);
  start(kCif, 1);
  ZV_VIDEO_CONFIG sent{};
  EXPECT_EQ(zv_GetVideoEncodeConfig(zv_handle, 0, &sent), ZV_OK);
  EXPECT_EQ(std::tuple(sent.qp, sent.CBREnable, dialog->comboCBRValue->currentIndex()),
            std::tuple(dialog->comboQPvalue->currentText().toUInt(), 0u, 0));
}

// A second start must leave the running recording alone; a dialog that is left or destroyed while it records
// must not keep the next one from recording. When the card does not start, the files are closed before the
// line tells.
TEST_F(Recording, TheNextDialogRecordsAndAFailedStartClosesItsFiles) {
  class Telling : public OpenDialog {
    void WriteEnableCh() override { zv_handle = nullptr; }
    void CloseFile() override { OpenDialog::CloseFile(), std::puts("closed"); }
  };
  for (const bool left : {true, false}) {
    EXPECT_NE(start(kCif, 1).find("Write"), std::string::npos);
    EXPECT_EQ(printed_by([&] { dialog->StartRecord(); }).find("Write"), std::string::npos);
    if (left) dialog->ExitDialog();
    dialog.reset();
    dialog.reset(left ? new OpenDialog : new Telling);
  }
  const HANDLE card = zv_handle;
  EXPECT_EQ(start(kCif, 1), std::string(kHalfFree) + "closed\nERROR:zv_Start Error!\n");
  zv_handle = card;
}

// The files follow the wall clock wherever it goes: the next hour, the next day, back. The hour 2 that comes
// twice in autumn goes on in one file; the one that spring leaves out has none.
TEST_F(Recording, AChangedHourRotatesTheFilesAtTheNextTick) {
  setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);
  tzset();
  const std::time_t autumn = at("2009-10-25 01:50:00") + 3600, spring = at("2009-03-29 01:50:00");
  const std::tuple<std::time_t, bool, const char *> ticks[] = {
      {at("2009-03-03 14:59:55"), false, "20090303/CH01/20090303-14"},
      {at("2009-03-03 15:00:05"), true, "20090303/CH01/20090303-15"},
      {at("2009-03-04 00:00:09"), true, "20090304/CH01/20090304-00"},
      {at("2009-03-03 13:59:59"), true, "20090303/CH01/20090303-13"},
      {autumn, true, "20091025/CH01/20091025-02"},
      {autumn + 1200, false, "20091025/CH01/20091025-02"},
      {spring, true, "20090329/CH01/20090329-01"},
      {spring + 1200, true, "20090329/CH01/20090329-03"}};
  fake_system::clock_now = std::get<0>(ticks[0]);
  start(kCif, 1);
  EXPECT_EQ(timer.interval(), 10000);
  for (const auto &[clock, rotates, name] : ticks) {
    fake_system::clock_now = clock;
    EXPECT_EQ(printed_by([&] { dialog->TimerTick(); }).find("Hour changed\n") != std::string::npos, rotates);
    EXPECT_TRUE(files().contains("./Data/Video/" + std::string(name) + ".rec")) << name;
    EXPECT_TRUE(timer.isActive());
  }
  EXPECT_EQ(fake_system::slept, 6u);
  EXPECT_EQ(files().size(), 7u);
  unsetenv("TZ");
  tzset();
}

TEST_F(Recording, AFullOrVanishedDiskStopsTheRecording) {
  choose(dialog->comboCodec, 1);  // its deliveries print nothing
  for (const bool vanished : {false, true}) {
    for (const bool new_hour : {false, true}) {
      fake_system::clock_now = at("2009-03-03 14:05:00");
      fake_system::disk_free = 100;  // exactly the limit
      start(kCif, 1);
      ASSERT_EQ(g_finish_record, 0);
      fake_system::disk_free = 50;
      if (vanished) fs::remove_all("Data");
      if (new_hour) fake_system::clock_now += 3600;
      std::string refused = (vanished ? "" : "Disk free percentage\t= 5.00%\n") + std::string(kNoSpace);
      if (new_hour) refused += "Hour changed\n" + refused;
      EXPECT_EQ(printed_by([&] { dialog->TimerTick(); }), refused);
      EXPECT_EQ(g_finish_record, 1);
      EXPECT_FALSE(timer.isActive());
      fs::create_directory("Data");
    }
  }
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

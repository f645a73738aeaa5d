// What the card does at the last close: it keeps its state and says what the host did not read.

#include <sys/resource.h>
#include <sys/wait.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>

#include "node_test.h"

namespace {

using testing::HasSubstr;

// Catches: losses that nobody is told of; a stream that the host does not use counted as lost.
TEST_F(NodeTest, TheLastCloseSaysOnceWhatTheHostDidNotReadInTime) {
  card::Supply supply;
  supply.mpeg4 = supply.mjpeg = {card::mpeg4_frame(0, 0, std::vector<u8>(1 << 20))};
  supply.audio = {{std::vector<u8>(192), 4}};
  supply.video_rate = 10;
  supply.audio_rate = 62.5;
  const std::string lost =
      "virtual card: 37 video frames and 0 blocks of each audio input are lost: the program did "
      "not read them in time\n";
  for (const std::string &expected : {std::string(), lost, std::string()}) {
    card::set_supply(supply);
    start();
    if (!expected.empty()) read_mpeg4();
    card::advance(4s);
    testing::internal::CaptureStderr();
    close_nodes();
    EXPECT_EQ(testing::internal::GetCapturedStderr(), expected);
    open_nodes();
  }
}

class StateTest : public NodeTest {
 protected:
  StateTest() { create_directory(folder_); }
  ~StateTest() override { remove_all(folder_); }

  /// Runs `program` in a process with a card of its own, in the folder of the state file. Returns what it
  /// prints on standard error.
  std::string run(const std::function<void()> &program) {
    testing::internal::CaptureStderr();
    const pid_t child = fork();
    if (child == 0) {
      region = nullptr;
      current_path(folder_);
      setenv("ZARVO_VIRTUAL_CARD", "state=state", 1);
      card::set_clock(card::ClockMode::manual);
      program();
      _exit(HasFailure() ? 1 : 0);
    }
    int status = -1;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
    return testing::internal::GetCapturedStderr();
  }
  void leave() {
    std::filesystem::current_path("/");
    close_nodes();
  }
  std::string content() const {
    std::ostringstream text;
    text << std::ifstream(folder_ / "state").rdbuf();
    return text.str();
  }
  void fill(const std::string &text) { std::ofstream(folder_ / "state") << text; }

  std::filesystem::path folder_ = testing::TempDir() + "state_" + std::to_string(getpid());
};

// The state as a second program finds it. The lines are written by hand: none may get lost on the way to the
// file and back.
TEST_F(StateTest, TheNextProgramFindsWhatTheLastOneSet) {
  EXPECT_EQ(
      run([this] {
        open_nodes();
        send(encoder, driver::ENC_IOC_SET_STANDARD, 1u);
        send(video_input, driver::VIN_IOC_SET_WIDTH, 704u);
        send(display, driver::DISP_IOC_WRITE_REG, driver::Register{0xBE4, 0x1FF});
        send(video_input, driver::VIN_IOC_WRITE_REG, driver::Register{0x188, 0x50000000});
        send(video_input, driver::VIN_IOC_WRITE_TW2815, driver::DecoderRegister{2, 0x5A, 0});
        send(encoder, driver::ENC_IOC_SET_SCALE, driver::ChannelValue{3, 9});
        send(encoder, driver::ENC_IOC_SET_INTERVAL, driver::Interval{3, 0x205, 1});
        send(encoder, driver::ENC_IOC_SET_GOP, driver::ChannelValue{3, 12});
        send(encoder, driver::ENC_IOC_SET_QP, driver::ChannelValue{3, 7});
        send(encoder, driver::ENC_IOC_SET_CBR, driver::Cbr{3, 70000, 1});
        send(encoder, driver::ENC_IOC_SET_QP_RANGE, driver::QpRange{3, 20, 4, 1});
        send(encoder, driver::ENC_IOC_CHANNEL_NUMBER_ON, 3u);
        send(display, driver::DISP_IOC_SET_WINDOW, ZV_DISPLAY_WINDOW{1, 2, 3, 4, 5, 6, 7, 8});
        send(display, driver::DISP_IOC_SET_ZOOM, driver::Zoom{1, 2, 3});
        send(display, driver::DISP_IOC_SET_GRID, driver::Grid{{1, 2, 3, 4, 5}, {6, 7, 8, 9, 10}, 11, 12});
        send(display, driver::DISP_IOC_SET_RECT, driver::FrameRect{1, 2, 3, 4, 5, 6, 7});
        send(display, driver::DISP_IOC_MOTION_TRACE_ON);
        send(display, driver::DISP_IOC_SELECT_BUFFER, 2u);
        std::vector<u16> map(64 * 64, 30);
        send(video_input, driver::VIN_IOC_SET_MOTION_MAP, driver::MotionMap{15, 0, 0, 64, 64, map.data()});
        map[0] = 0xFFFF;
        map[1] = 0xFFFF;
        send(video_input, driver::VIN_IOC_SET_MOTION_MAP, driver::MotionMap{15, 62, 9, 2, 1, map.data()});
        leave();
      }),
      "");
  const std::string written = content();
  EXPECT_THAT(
      written,
      HasSubstr("\nVIN_IOC_SET_STANDARD value=1\nVIN_IOC_SET_WIDTH value=704\n"
                "DISP_IOC_WRITE_REG address=0xbe4 value=0x1ff\n"
                "VIN_IOC_WRITE_REG address=0x188 value=0x50000000\n"
                "VIN_IOC_WRITE_TW2815 chip=0x2 address=0x5a value=0x0\n"
                "ENC_IOC_SET_SCALE channel=3 value=9\nENC_IOC_SET_INTERVAL channel=3 code=517 drop=1\n"
                "ENC_IOC_SET_GOP channel=3 value=12\nENC_IOC_SET_QP channel=3 value=7\n"
                "ENC_IOC_SET_CBR channel=3 value=0x11170 enable=1\n"
                "ENC_IOC_SET_QP_RANGE channel=3 max=20 min=4 enable=1\nENC_IOC_CHANNEL_NUMBER_ON value=3\n"
                "DISP_IOC_SET_WINDOW index=1 channel=2 scale=3 x_start=4 y_start=5 x_end=6 y_end=7 flags=8\n"
                "DISP_IOC_SET_ZOOM level=1 x=2 y=3\nDISP_IOC_SET_GRID column=1 column=2 column=3 column=4 "
                "column=5 row=6 row=7 row=8 row=9 row=10 cells=11\n"
                "DISP_IOC_SET_RECT number=1 x_start=2 y_start=3 x_end=4 y_end=5 enable=6\n"
                "DISP_IOC_MOTION_TRACE_ON\nDISP_IOC_SELECT_BUFFER value=2\n"
                "VIN_IOC_SET_MOTION_MAP channel=15 column=0 row=0 columns=64 rows=64 threshold=30\n"
                "VIN_IOC_SET_MOTION_MAP channel=15 column=62 row=9 columns=2 rows=1 threshold=65535\n"
                "checksum "));
  EXPECT_EQ(run([this] {
              open_nodes();
              EXPECT_EQ(ask(encoder, driver::ENC_IOC_GET_SCALE, 3), 9u);
              EXPECT_EQ(video_input_register(0x188), 0x50000000u);
              leave();
            }),
            "");
  EXPECT_EQ(content(), written);
}

// Catches: a state that is lost because it was read or written by half.
TEST_F(StateTest, AFileThatIsDamagedOrCannotBeWrittenStaysAsItIs) {
  EXPECT_EQ(run([this] {
              open_nodes();
              leave();
            }),
            "");
  const std::string good = content();
  const auto cannot_grow = [this] {
    open_nodes();
    for (u32 n = 0; n < 30; ++n) send(display, driver::DISP_IOC_WRITE_REG, driver::Register{0x1000 + n, n});
    const rlimit small{400, 400};
    setrlimit(RLIMIT_FSIZE, &small);
    leave();
  };
  EXPECT_THAT(run(cannot_grow), HasSubstr(folder_.string() + "/state keeps an older state: File too large"));
  EXPECT_EQ(content(), good);
  for (const std::string &bad :
       {std::string(), good.substr(1), good.substr(0, good.size() - 3), good + "x"}) {
    fill(bad);
    EXPECT_THAT(run([] { EXPECT_EQ(answer(open(driver::kEncoderNode, O_RDWR)), -EINVAL); }),
                HasSubstr("item \"state\": " + folder_.string() + "/state: the file is damaged"));
    EXPECT_EQ(content(), bad);
  }
  const std::filesystem::directory_iterator files(folder_);
  EXPECT_EQ(std::distance(begin(files), end(files)), 1);
}

}  // namespace

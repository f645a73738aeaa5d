// What each item does to the card, when, and how it is undone.

#include <cstring>
#include <iterator>
#include <random>
#include <sstream>
#include <stdexcept>

#include "node_test.h"

namespace {

constexpr long kHuge = 0x1000000;

/// An MPEG-4 frame, a Motion-JPEG frame and four audio blocks wait in their queues.
class ItemTest : public NodeTest {
 protected:
  static std::vector<u8> data() { return std::vector<u8>(400, 0x5A); }
  static void queue_frames(int count, unsigned type = 1) {
    auto scan = data();
    scan.back() = 0xD9;
    for (int n = 0; n < count; ++n) {
      card::queue_mpeg4(card::mpeg4_frame(2, type, data(), std::chrono::seconds{1000}));
      card::queue_mjpeg(card::mjpeg_frame(2, 352, 240, scan));
      card::queue_audio({std::vector<u8>(192, 7), 192});
    }
  }
  long read(const std::string &stream) {
    if (stream == "mpeg4") return read_mpeg4();
    if (stream == "mjpeg") return read_mjpeg();
    return read_audio();
  }
  u32 word_at(std::size_t offset) {
    u32 word = 0;
    std::memcpy(&word, region + offset, sizeof word);
    return word;
  }
  u32 decoder_status() { return card::decoder_register(0, driver::kDecoderStatus); }
};

struct FrameFault {
  const char *item;
  const char *stream;
  long result;         ///< of the read
  std::size_t offset;  ///< of a word in the stream region
  u32 word;
};
void PrintTo(const FrameFault &fault, std::ostream *out) {
  *out << fault.item;
}

class FrameFaultTest : public ItemTest, public testing::WithParamInterface<FrameFault> {};

TEST_P(FrameFaultTest, ShowsInTheReadAndEndsWithTheUndo) {
  const FrameFault &fault = GetParam();
  const std::string item = fault.item;
  card::apply(item);
  queue_frames(1);
  EXPECT_EQ(read(fault.stream), fault.result);
  EXPECT_TRUE((fault.offset == 0 && fault.word == 0) || word_at(fault.offset) == fault.word);
  card::apply(item.substr(0, item.find('=') + 1));
  while (read(fault.stream) > 0) continue;
  queue_frames(1, 0);
  const std::string stream = fault.stream;
  EXPECT_EQ(read(stream), stream == "mpeg4" ? 464 : stream == "mjpeg" ? 416 : 192);
  EXPECT_TRUE(stream != "mpeg4" || word_at(0) == driver::packed_head({2, 0, 400}));
}

constexpr std::size_t kJpeg = driver::kMjpegAreaOffset + driver::kMjpegDescriptorOffset;
INSTANTIATE_TEST_SUITE_P(
    Streams, FrameFaultTest,
    testing::Values(
        FrameFault{"stall=mpeg4", "mpeg4", 0, 0, 0}, FrameFault{"stall=audio,mjpeg", "mjpeg", 0, 0, 0},
        FrameFault{"drop=mpeg4:1", "mpeg4", 0, 0, 0},
        FrameFault{"type=mpeg4:3", "mpeg4", 464, 0, driver::packed_head({2, 3, 400})},
        FrameFault{"channel=mpeg4:8", "mpeg4", 464, 0, driver::packed_head({7, 1, 400})},
        FrameFault{"channel=mjpeg:8", "mjpeg", 416, kJpeg, 7},
        FrameFault{"foreign=mjpeg:17", "mjpeg", 416, kJpeg, 16},
        FrameFault{"ahead=mpeg4:9", "mpeg4", 464, driver::kMpeg4TimeSeconds, 1009},
        FrameFault{"back=mpeg4:9", "mpeg4", 464, driver::kMpeg4TimeSeconds, 991},
        FrameFault{"long=mpeg4", "mpeg4", 464, 0, driver::packed_head({2, 1, 0xFFFFF})},
        FrameFault{"empty=mpeg4", "mpeg4", 464, 0, driver::packed_head({2, 1, 0})},
        FrameFault{"empty=mjpeg", "mjpeg", 16, kJpeg, 2}, FrameFault{"empty=audio", "audio", 0, 0, 0},
        FrameFault{"noeoi=mjpeg", "mjpeg", 416, kJpeg + 412, 0x005A5A5A},
        FrameFault{"oversize=mpeg4", "mpeg4", kHuge, 0, 0},
        FrameFault{"oversize=mjpeg", "mjpeg", kHuge, 0, 0}, FrameFault{"negative=audio", "audio", -EIO, 0, 0},
        FrameFault{"short=audio:100", "audio", 100, 0, 0}));

TEST_F(ItemTest, HoldsFramesBackAndGivesThemTwice) {
  card::apply("late=mpeg4:80;burst=mjpeg:1000;twice=audio:2");
  queue_frames(2);
  EXPECT_EQ(read_mpeg4(), 0);
  EXPECT_EQ(read_mjpeg(), 0);
  int blocks = 0;
  while (read("audio") > 0) ++blocks;
  EXPECT_EQ(blocks, 3);
  card::advance(79ms);
  EXPECT_EQ(read_mpeg4(), 0);
  card::advance(1ms);
  EXPECT_EQ(read_mpeg4(), 464);
  card::advance(920ms);
  EXPECT_EQ(read_mjpeg(), 416);
  EXPECT_EQ(read_mjpeg(), 416);
  stop();
  EXPECT_EQ(read_mpeg4(), 0) << "a stop drops what is held back";
}

TEST_F(ItemTest, DropsIntraFramesOnlyAndLimitsTheQueue) {
  card::apply("nointra=mpeg4;queue=mjpeg:1");
  queue_frames(1, 0);
  queue_frames(1, 1);
  EXPECT_EQ(read_mpeg4(), 464);
  EXPECT_EQ(word_at(0) >> 22 & 3, 1u);
  EXPECT_EQ(card::counters().mpeg4.lost, 1u);
  EXPECT_EQ(read_mjpeg(), 416);
  EXPECT_EQ(read_mjpeg(), 0);
  EXPECT_EQ(card::counters().mjpeg.lost, 1u);
}

// Catches: a copy that is copied again, so that the host gets the first frame for ever.
TEST_F(ItemTest, EachFrameComesTwiceAndNoCopyIsCopied) {
  card::apply("twice=mpeg4:1");
  queue_frames(1, 0);
  queue_frames(1, 1);
  std::vector<u32> types;
  while (types.size() < 9 && read_mpeg4() > 0) types.push_back(driver::unpacked_head(word_at(0)).type);
  EXPECT_THAT(types, testing::ElementsAre(0, 0, 1, 1));
}

TEST_F(ItemTest, RandomDamageRepeatsWithTheSeed) {
  const auto damaged = [this](const char *line) {
    card::apply(line);
    queue_frames(1);
    const long size = read_mpeg4();
    std::vector<u8> bytes(region, region + size);
    card::apply("reset");
    return bytes;
  };
  const auto bits = damaged("bits=mpeg4:40;seed=7");
  EXPECT_EQ(bits, damaged("seed=7;bits=mpeg4:40"));
  EXPECT_NE(bits, damaged("seed=8;bits=mpeg4:40"));
  const auto torn = damaged("torn=mpeg4:1");
  EXPECT_LT(torn.size(), 464u);
  EXPECT_EQ(driver::unpacked_head(word_at(0)).length, torn.size() - driver::kMpeg4DescriptorSize);
}

TEST_F(ItemTest, PreviewFaultsShowInTheRead) {
  // A sanitizer looks at as many bytes as a read says it has written.
  std::vector<u32> indexes(static_cast<std::size_t>(kHuge) / sizeof(u32));
  const u32 &index = indexes.front();
  const auto read_preview = [&] { return read_node(display, indexes.data(), sizeof index); };
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  card::advance_frames(2);
  EXPECT_EQ(read_preview(), 720 * 480 * 2);
  card::apply("index=preview:9");
  read_preview();
  EXPECT_EQ(index, 9u);
  card::apply("index=;frozen=preview");
  read_preview();
  const u32 frozen = index;
  card::advance_frames(1);
  read_preview();
  EXPECT_EQ(index, frozen);
  for (const auto &[item, result] : {std::pair{"stall=preview", 0L},
                                     {"stall=;empty=preview", 0L},
                                     {"empty=;negative=preview", long{-EIO}},
                                     {"negative=;oversize=preview", kHuge}}) {
    card::apply(item);
    EXPECT_EQ(read_preview(), result) << item;
  }
}

TEST_F(ItemTest, CallsFailAsOftenAsTheItemSays) {
  u32 word = 0;
  const auto width = [&] { return send(display, driver::DISP_IOC_GET_WIDTH, word); };
  card::apply("fail=display/ioctl/DISP_IOC_GET_WIDTH:EIO:2:1");
  EXPECT_EQ(send(display, driver::DISP_IOC_GET_HEIGHT, word), 0);
  std::vector<long> results{width(), width(), width(), width()};
  EXPECT_THAT(results, testing::ElementsAre(0, -EIO, -EIO, 0));
  card::apply("fail=any/ioctl:EINTR:every2");
  results = {width(), width(), width(), width()};
  EXPECT_THAT(results, testing::ElementsAre(0, -EINTR, 0, -EINTR));
  EXPECT_EQ(card::counters().failed_calls, 4u);
  card::apply("fail=audio/read:EIO;fail=encoder/mmap:ENOMEM");
  EXPECT_EQ(read_mpeg4(), 0);
  EXPECT_EQ(read("audio"), -EIO);
  EXPECT_EQ(mmap(nullptr, kRegion, PROT_READ, MAP_SHARED, encoder, 0), MAP_FAILED);
  EXPECT_EQ(errno, ENOMEM);
  card::apply("fail=");
  EXPECT_EQ(read("audio"), 0);
}

TEST_F(ItemTest, RegistersAndTheBoardMisbehave) {
  const driver::Register record{0x310, 0x1234};
  EXPECT_EQ(send(display, driver::DISP_IOC_WRITE_REG, record), 0);
  card::apply("stuck=0x310");
  EXPECT_EQ(send(display, driver::DISP_IOC_WRITE_REG, driver::Register{0x310, 5}), 0);
  EXPECT_EQ(codec_register(0x310), 0x1234u);
  card::apply("stuck=;garbage=0x310");
  EXPECT_NE(codec_register(0x310), codec_register(0x310));
  card::apply("garbage=;noreply");
  EXPECT_EQ(board_command(driver::kBoardWatchdogOn), 0u);
  card::apply("noreply=;wrongreply");
  EXPECT_NE(board_command(driver::kBoardWatchdogOn), driver::kBoardWatchdogOnReply);
  EXPECT_FALSE(card::counters().watchdog_running);
  card::apply("wrongreply=;board=cc;bite");
  EXPECT_EQ(board_command(driver::kBoardVersion), 0xCCu);
  EXPECT_EQ(board_command(driver::kBoardWatchdogOn), driver::kBoardWatchdogOnReply);
  testing::internal::CaptureStderr();
  card::advance(1s);
  EXPECT_THAT(testing::internal::GetCapturedStderr(), testing::HasSubstr("would have reset"));
  card::apply("reset");
  EXPECT_EQ(codec_register(0x310), 0x1234u);
}

TEST_F(ItemTest, TheTimeLineSaysWhenAnItemCounts) {
  std::string lost;
  card::advance(1s);
  card::apply("@1-2 lost=1; @3 lost=2; @every 2 for 0.5 vanish");  // times count from now
  for (int half = 0; half < 9; ++half) {
    const int fd = open(driver::kAudioNode, O_RDWR);
    lost += (decoder_status() & 1) == 0 ? '1' : (decoder_status() & 2) == 0 ? '2' : '-';
    EXPECT_EQ(read_audio() == -ENODEV, fd < 0);
    lost += fd < 0 ? "x " : " ";
    if (fd >= 0) close(fd);
    card::advance(500ms);
  }
  EXPECT_EQ(lost, "- - 1 1 -x - 2 2 2x ");
  card::apply("lost=;vanish=");
  EXPECT_EQ(decoder_status() & 3, 3u);
}

TEST_F(ItemTest, TheSignalFlickers) {
  card::apply("flicker=1:4");
  std::string signal;
  for (int frame = 0; frame < 8; ++frame) {
    card::advance_frames(1);
    signal += (decoder_status() & 1) != 0 ? '+' : '-';
  }
  EXPECT_EQ(signal, "++--++--");
}

// Catches: a door of the card that takes half of a line, or falls over one.
TEST_F(ItemTest, AThousandRandomLinesNeverChangeTheCardWhenRefused) {
  std::istringstream vocabulary(
      "lost = 3 , - 16 99 : ; @ every for 0.5 stall mpeg4 fail any / read EIO 1e9 torn seed camera "
      "camera3=/nowhere -1 \xff reset speed=2");
  std::vector<std::string> words{std::istream_iterator<std::string>(vocabulary), {}};
  words.emplace_back(" ");
  std::mt19937 random(7);
  int refused = 0;
  for (int n = 0; n < 1000; ++n) {
    card::apply("reset;lost=5");
    std::string line = "lost=1;";
    for (auto count = random() % 12; count > 0; --count) line += words[random() % words.size()];
    try {
      card::apply(line);
    } catch (const std::invalid_argument &error) {
      ++refused;
      EXPECT_THAT(error.what(),
                  testing::AnyOf(testing::HasSubstr("possible"), testing::HasSubstr("expected"),
                                 testing::HasSubstr("a time is"), testing::HasSubstr("power-up only"),
                                 testing::HasSubstr("camera")))
          << line;
      EXPECT_EQ(decoder_status() & 1, 1u) << line;
    }
  }
  EXPECT_GT(refused, 500);
  card::apply("reset");
}

TEST_F(ItemTest, TheTableHasOverThirtyRowsThatSayWhatTheHostSees) {
  EXPECT_GE(card::items().size(), 35u);
  for (const card::ItemText &item : card::items())
    EXPECT_FALSE(item.values.empty() || item.effect.empty()) << item.usage;
}

}  // namespace

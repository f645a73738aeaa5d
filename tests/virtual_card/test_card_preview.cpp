// The preview pictures' way to the host: buffers, sizes, batches of layout commands.

#include "card_fixture.h"

namespace {

class Preview : public CardTest {
 protected:
  void SetUp() override {
    CardTest::SetUp();
    for (u32 index = 0; index < driver::kPreviewBuffers; ++index) {
      EXPECT_EQ(send(display, driver::DISP_IOC_SELECT_BUFFER, index), 0);
      buffer[index] = static_cast<const u8 *>(
          mmap(nullptr, driver::kPreviewBufferSize, PROT_READ, MAP_SHARED, display, 0));
    }
  }
  void TearDown() override {
    for (const u8 *each : buffer) munmap(const_cast<u8 *>(each), driver::kPreviewBufferSize);
    CardTest::TearDown();
  }
  long read_preview(u32 &index) {
    std::vector<u32> scratch(driver::kPreviewBufferSize / sizeof(u32), 0xA5A5A5A5);
    const long result = read_node(display, scratch.data(), driver::kPreviewBufferSize);
    index = scratch[0];
    EXPECT_EQ(scratch[1], 0xA5A5A5A5u) << "more than the index was written";
    return result;
  }
  /// The newest picture after one more frame.
  std::vector<u8> next_picture() {
    card::advance_frames(1);
    u32 index = 99;
    const long size = read_preview(index);
    EXPECT_GT(size, 0);
    EXPECT_LT(index, driver::kPreviewBuffers);
    return {buffer[index], buffer[index] + size};
  }
  void show_first(u32 x_end) {
    const ZV_DISPLAY_WINDOW window{0, 0, 1, 0, 0, x_end, 480, ZV_WINDOW_ENABLED};
    EXPECT_EQ(send(display, driver::DISP_IOC_SET_WINDOW, window), 0);
  }

  std::array<const u8 *, driver::kPreviewBuffers> buffer{};
};

TEST_F(Preview, ThereIsNoneUntilItIsOn) {
  u32 index = 0;
  card::advance_frames(3);
  EXPECT_EQ(read_preview(index), 0);
  EXPECT_EQ(card::counters().previews, 0u);
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  card::advance_frames(3);
  EXPECT_EQ(card::counters().previews, 3u);
  EXPECT_GT(read_preview(index), 0);
  EXPECT_EQ(read_node(display, &index, 3), -EINVAL);
  EXPECT_EQ(read_node(display, nullptr, driver::kPreviewBufferSize), -EFAULT);
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_OFF), 0);
  EXPECT_EQ(read_preview(index), 0);
}

// The host draws from the buffer it was given last: the card must not compose over its shoulder.
TEST_F(Preview, TheBufferInTheHostsHandsIsLeftAlone) {
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  show_first(720);
  for (int frames = 1; frames <= 9; ++frames) {
    u32 index = 99;
    const auto picture = next_picture();
    ASSERT_GT(read_preview(index), 0);
    const std::vector<u8> before(buffer[index], buffer[index] + driver::kPreviewBufferSize);
    card::advance_frames(frames);
    EXPECT_TRUE(std::equal(before.begin(), before.end(), buffer[index])) << frames;
  }
}

TEST_F(Preview, PicturesHaveTheSizeOfTheStandardAndWidth) {
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  const struct {
    u32 standard, width, field_lines;
  } cases[] = {{VIDEO_STANDARD_ZV_NTSC, 720, 240},
               {VIDEO_STANDARD_ZV_PAL, 704, 288},
               {VIDEO_STANDARD_ZV_PAL, 720, 288}};
  for (const auto &each : cases) {
    EXPECT_EQ(send(video_input, driver::VIN_IOC_SET_WIDTH, each.width), 0);
    EXPECT_EQ(send(video_input, driver::VIN_IOC_SET_STANDARD, each.standard), 0);
    u32 size[] = {0, 0};
    EXPECT_EQ(send(display, driver::DISP_IOC_GET_WIDTH, size[0]), 0);
    EXPECT_EQ(send(display, driver::DISP_IOC_GET_HEIGHT, size[1]), 0);
    EXPECT_THAT(size, ::testing::ElementsAre(each.width, each.field_lines));
    EXPECT_EQ(next_picture().size(), each.width * each.field_lines * 2 * 2);
  }
}

// A layout that shows half of its changes flickers through pictures nobody asked for.
TEST_F(Preview, ABatchIsShownAtItsEnd) {
  for (unsigned channel = 0; channel < ZV_CHANNELS; ++channel) card::set_scene(channel, card::Scene::still);
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  const auto empty = next_picture();
  EXPECT_EQ(send(display, driver::DISP_IOC_BEGIN_UPDATE), 0);
  show_first(720);
  EXPECT_EQ(next_picture(), empty);
  EXPECT_EQ(send(display, driver::DISP_IOC_END_UPDATE), 0);
  const auto full = next_picture();
  EXPECT_NE(full, empty);
  show_first(352);
  EXPECT_NE(next_picture(), full) << "outside a batch a command acts at once";
  EXPECT_EQ(send(display, driver::DISP_IOC_END_UPDATE), 0) << "an end without a beginning is harmless";
}

}  // namespace

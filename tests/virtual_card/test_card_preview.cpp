// The preview pictures' way to the host: buffers, sizes, batches of layout commands.

#include "node_test.h"

namespace {

long read_preview(int display, u32 &index) {
  std::vector<u32> scratch(driver::kPreviewBufferSize / sizeof(u32), 0xA5A5A5A5);
  const long result = read_node(display, scratch.data(), driver::kPreviewBufferSize);
  index = scratch[0];
  EXPECT_EQ(scratch[1], 0xA5A5A5A5u) << "more than the index was written";
  return result;
}

std::vector<u8> buffer_of(int display, u32 index, long size = driver::kPreviewBufferSize) {
  EXPECT_EQ(send(display, driver::DISP_IOC_SELECT_BUFFER, index), 0);
  void *mapped = mmap(nullptr, driver::kPreviewBufferSize, PROT_READ, MAP_SHARED, display, 0);
  const std::vector<u8> bytes(static_cast<u8 *>(mapped), static_cast<u8 *>(mapped) + size);
  munmap(mapped, driver::kPreviewBufferSize);
  return bytes;
}

/// The picture after one more frame.
std::vector<u8> next_picture(int display) {
  card::advance_frames(1);
  u32 index = 0;
  const long size = read_preview(display, index);
  EXPECT_GT(size, 0);
  return buffer_of(display, index, size);
}

void show_first(int display, u32 x_end) {
  const ZV_DISPLAY_WINDOW window{0, 0, 1, 0, 0, x_end, 480, ZV_WINDOW_ENABLED};
  EXPECT_EQ(send(display, driver::DISP_IOC_SET_WINDOW, window), 0);
}

TEST_F(NodeTest, ThereIsNoPreviewUntilItIsOn) {
  u32 index = 0;
  card::advance_frames(3);
  EXPECT_EQ(read_preview(display, index), 0);
  EXPECT_EQ(card::counters().previews, 0u);
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  card::advance_frames(3);
  EXPECT_EQ(card::counters().previews, 3u);
  EXPECT_GT(read_preview(display, index), 0);
  EXPECT_EQ(read_node(display, &index, 3), -EINVAL);
  EXPECT_EQ(read_node(display, nullptr, driver::kPreviewBufferSize), -EFAULT);
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_OFF), 0);
  EXPECT_EQ(read_preview(display, index), 0);
}

// The host draws from the buffer it was given last: the card must not compose over its shoulder.
TEST_F(NodeTest, ThePreviewBufferInTheHostsHandsIsLeftAlone) {
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  show_first(display, 720);
  for (int frames = 1; frames <= 9; ++frames) {
    u32 index = 0;
    card::advance_frames(1);
    ASSERT_GT(read_preview(display, index), 0);
    const auto before = buffer_of(display, index);
    card::advance_frames(frames);
    EXPECT_TRUE(buffer_of(display, index) == before) << frames;
  }
}

TEST_F(NodeTest, PreviewPicturesHaveTheSizeOfTheStandardAndWidth) {
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
    EXPECT_THAT(size, testing::ElementsAre(each.width, each.field_lines));
    EXPECT_EQ(next_picture(display).size(), each.width * each.field_lines * 2 * 2);
  }
}

// A layout that shows half of its changes flickers through pictures nobody asked for.
TEST_F(NodeTest, ALayoutBatchIsShownAtItsEnd) {
  for (unsigned channel = 0; channel < ZV_CHANNELS; ++channel) card::set_scene(channel, card::Scene::still);
  EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
  const auto empty = next_picture(display);
  EXPECT_EQ(send(display, driver::DISP_IOC_BEGIN_UPDATE), 0);
  show_first(display, 720);
  EXPECT_EQ(next_picture(display), empty);
  EXPECT_EQ(send(display, driver::DISP_IOC_END_UPDATE), 0);
  const auto full = next_picture(display);
  EXPECT_NE(full, empty);
  show_first(display, 352);
  EXPECT_NE(next_picture(display), full) << "outside a batch a command acts at once";
  EXPECT_EQ(send(display, driver::DISP_IOC_END_UPDATE), 0) << "an end without a beginning is harmless";
}

}  // namespace

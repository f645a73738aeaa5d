// The preview pictures' way to the host: buffers, sizes, batches, and what the commands do to them.

#include "node_test.h"

namespace {

using namespace zarvo::driver;

class NodePreview : public NodeTest {
 protected:
  long read_preview(u32 &index) {
    std::vector<u32> large(kPreviewBufferSize / sizeof(u32), 0xA5A5A5A5);  // sanitizers believe the result
    const long result = read_node(display, large.data(), kPreviewBufferSize);
    index = large[0];
    EXPECT_EQ(large[1], 0xA5A5A5A5u) << "more than the index was written";
    return result;
  }
  std::vector<u8> buffer(u32 index, long size = kPreviewBufferSize) {
    EXPECT_EQ(send(display, DISP_IOC_SELECT_BUFFER, index), 0);
    void *mapped = mmap(nullptr, kPreviewBufferSize, PROT_READ, MAP_SHARED, display, 0);
    std::vector<u8> bytes(static_cast<u8 *>(mapped), static_cast<u8 *>(mapped) + size);
    munmap(mapped, kPreviewBufferSize);
    return bytes;
  }
  /// The picture after more frames.
  std::vector<u8> picture(int frames = 1) {
    card::advance_frames(frames);
    u32 index = 0;
    const long size = read_preview(index);
    EXPECT_GT(size, 0);
    return buffer(index, size);
  }
  /// Shows a still channel in window 2.
  void preview_on(u32 channel = 0, u32 x_end = 720) {
    card::apply("still=1-16");
    EXPECT_EQ(send(display, DISP_IOC_PREVIEW_ON), 0);
    EXPECT_EQ(send(video_input, VIN_IOC_WRITE_REG, Register{kRegRouting + 4 * 2, channel << kRoutingShift}),
              0);
    EXPECT_EQ(
        send(display, DISP_IOC_SET_WINDOW, ZV_DISPLAY_WINDOW{2, 0, 1, 0, 0, x_end, 480, ZV_WINDOW_ENABLED}),
        0);
  }
};

TEST_F(NodePreview, ThereIsNoneUntilItIsOnAndNoneAfterTheLastClose) {
  u32 index = 0;
  card::advance_frames(3);
  EXPECT_EQ(read_preview(index), 0);
  EXPECT_EQ(card::counters().previews, 0u);
  for (const bool closed : {false, true}) {
    EXPECT_EQ(send(display, DISP_IOC_PREVIEW_ON), 0);
    card::advance_frames(3);
    EXPECT_GT(read_preview(index), 0);
    EXPECT_EQ(read_node(display, &index, 3), -EINVAL);
    EXPECT_EQ(read_node(display, nullptr, kPreviewBufferSize), -EFAULT);
    if (closed)
      run_with(card::ClockMode::manual);
    else
      EXPECT_EQ(send(display, DISP_IOC_PREVIEW_OFF), 0);
    EXPECT_EQ(read_preview(index), 0);
    card::advance_frames(3);
    EXPECT_EQ(read_preview(index), 0);
  }
  EXPECT_EQ(card::counters().previews, 6u);
  card::queue_preview(3, 77);
  EXPECT_EQ(read_preview(index), 77);
  EXPECT_EQ(index, 3u);
  EXPECT_EQ(read_preview(index), 0);
}

// Catches: a card that composes into the buffer the host still draws from.
TEST_F(NodePreview, TheBufferInTheHostsHandsIsLeftAlone) {
  preview_on(0);
  card::apply("still=");
  for (int frames = 1; frames <= 9; ++frames) {
    u32 index = 0;
    card::advance_frames(1);
    ASSERT_GT(read_preview(index), 0);
    const auto before = buffer(index);
    card::advance_frames(frames);
    EXPECT_TRUE(buffer(index) == before) << frames;
  }
}

TEST_F(NodePreview, PicturesHaveTheSizeOfTheStandardAndWidth) {
  EXPECT_EQ(send(display, DISP_IOC_PREVIEW_ON), 0);
  for (const auto &[standard, width, field_lines] :
       {std::array{0u, 720u, 240u}, std::array{1u, 704u, 288u}, std::array{1u, 720u, 288u}}) {
    EXPECT_EQ(send(video_input, VIN_IOC_SET_WIDTH, width), 0);
    EXPECT_EQ(send(video_input, VIN_IOC_SET_STANDARD, standard), 0);
    EXPECT_EQ(reply(display, DISP_IOC_GET_WIDTH, u32{}), width);
    EXPECT_EQ(reply(display, DISP_IOC_GET_HEIGHT, u32{}), field_lines);
    EXPECT_EQ(picture().size(), width * field_lines * 2 * 2);
  }
}

// Catches: a layout that shows half of its changes, a batch that a program leaves open for the next.
TEST_F(NodePreview, ABatchIsShownAtItsEnd) {
  EXPECT_EQ(send(display, DISP_IOC_PREVIEW_ON), 0);
  const auto empty = picture();
  EXPECT_EQ(send(display, DISP_IOC_BEGIN_UPDATE), 0);
  preview_on();
  EXPECT_EQ(picture(), empty);
  EXPECT_EQ(send(display, DISP_IOC_END_UPDATE), 0);
  const auto full = picture();
  EXPECT_NE(full, empty);
  EXPECT_EQ(send(display, DISP_IOC_BEGIN_UPDATE), 0);
  close_nodes();
  open_nodes();
  preview_on(0, 352);
  EXPECT_NE(picture(), full) << "outside a batch a command acts at once";
  EXPECT_EQ(send(display, DISP_IOC_END_UPDATE), 0) << "an end without a beginning is harmless";
}

// Catches: commands and registers that are kept but reach no picture, or that change another property.
TEST_F(NodePreview, WhatTheChipsAreToldIsSeen) {
  preview_on(0);
  const auto first = picture();
  preview_on(6);
  auto seen = picture();
  EXPECT_NE(seen, first) << "routing";
  const auto set = [&](u8 property, u8 value) {
    const driver::DecoderRegister record{1, static_cast<u8>(0x27 + property), value};
    EXPECT_EQ(send(video_input, VIN_IOC_WRITE_TW2815, record), 0);
    seen = picture();
    return std::array{seen[200], seen[201], seen[100000], seen[100001]};  // of the yellow bar and the scene
  };
  const auto colour = set(0, 200);
  EXPECT_NE(colour[0], 128);
  EXPECT_THAT(set(1, 0), testing::ElementsAre(128, colour[1], 128, colour[3])) << "saturation";
  EXPECT_THAT(set(2, 0), testing::ElementsAre(128, 126, 128, 126)) << "contrast";
  EXPECT_THAT(set(3, 255), testing::ElementsAre(128, 180, 128, 180)) << "brightness";
}

TEST_F(NodePreview, MotionIsReportedAndMarkedWhereItIsSwitchedOn) {
  preview_on(6);
  card::apply("still=");
  EXPECT_EQ(send(display, DISP_IOC_WRITE_REG, Register{kRegMotionEnable, 1u << 22}), 0);
  const auto marks = [&] {
    const auto bytes = picture(6);
    return std::count(reinterpret_cast<const u32 *>(bytes.data()),
                      reinterpret_cast<const u32 *>(bytes.data() + bytes.size()), 0x6AD46A64u);
  };
  EXPECT_EQ(marks(), 0);
  EXPECT_EQ(reply(display, DISP_IOC_GET_MOTION, u32{}), 1u << 6);
  EXPECT_EQ(send(display, DISP_IOC_MOTION_TRACE_ON), 0);
  EXPECT_GT(marks(), 50);
  EXPECT_EQ(send(display, DISP_IOC_MOTION_TRACE_OFF), 0);
  EXPECT_EQ(marks(), 0);
  const std::vector<u16> never(64 * 64, kNeverMoves);
  EXPECT_EQ(send(video_input, VIN_IOC_SET_MOTION_MAP, MotionMap{6, 0, 0, 64, 64, never.data()}), 0);
  card::advance_frames(20);
  EXPECT_EQ(reply(display, DISP_IOC_GET_MOTION, u32{}), 0u);
}

}  // namespace

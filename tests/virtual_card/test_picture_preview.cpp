// The composed preview picture.

#include "picture/compositor.h"
#include "picture_test.h"

namespace {

class PreviewTest : public PictureTest {
 protected:
  /// Lays windows out as the host does: cells of whole multiples of 8, the first window large: it takes all
  /// but the last column and row.
  std::vector<Area> lay_out(u32 div, bool large) {
    const u32 cell_width = state.width / div & ~7u, cell_lines = state.lines() / div & ~7u;
    std::vector<Area> areas;
    if (large) areas.push_back({0, 0, cell_width * (div - 1), cell_lines * (div - 1)});
    for (u32 y = 0; y < cell_lines * div; y += cell_lines)
      for (u32 x = 0; x < cell_width * div; x += cell_width)
        if (!large || x >= areas[0].x_end || y >= areas[0].y_end)
          areas.push_back({x, y, x + cell_width, y + cell_lines});
    for (unsigned i = 0; i < areas.size(); ++i) window(i, areas[i]);
    return areas;
  }
  /// The channel shown in an area of the preview: its mark is read at the size of one field, without the
  /// margins of the wide input.
  unsigned channel_in(Area area) const {
    const u32 width = area.x_end - area.x_start, lines = area.y_end - area.y_start;
    const u32 height = state.lines() / 2, margin = (state.width - 704) / 2;
    std::vector<u8> luma;
    for (u32 y = 0; y < height; ++y)
      for (u32 x = margin; x < margin + 704; ++x)
        luma.push_back(pixel(area.x_start + x * width / state.width, area.y_start + y * lines / height).y);
    const auto mark = card::read_frame_mark(luma.data(), 704, 704, height);
    return mark ? mark->channel : card::kChannels;
  }
};

// Catches: cameras in the wrong windows, cut off or shifted in them, a focus drawn in the old window.
TEST_F(PreviewTest, EveryWindowShowsTheWholeOfItsRoutedCamera) {
  const struct {
    u32 standard, width, divisions;
    bool large;
  } layouts[] = {{0, 720, 1, false}, {0, 720, 2, false}, {0, 720, 3, true}, {0, 720, 4, true},
                 {0, 720, 3, false}, {0, 720, 4, false}, {1, 720, 3, true}, {1, 704, 4, false}};
  for (const auto &layout : layouts) {
    SCOPED_TRACE(&layout - layouts);
    power_up();
    state.standard = layout.standard;
    state.width = layout.width;
    const auto areas = lay_out(layout.divisions, layout.large);
    std::swap(state.display.routing[0], state.display.routing[12]);
    fields(8);
    compose();
    for (unsigned i = 0; i < areas.size(); ++i) {
      EXPECT_EQ(channel_in(areas[i]), state.display.routing[i]) << "window " << i;
      const auto [x, y, x_end, y_end] = areas[i];
      const Colour left = pixel(x + (x_end - x) / 16, y + (y_end - y) / 16);
      const Colour right = pixel(x_end - 2, y + (y_end - y) / 16);
      EXPECT_TRUE(near(left, {180, 128, 128}, 3) && near(right, card::kBlack, 3)) << "window " << i;
    }
  }
}

TEST_F(PreviewTest, OffLostAndUnusedPartsAreBlackAndBlue) {
  state.channel[1].lost = true;
  lay_out(4, false);
  state.display.layout.window[0].flags = 0;
  state.display.layout.window[5].scale = 0;
  fields(2);
  compose();
  EXPECT_TRUE(near(pixel(260, 60), card::kLostBlue, 0));
  for (const auto &[x, y] : {std::pair(80u, 40u), std::pair(260u, 180u), std::pair(712u, 40u)})
    EXPECT_TRUE(near(pixel(x, y), card::kBlack, 0)) << x;
  EXPECT_EQ(channel_in({352, 0, 528, 120}), 2u);
}

// Catches: a large window made of two fields of different frames.
TEST_F(PreviewTest, LargeWindowShowsOneWholeFrameAfterEitherField) {
  lay_out(1, false);
  for (int field = 0; field < 12; ++field) {
    fields(1);
    compose();
    for (u32 first = 0; field >= 2 && first < 2; ++first) {
      std::vector<u8> luma;
      for (u32 y = first; y < 480; y += 2)
        for (u32 x = 8; x < 712; ++x) luma.push_back(pixel(x, y).y);
      const FrameMark whole{0, static_cast<u32>((next - 2) / 2), first == 1};
      ASSERT_EQ(card::read_frame_mark(luma.data(), 704, 704, 240), whole);
    }
  }
}

TEST_F(PreviewTest, PictureInPictureLiesOnTopInItsFrame) {
  lay_out(1, false);
  constexpr Area kPip{464, 304, 704, 464};
  window(0, kPip, ZV_WINDOW_ENABLED | ZV_WINDOW_PIP);  // earlier in the list, later on the screen
  window(7, {0, 0, 720, 480});
  state.display.layout.frame[1] = {
      driver::kPipFrame, kPip.x_start, kPip.y_start, kPip.x_end, kPip.y_end, 1, 0};
  state.display.layout.frame[0] = {driver::kScreenFrame, 0, 0, 718, 478, 1, 0};
  fields(4);
  compose();
  EXPECT_EQ(channel_in(kPip), 0u);
  const Colour edge = pixel(600, 304);
  EXPECT_TRUE(near(edge, pixel(464, 400), 0) && near(edge, pixel(703, 463), 0));
  EXPECT_TRUE(near(edge, pixel(719, 100), 0) && near(edge, pixel(100, 479), 0)) << "the screen's frame";
  EXPECT_FALSE(near(edge, pixel(600, 302), 20));
  state.display.layout.window[0].scale = 0;
  state.display.layout.frame[1].enable = 0;
  compose();
  EXPECT_EQ(channel_in({0, 0, 720, 480}), 7u);
}

TEST_F(PreviewTest, ZoomMagnifiesTheQuarterAtItsOrigin) {
  lay_out(1, false);
  state.channel[0].scene = card::Scene::still;
  fields(2);
  compose();
  const auto plain = screen;
  for (const driver::Zoom zoom : {driver::Zoom{1, 0, 0}, driver::Zoom{2, 360, 240}, driver::Zoom{1, 100, 60},
                                  driver::Zoom{1, 9999, 9999}}) {
    state.display.layout.zoom = zoom;
    compose();
    const u32 left = std::min(zoom.x, 360u), top = std::min(zoom.y, 240u);
    for (u32 y = 0; y < 480; y += 16)
      for (u32 x = 0; x < 720; x += 24)
        ASSERT_TRUE(near(pixel(x, y), pixel_of(plain, left + x / 2, top + y / 2), 2)) << x << ", " << y;
  }
}

// Catches: grid lines through the large window, rectangles that lie outside the screen.
TEST_F(PreviewTest, GridFollowsItsMaskAndNothingLeavesTheScreen) {
  state.channel[0].scene = card::Scene::black;
  lay_out(3, true);
  state.display.layout.grid = {{0, 240, 480, 718, 0}, {0, 160, 320, 478, 0}, 0x744, 0};
  fields(2);
  compose();
  EXPECT_TRUE(near(pixel(240, 100), card::kBlack, 0)) << "under the large window";
  const Colour line = pixel(240, 400);
  EXPECT_TRUE(near(line, pixel(480, 50), 0) && near(line, pixel(100, 320), 0));

  constexpr u32 kFar = 0xFFFFFFFF;
  state.display.layout.grid = {{0, 5000, kFar, 3, 1}, {7, kFar, 2, 900, kFar}, 0xFFFF, 0};
  state.display.layout.frame[1] = {1, 700, 400, kFar, kFar, 1, 0};
  state.display.layout.zoom = {1, kFar, kFar};
  state.display.routing.fill(kFar);
  window(3, {kFar - 8, 0, kFar, 480});
  window(4, {699, 470, kFar, kFar});
  window(5, {400, 300, 401, 301});
  compose();  // the sanitizers watch
  EXPECT_EQ(screen.size(), 720u * 480 * 2);
}

}  // namespace

#include <climits>
#include <sstream>

#include "sdk_test.h"
#include "zv_display.h"

namespace vc = virtual_card;
using testing::ElementsAre;
using testing::ElementsAreArray;

namespace {

class Display : public CardTest {
 protected:
  ZV_DISPLAY *open(u32 width, u32 height, u32 mode = MUX_MODE_ZV_1CH) {
    ZV_DISPLAY *display = zv_display_open(handle, MUX_MODE_ZV_1CH);
    display->width = width;
    display->height = height;
    EXPECT_EQ(zv_display_mux_mode(display, mode, 0), 0);
    issued();
    return display;
  }
};

/// Windows as "scale x y x_end y_end", borders as five columns and five rows.
struct Layout {
  u32 width, height, mode;
  const char *windows;
  const char *borders;
  u32 cells;
  bool thirds;
};

const Layout kLayouts[] = {
    {720, 480, 0, "1 0 0 720 480", "0 718 0 0 0 0 478 0 0 0", 0x1, false},
    {720, 480, 1, "3 0 0 360 240,3 360 0 720 240,3 0 240 360 480,3 360 240 720 480",
     "0 360 718 0 0 0 240 478 0 0", 0x33, false},
    {720, 576, 1, "3 0 0 360 288,3 360 0 720 288,3 0 288 360 576,3 360 288 720 576",
     "0 360 718 0 0 0 288 574 0 0", 0x33, false},
    {720, 480, 2,
     "6 0 0 480 320,4 480 0 720 160,4 480 160 720 320,4 0 320 240 480,4 240 320 480 480,"
     "4 480 320 720 480",
     "0 244 484 718 0 0 160 320 478 0", 0x744, true},
    {720, 480, 3,
     "7 0 0 528 360,5 528 0 704 120,5 528 120 704 240,5 528 240 704 360,5 0 360 176 480,"
     "5 176 360 352 480,5 352 360 528 480,5 528 360 704 480",
     "0 176 352 528 718 0 120 240 360 478", 0xF888, false},
    {704, 480, 4,
     "4 0 0 232 160,4 232 0 464 160,4 464 0 696 160,4 0 160 232 320,4 232 160 464 320,"
     "4 464 160 696 320,4 0 320 232 480,4 232 320 464 480,4 464 320 696 480",
     "0 232 464 702 0 0 160 320 478 0", 0x777, false},
};

/// A window, border or source word that is off by a little, or sent out of order.
TEST_F(Display, LayoutsToTheByte) {
  for (const Layout &layout : kLayouts) {
    SCOPED_TRACE(layout.windows);
    ZV_DISPLAY *display = open(layout.width, layout.height);
    ASSERT_EQ(zv_display_mux_mode(display, layout.mode, RESOLUTION_ZV_720), 0);
    Lines expected = {cmd(0x6400)};
    std::istringstream windows(layout.windows);
    for (u32 i = 0; i < 16; ++i) {
      std::string window;
      if (!std::getline(windows, window, ',')) window = "0 0 0 0 0";
      expected.push_back(cmd(0x40206402, {i, i}) + " " + window + " 1");
    }
    for (u32 word : layout.thirds ? Words{0x00001000, 0x10001002, 0x200012BA, 0x300012BC}
                                  : Words{0, 0x10000000, 0x20000000, 0x30000000})
      expected.push_back(cmd(0x40046406, {word}));
    const std::string cells = std::to_string(layout.cells) + " 0";
    expected.insert(expected.end(), {cmd(0x40306407) + " " + layout.borders + " " + cells, cmd(0x6401)});
    EXPECT_THAT(issued(), ElementsAreArray(expected));
    EXPECT_EQ(zv_GetPreviewMode(handle), layout.mode);
  }
  // 16 pictures leave 16 pixels on the right where nothing is.
  ZV_DISPLAY *display = open(720, 480, MUX_MODE_ZV_16CH);
  EXPECT_EQ(zv_display_pos2channel(display, 703, 479), 15);
  EXPECT_EQ(zv_display_pos2channel(display, 704, 0), -1);
  ASSERT_EQ(zv_display_select_channel(display, 6), 0);
  const Lines lines = issued();
  EXPECT_EQ(lines[7], "40206402 6 6 1 0 0 720 480 1");
  EXPECT_EQ(lines[8], "40206402 7 7 0 0 0 0 0 1");
  EXPECT_EQ(lines[21], "40306407 0 718 0 0 0 0 478 0 0 0 1 0");
  EXPECT_EQ(zv_GetPreviewMode(handle), 0u);
}

TEST_F(Display, StandardReopensARunningDisplayOnly) {
  vc::set_codec_register(0x310, 0x7);
  ASSERT_EQ(zv_SetVideoStandard(handle, 1), ZV_OK);
  EXPECT_EQ(sent(), "c008640e 310 0; c0047604 1; c0046511 1; c004640d 1; c008640e 310 0; c008640f 310 7");

  vc::set_codec_register(0x310, 0x80000007);
  ASSERT_EQ(zv_SetResolution(handle, RESOLUTION_ZV_704), ZV_OK);
  const Lines lines = issued();
  EXPECT_THAT(Lines(lines.begin(), lines.begin() + 9),
              ElementsAre("c0047609 704", "c008640e 310 0", "c0047604 1", "c0046511 1", "c004640d 1",
                          "8004640b 0", "8004640c 0", "401c6408 0 0 0 702 574 1 0", "400c6403 0 0 0"));
  EXPECT_EQ(count(lines, cmd(0x6400)), 2u);  // by the reopening, and once more for the new width
  EXPECT_EQ(vc::codec_register(0x310), 0x80000007u);
  EXPECT_EQ(zv_SetVideoStandard(handle, 2), ZV_ERR_STANDARD);
  EXPECT_EQ(zv_SetResolution(handle, 2), ZV_ERR_RESOLUTION);
  EXPECT_EQ(zv_SetPreviewMode(handle, 6), ZV_ERR_MODE);
  EXPECT_EQ(zv_GetVideoStandard(handle), 1u);
  EXPECT_EQ(sent(), "");
}

TEST_F(Display, PreviewChannelsSetWholeFlagWords) {
  EXPECT_EQ(zv_EnablePreviewChannels(handle, 0x10000), ZV_ERR_CHANNEL);
  card().display.window[2].flags = 3;
  ASSERT_EQ(zv_EnablePreviewChannels(handle, 0x4), ZV_OK);
  const Lines lines = issued();
  EXPECT_EQ(lines[0], "00006410");
  EXPECT_EQ(lines[3], "40206402 2 2 0 0 0 0 0 1");
  EXPECT_EQ(lines[16], "40206402 15 15 0 0 0 0 0 0");
  ASSERT_EQ(zv_EnablePreviewChannels(handle, 0), ZV_OK);
  EXPECT_EQ(issued()[0], "00006411");
}

TEST_F(Display, FocusSwapsTwoPositions) {
  for (u32 k = 0; k < 16; ++k) vc::set_video_input_register(0x180 + 4 * k, k << 28 | (0x123400 + k));
  ASSERT_EQ(zv_SetFocusChannel(handle, 2), ZV_OK);
  EXPECT_EQ(sent(),
            "c0087605 180 0; c0087605 184 0; c0087605 188 0; c0087606 180 20123400; c0087605 188 0; c0087606 "
            "188 123402");
  EXPECT_EQ(zv_GetFocusChannel(handle), 2u);
  EXPECT_EQ(card().display.window[0].channel, 2u);
  EXPECT_EQ(card().display.window[2].channel, 0u);
  EXPECT_EQ(zv_SetFocusChannel(handle, 16), ZV_ERR_CHANNEL);
  issued();
  EXPECT_EQ(zv_SetFocusChannel(handle, 2), ZV_OK);
  EXPECT_EQ(issued().size(), 1u);
  // A channel that no position carries: a swap would write past the last register and window.
  vc::set_video_input_register(0x180 + 4 * 9, 0);
  EXPECT_EQ(zv_SetFocusChannel(handle, 9), ZV_ERR_CHANNEL);
  EXPECT_EQ(count(issued(), cmd(0xC0087605, {0x1C0, 0})), 0u);
  EXPECT_EQ(zv_GetFocusChannel(handle), 2u);
  EXPECT_EQ(zv_EnableVideoChannelNumber(handle, 5), ZV_OK);
  EXPECT_EQ(zv_DisableVideoChannelNumber(handle, 15), ZV_OK);
  EXPECT_EQ(zv_DisableVideoChannelNumber(handle, 16), ZV_ERR_CHANNEL);
  EXPECT_THAT(sent(), testing::EndsWith("; c004650b 5; c004650c 15"));
}

TEST_F(Display, PictureInPicture) {
  ZV_DISPLAY *display = open(720, 480);
  for (int channel : {0, 16, -1, -2}) EXPECT_EQ(zv_display_pip(display, channel, 0, 0), -1);
  EXPECT_EQ(zv_display_pip_move(display, 1, 1), -1);
  EXPECT_EQ(sent(), "");

  const auto shown_at = [](u32 channel, u32 x, u32 y) {
    return ElementsAre(cmd(0x40206402, {channel, channel, 4, x, y, x + 240, y + 160, 3}),
                       cmd(0x401C6408, {1, x, y, x + 240, y + 160, 1, 0}));
  };
  ASSERT_EQ(zv_display_pip(display, 3, 700, 500), 0);
  EXPECT_THAT(issued(), shown_at(3, 480, 320));
  ASSERT_EQ(zv_display_pip(display, 4, 13, 21), 0);  // channel 3 stays on screen
  EXPECT_THAT(issued(), shown_at(4, 8, 16));
  EXPECT_EQ(zv_display_pos2channel(display, 700, 400), 4);
  EXPECT_EQ(zv_display_mux_mode(display, 1, 0), -1);
  EXPECT_EQ(zv_display_select_channel(display, 1), -1);
  EXPECT_EQ(zv_display_zoom(display, 1, 0, 0), -1);
  struct Move {
    int dx, dy;
    u32 x, y;
  };
  for (const Move &move :
       {Move{-100, 0, 0, 16}, Move{INT_MAX, INT_MAX, 480, 320}, Move{INT_MIN, -9, 0, 304}}) {
    ASSERT_EQ(zv_display_pip_move(display, move.dx, move.dy), 0);
    EXPECT_THAT(issued(), shown_at(4, move.x, move.y)) << move.dx;
  }
  ASSERT_EQ(zv_display_pip(display, -1, 0, 0), 0);
  EXPECT_EQ(sent(), "40206402 4 4 0 0 304 0 304 1; 401c6408 1 0 0 0 0 0 0");
  EXPECT_EQ(zv_display_channel_mode(display, 16, 1), -1);
  EXPECT_EQ(zv_display_channel_mode(display, 15, 0), 0);
  EXPECT_EQ(sent(), "40206402 15 15 0 0 0 0 0 0");
}

TEST_F(Display, ZoomFreezesTheLayout) {
  ZV_DISPLAY *display = open(720, 480);
  struct Zoom {
    int x, y;
    std::string sent;
  };
  for (const Zoom &zoom : {Zoom{500, -3, "400c6403 1 360 0"}, Zoom{INT_MAX, INT_MAX, "400c6403 1 360 240"},
                           Zoom{INT_MIN, 239, "400c6403 1 0 239"}}) {
    ASSERT_EQ(zv_display_zoom(display, 1, zoom.x, zoom.y), 0);
    EXPECT_EQ(sent(), zoom.sent);
  }
  EXPECT_EQ(zv_display_pip(display, 3, 0, 0), -1);
  EXPECT_EQ(zv_display_mux_mode(display, 1, 0), -1);
  // The mode is stored though refused, and then keeps zoom from being switched off.
  EXPECT_EQ(zv_SetPreviewMode(handle, 1), ZV_OK);
  EXPECT_EQ(zv_GetPreviewMode(handle), 1u);
  EXPECT_EQ(zv_display_zoom(display, 0, 0, 0), -1);
  EXPECT_EQ(zv_SetPreviewMode(handle, 0), ZV_OK);
  vc::inject({.operation = vc::Operation::ioctl, .code = 0x400C6403});
  EXPECT_EQ(zv_display_zoom(display, 0, 0, 0), -1);
  EXPECT_EQ(display->zoom, 1u);
  EXPECT_EQ(zv_display_zoom(display, 0, 0, 0), 0);
  EXPECT_EQ(zv_display_mux_mode(display, 1, 0), 0);
  EXPECT_EQ(zv_display_zoom(display, 1, 0, 0), -1);
  EXPECT_EQ(zv_display_pip(display, 9, 0, 0), -1);
  EXPECT_EQ(zv_display_mux_mode(display, 6, 0), -1);
  EXPECT_EQ(zv_display_open(handle, 6), nullptr);
  for (u32 on : {7u, 0u}) EXPECT_EQ(zv_display_motion_trace(display, on), 0);
  EXPECT_THAT(sent(), testing::EndsWith("; 00006409; 0000640a"));
}

}  // namespace

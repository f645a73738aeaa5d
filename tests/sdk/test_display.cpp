// Tests of the preview picture: layouts, channels, focus, picture-in-picture and zoom.

#include "zv_display.h"

#include <climits>
#include <sstream>

#include "sdk_test.h"

using testing::HasSubstr;
using testing::StartsWith;

namespace {

class Display : public SdkTest {
 protected:
  ZV_DISPLAY *open(u32 width, u32 height, u32 mode = MUX_MODE_ZV_1CH) {
    ZV_DISPLAY *display = zv_display_open(handle, MUX_MODE_ZV_1CH);
    display->width = width;
    display->height = height;
    EXPECT_EQ(zv_display_mux_mode(display, mode, RESOLUTION_ZV_720), 0);
    issued();
    return display;
  }
};

/// Windows as "scale x y x_end y_end", the grid as five columns, five rows and the cells.
struct Layout {
  u32 width, height, mode;
  const char *windows;
  std::string grid;
  bool thirds;
};

const Layout kLayouts[] = {
    {720, 480, 0, "1 0 0 720 480", "0 718 0 0 0 0 478 0 0 0 1 0", false},
    {720, 576, 1, "3 0 0 360 288,3 360 0 720 288,3 0 288 360 576,3 360 288 720 576",
     "0 360 718 0 0 0 288 574 0 0 51 0", false},
    {720, 480, 2,
     "6 0 0 480 320,4 480 0 720 160,4 480 160 720 320,4 0 320 240 480,4 240 320 480 480,"
     "4 480 320 720 480",
     "0 244 484 718 0 0 160 320 478 0 1860 0", true},
    {720, 480, 3,
     "7 0 0 528 360,5 528 0 704 120,5 528 120 704 240,5 528 240 704 360,5 0 360 176 480,"
     "5 176 360 352 480,5 352 360 528 480,5 528 360 704 480",
     "0 176 352 528 718 0 120 240 360 478 63624 0", false},
    {704, 480, 4,
     "4 0 0 232 160,4 232 0 464 160,4 464 0 696 160,4 0 160 232 320,4 232 160 464 320,"
     "4 464 160 696 320,4 0 320 232 480,4 232 320 464 480,4 464 320 696 480",
     "0 236 468 702 0 0 160 320 478 0 1911 0", true},
};

/// Catches: a window, border or source word that is off by a little, or sent out of order.
TEST_F(Display, LayoutsToTheByte) {
  for (const Layout &layout : kLayouts) {
    SCOPED_TRACE(layout.windows);
    ZV_DISPLAY *display = open(layout.width, layout.height);
    ASSERT_EQ(zv_display_mux_mode(display, layout.mode, layout.width == 720 ? 0 : 1), 0);
    Lines expected = {"DISP_IOC_BEGIN_UPDATE"};
    std::istringstream windows(layout.windows);
    for (u32 i = 0; i < 16; ++i) {
      std::string window;
      if (!std::getline(windows, window, ',')) window = "0 0 0 0 0";
      expected.push_back(line("DISP_IOC_SET_WINDOW", i, i) + " " + window + " 1");
    }
    for (u32 word : layout.thirds ? std::array{0x00001000u, 0x10001002u, 0x200012BAu, 0x300012BCu}
                                  : std::array{0u, 0x10000000u, 0x20000000u, 0x30000000u})
      expected.push_back(line("DISP_IOC_SET_SOURCE_CFG", word));
    expected.insert(expected.end(), {"DISP_IOC_SET_GRID " + layout.grid, "DISP_IOC_END_UPDATE"});
    EXPECT_EQ(issued(), expected);
    EXPECT_EQ(zv_GetPreviewMode(handle), layout.mode);
  }
  // The source words belong to a display as wide as the input.
  ASSERT_EQ(zv_display_mux_mode(&kept().display, MUX_MODE_ZV_9CH, RESOLUTION_ZV_720), 0);
  EXPECT_EQ(issued()[17], "DISP_IOC_SET_SOURCE_CFG 0");
}

TEST_F(Display, OnePictureOfSixteen) {
  ZV_DISPLAY *display = open(720, 480, MUX_MODE_ZV_16CH);
  EXPECT_EQ(display->window[15].scale, 5u);
  EXPECT_EQ(zv_display_pos2channel(display, 176, 120), 5);
  EXPECT_EQ(zv_display_pos2channel(display, 703, 479), 15);
  EXPECT_EQ(zv_display_pos2channel(display, 704, 0), -1);             // 16 pixels on the right are left over
  std::swap(display->window[0].channel, display->window[6].channel);  // as the focus does
  ASSERT_EQ(zv_display_select_channel(display, 6), 0);
  const Lines lines = issued();
  EXPECT_EQ(lines[1], "DISP_IOC_SET_WINDOW 0 6 1 0 0 720 480 1");
  EXPECT_EQ(lines[7], "DISP_IOC_SET_WINDOW 6 0 0 0 0 0 0 1");
  EXPECT_EQ(lines[21], "DISP_IOC_SET_GRID 0 718 0 0 0 0 478 0 0 0 1 0");
  EXPECT_EQ(zv_GetPreviewMode(handle), 0u);
}

TEST_F(Display, StandardReopensARunningDisplayOnly) {
  card::set_codec_register(0x310, 0x7);
  EXPECT_EQ(sent(zv_SetVideoStandard(handle, 1)),
            "read 0x310; VIN_IOC_SET_STANDARD 1; ENC_IOC_SET_STANDARD 1; DISP_IOC_SET_STANDARD 1; "
            "read 0x310; write 0x310 7");
  card::set_codec_register(0x310, 0x80000007);
  const std::string all = sent(zv_SetResolution(handle, RESOLUTION_ZV_704));
  EXPECT_THAT(all, StartsWith("VIN_IOC_SET_WIDTH 704; read 0x310; VIN_IOC_SET_STANDARD 1; "
                              "ENC_IOC_SET_STANDARD 1; DISP_IOC_SET_STANDARD 1; DISP_IOC_GET_WIDTH 0; "
                              "DISP_IOC_GET_HEIGHT 0; DISP_IOC_SET_RECT 0 0 0 702 574 1 0; "
                              "DISP_IOC_SET_ZOOM 0 0 0; DISP_IOC_BEGIN_UPDATE; "));
  // Laid out again for the new width.
  EXPECT_THAT(all,
              HasSubstr("DISP_IOC_END_UPDATE; read 0x310; write 0x310 80000007; DISP_IOC_BEGIN_UPDATE; "));
  EXPECT_EQ(zv_GetVideoStandard(handle), 1u);
}

TEST_F(Display, PreviewChannelsSetWholeFlagWords) {
  kept().display.window[2].flags = 3;
  const std::string some = sent(zv_EnablePreviewChannels(handle, 0x4));
  EXPECT_THAT(some, StartsWith("DISP_IOC_PREVIEW_ON; DISP_IOC_SET_WINDOW 0 0 0 0 0 0 0 0; "));
  EXPECT_THAT(some,
              HasSubstr("; DISP_IOC_SET_WINDOW 2 2 0 0 0 0 0 1; DISP_IOC_SET_WINDOW 3 3 0 0 0 0 0 0; "));
  EXPECT_THAT(sent(zv_EnablePreviewChannels(handle, 0)), StartsWith("DISP_IOC_PREVIEW_OFF; "));
}

TEST_F(Display, FocusSwapsTwoPositions) {
  for (u32 k = 0; k < 16; ++k) card::set_video_input_register(0x180 + 4 * k, k << 28 | (0x123400 + k));
  EXPECT_EQ(sent(zv_SetFocusChannel(handle, 2)),
            "input read 0x180; input read 0x184; input read 0x188; input write 0x180 20123400; "
            "input read 0x188; input write 0x188 123402");
  EXPECT_EQ(sent(zv_SetFocusChannel(handle, 2)), "input read 0x180");
  EXPECT_EQ(kept().display.window[0].channel, 2u);
  EXPECT_EQ(kept().display.window[2].channel, 0u);
  // A channel that no position carries: a swap would write past the last register and window.
  card::set_video_input_register(0x1A4, 0);
  EXPECT_EQ(zv_SetFocusChannel(handle, 9), ZV_ERR_CHANNEL);
  EXPECT_THAT(sent(), testing::EndsWith("; input read 0x1b8; input read 0x1bc"));
  EXPECT_EQ(zv_GetFocusChannel(handle), 2u);
}

TEST_F(Display, PictureInPicture) {
  ZV_DISPLAY *display = open(720, 480);
  expect_all(-1, zv_display_pip(display, 0, 0, 0), zv_display_pip(display, 16, 0, 0),
             zv_display_pip(display, -1, 0, 0), zv_display_pip(display, -2, 0, 0),
             zv_display_pip_move(display, 1, 1));
  EXPECT_EQ(sent(), "");

  const auto shown_at = [](u32 channel, u32 x, u32 y) {
    return line("DISP_IOC_SET_WINDOW", channel, channel, 4, x, y, x + 240, y + 160, 3) + "; " +
           line("DISP_IOC_SET_RECT", 1, x, y, x + 240, y + 160, 1, 0);
  };
  EXPECT_EQ(sent(zv_display_pip(display, 3, 700, 500)), shown_at(3, 480, 320));
  EXPECT_EQ(sent(zv_display_pip(display, 4, 13, 21)), shown_at(4, 8, 16));  // channel 3 stays on screen
  EXPECT_EQ(zv_display_pos2channel(display, 700, 400), 4);
  expect_all(-1, zv_display_mux_mode(display, 1, 0), zv_display_select_channel(display, 1),
             zv_display_zoom(display, 1, 0, 0));
  EXPECT_EQ(sent(zv_display_pip_move(display, -100, 0)), shown_at(4, 0, 16));
  EXPECT_EQ(sent(zv_display_pip_move(display, INT_MAX, INT_MAX)), shown_at(4, 480, 320));
  EXPECT_EQ(sent(zv_display_pip_move(display, INT_MIN, -9)), shown_at(4, 0, 304));
  EXPECT_EQ(sent(zv_display_pip(display, -1, 0, 0)),
            "DISP_IOC_SET_WINDOW 4 4 0 0 304 0 304 1; DISP_IOC_SET_RECT 1 0 0 0 0 0 0");
  EXPECT_EQ(zv_display_pos2channel(display, 700, 400), 0);
  EXPECT_EQ(zv_display_mux_mode(display, 1, 0), 0);  // no longer refused
}

TEST_F(Display, ZoomFreezesTheLayout) {
  ZV_DISPLAY *display = open(720, 480);
  EXPECT_EQ(sent(zv_display_zoom(display, 1, 500, -3)), "DISP_IOC_SET_ZOOM 1 360 0");
  EXPECT_EQ(sent(zv_display_zoom(display, 1, INT_MAX, INT_MAX)), "DISP_IOC_SET_ZOOM 1 360 240");
  EXPECT_EQ(sent(zv_display_zoom(display, 1, INT_MIN, 239)), "DISP_IOC_SET_ZOOM 1 0 239");
  expect_all(-1, zv_display_pip(display, 3, 0, 0), zv_display_mux_mode(display, 1, 0));
  // The mode is stored though refused, and then keeps zoom from being switched off.
  EXPECT_EQ(zv_SetPreviewMode(handle, 1), ZV_OK);
  EXPECT_EQ(zv_GetPreviewMode(handle), 1u);
  EXPECT_EQ(zv_display_zoom(display, 0, 0, 0), -1);
  EXPECT_EQ(zv_SetPreviewMode(handle, 0), ZV_OK);
  card::apply("fail=any/ioctl/DISP_IOC_SET_ZOOM:EIO:1");
  EXPECT_EQ(zv_display_zoom(display, 0, 0, 0), -1);
  EXPECT_EQ(display->zoom, 1u);
  EXPECT_EQ(zv_display_zoom(display, 0, 0, 0), 0);
  EXPECT_EQ(zv_display_mux_mode(display, 1, 0), 0);
  expect_all(-1, zv_display_zoom(display, 1, 0, 0), zv_display_pip(display, 9, 0, 0),
             zv_display_mux_mode(display, 6, 0), zv_display_channel_mode(display, 16, 1));
  EXPECT_EQ(zv_display_open(handle, 6), nullptr);
  issued();
  EXPECT_EQ(sent(zv_display_channel_mode(display, 15, 0)), "DISP_IOC_SET_WINDOW 15 15 0 0 0 0 0 0");
  for (u32 on : {7u, 0u}) EXPECT_EQ(zv_display_motion_trace(display, on), 0);
  EXPECT_EQ(sent(), "DISP_IOC_MOTION_TRACE_ON; DISP_IOC_MOTION_TRACE_OFF");
}

}  // namespace

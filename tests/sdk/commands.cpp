// The driver's interface in hand-written numbers: the code and record of every command, every mapping and
// read.

#include <tuple>

#include "sdk_test.h"
#include "zv_display.h"
#include "zv_video.h"

namespace {

/// A command and an example of it: the words of the record in the order in which they are on the wire.
struct Command {
  u32 code;
  const char *name;
  std::string record;
};
const Command kCommands[] = {
    {0x40086500, "ENC_IOC_SET_SCALE", " 5 9"},
    {0x400C6501, "ENC_IOC_SET_INTERVAL", " 5 515 1"},
    {0x40086502, "ENC_IOC_SET_GOP", " 5 25"},
    {0x40086503, "ENC_IOC_SET_QP", " 5 6"},
    {0xC0086504, "ENC_IOC_GET_SCALE", " 5 0"},
    {0xC00C6505, "ENC_IOC_GET_INTERVAL", " 5 0 0"},
    {0xC0086506, "ENC_IOC_GET_GOP", " 5 0"},
    {0xC0086507, "ENC_IOC_GET_QP", " 5 0"},
    {0x00006509, "ENC_IOC_MPEG4_DONE", ""},
    {0xC004650B, "ENC_IOC_CHANNEL_NUMBER_ON", " 6"},
    {0xC004650C, "ENC_IOC_CHANNEL_NUMBER_OFF", " 7"},
    {0xC008650E, "encoder write", " 0x670 2020202"},
    {0x0000650F, "ENC_IOC_MPEG4_REQUEST", ""},
    {0x00006510, "ENC_IOC_STOP", ""},
    {0xC0046511, "ENC_IOC_SET_STANDARD", " 1"},
    {0x00006512, "ENC_IOC_START", ""},
    {0xC00C6513, "ENC_IOC_SET_CBR", " 5 500000 1"},
    {0xC0106514, "ENC_IOC_SET_QP_RANGE", " 5 20 3 1"},
    {0x00006400, "DISP_IOC_BEGIN_UPDATE", ""},
    {0x00006401, "DISP_IOC_END_UPDATE", ""},
    {0x40206402, "DISP_IOC_SET_WINDOW", " 7 7 5 528 360 704 480 1"},
    {0x400C6403, "DISP_IOC_SET_ZOOM", " 2 100 50"},
    {0x40046406, "DISP_IOC_SET_SOURCE_CFG", " 805306368"},
    {0x40306407, "DISP_IOC_SET_GRID", " 0 176 352 528 718 0 120 240 360 478 63624 0"},
    {0x401C6408, "DISP_IOC_SET_RECT", " 1 8 16 248 176 1 0"},
    {0x00006409, "DISP_IOC_MOTION_TRACE_ON", ""},
    {0x0000640A, "DISP_IOC_MOTION_TRACE_OFF", ""},
    {0x8004640B, "DISP_IOC_GET_WIDTH", " 0"},
    {0x8004640C, "DISP_IOC_GET_HEIGHT", " 0"},
    {0xC004640D, "DISP_IOC_SET_STANDARD", " 1"},
    {0xC008640E, "read", " 0x260"},
    {0xC008640F, "write", " 0x268 ffff"},
    {0x00006410, "DISP_IOC_PREVIEW_ON", ""},
    {0x00006411, "DISP_IOC_PREVIEW_OFF", ""},
    {0x80046412, "DISP_IOC_GET_MOTION", " 0"},
    {0xC0046413, "DISP_IOC_SELECT_BUFFER", " 3"},
    {0x40147601, "VIN_IOC_SET_MASK", " 9 80 240 40 160"},
    {0x40187602, "VIN_IOC_SET_MOTION_MAP", " 4 1 2 2 1: 2 x 65535"},
    {0xC0047604, "VIN_IOC_SET_STANDARD", " 1"},
    {0xC0087605, "input read", " 0x140"},
    {0xC0087606, "input write", " 0x180 20000000"},
    {0xC0037607, "decoder read", " 3 0x5a"},
    {0xC0037608, "decoder write", " 0 0x73 11"},
    {0xC0047609, "VIN_IOC_SET_WIDTH", " 704"},
    {0xC008760A, "board", " 0x3a"},
    {0xC002760B, "VIN_IOC_GET_MOTION_LEVELS", " 0 0 0 0 0 0 0 0"}};

class Wire : public SdkTest {
 protected:
  void use_everything();
};

void Wire::use_everything() {
  ZV_VIDEO_CONFIG config = settings(SCALE_ZV_D1, INTERVAL_ZV_22DOT5FPS_NTSC);
  config.mjpeg = VIDEO_CODEC_ZV_MJPEG;
  config.CBRValue = 500000;
  std::tie(config.CBREnable, config.QPMinMaxEnable, config.QPMax, config.QPMin) = std::tuple(1, 1, 20, 3);
  zv_SetVideoEncodeConfig(handle, 5, &config);
  zv_EnableVideoRecordChannels(handle, 1 << 5);
  zv_get_video_config(handle, 5);
  zv_EnableVideoChannelNumber(handle, 6);
  zv_DisableVideoChannelNumber(handle, 7);
  card::set_codec_register(0x310, 0x80000000);
  for (u32 standard : {1, 0}) zv_SetVideoStandard(handle, standard);
  for (u32 mode : {MUX_MODE_ZV_8CH, MUX_MODE_ZV_1CH}) zv_SetPreviewMode(handle, mode);
  for (int channel : {3, -1}) zv_display_pip(&kept().display, channel, 8, 16);
  zv_display_zoom(&kept().display, 2, 100, 50);
  zv_SetResolution(handle, RESOLUTION_ZV_704);
  zv_EnablePreviewChannels(handle, 1);
  u8 *picture = nullptr;
  zv_GetPreviewScreen(handle, &picture);
  for (u32 window : {0, 2}) card::set_video_input_register(0x180 + 4 * window, window << 28);
  zv_SetFocusChannel(handle, 2);
  const ZV_RECT blocks{16, 32, 40, 40}, mask{80, 40, 240, 160};
  zv_MarkMotionArea(handle, 4, &blocks, 1);
  zv_SetShieldRect(handle, 9, &mask);
  ZV_RECT rect{};
  zv_GetShieldRect(handle, 0, &rect);
  zv_StartMotionDetection(handle);
  zv_GetMotionStatus(handle);
  zv_GetHardwareVersion(handle);
  zv_EnableAudioChannels(handle, 1);
  zv_Start(handle);
  EXPECT_TRUE(eventually([] {
    return count(operations(), "read encoder 0xffc00") > 0 && count(operations(), "read audio 0x4") > 0;
  }));
}

/// Catches: a mistyped number in the driver's header, which the virtual card shares with the SDK.
TEST_F(Wire, EveryCommandMappingAndRead) {
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  card::record_log(true);
  open_card();
  use_everything();
  EXPECT_EQ(zv_Stop(handle), ZV_OK);
  EXPECT_EQ(zv_Close(handle), ZV_OK);
  const Lines all = operations();
  for (const Command &command : kCommands) EXPECT_THAT(all, testing::Contains(command.name + command.record));
  EXPECT_THAT(
      all, testing::IsSupersetOf({"mmap encoder 0x200000", "mmap display 0x240000", "read encoder 0x100000",
                                  "read display 0x240000", "read audio 0x4"}));
}

}  // namespace

std::string command_name(u32 code) {
  for (const Command &command : kCommands)
    if (command.code == code) return command.name;
  return "UNKNOWN COMMAND";
}

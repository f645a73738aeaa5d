// Tests of picture properties, motion detection and privacy masks.

#include "internal.h"
#include "sdk_test.h"

namespace {

using Picture = SdkTest;

using Values = std::array<i32, 4>;
Values values(const ZV_VIDEO_PROPERTY &p) {
  return {p.hue, p.saturation, p.contrast, p.brightness};
}

TEST_F(Picture, PropertiesGoToTheChannelsRegisters) {
  ZV_VIDEO_PROPERTY property{7, 200, 0, -25};
  EXPECT_EQ(
      sent(zv_SetVideoProperty(handle, 5, &property)),
      "decoder write 1 0x17 84; decoder write 1 0x18 ff; decoder write 1 0x19 0; decoder write 1 0x1a 0");
  EXPECT_EQ(values(property), (Values{6, 200, 0, -25}));
  EXPECT_EQ(values(kept().property[5]), values(property));
  EXPECT_EQ(sent(zv_GetVideoProperty(handle, 15, &property)),
            "decoder read 3 0x37; decoder read 3 0x38; decoder read 3 0x39; decoder read 3 0x3a");
  using Property = ZV_VIDEO_PROPERTY;
  for (Property bad :
       {Property{181, 0, 0, 0}, Property{-181, 0, 0, 0}, Property{0, -1, 0, 0}, Property{0, 201, 0, 0},
        Property{0, 0, 201, 0}, Property{0, 0, 0, 26}, Property{0, 0, 0, -26}, Property{7, 0, -1, 0}}) {
    const Values before = values(bad);
    EXPECT_EQ(zv_SetVideoProperty(handle, 5, &bad), ZV_ERR_PARAM);
    EXPECT_EQ(values(bad), before);
  }
  EXPECT_EQ(sent(), "");
}

TEST_F(Picture, ChannelNumbers) {
  EXPECT_EQ(sent(zv_EnableVideoChannelNumber(handle, 6)), "ENC_IOC_CHANNEL_NUMBER_ON 6");
  EXPECT_EQ(sent(zv_DisableVideoChannelNumber(handle, 7)), "ENC_IOC_CHANNEL_NUMBER_OFF 7");
}

/// Catches: rounding that drifts, so that a slider moves by itself when the panel reads the value back.
TEST_F(Picture, PropertiesSurviveARoundTrip) {
  ZV_VIDEO_PROPERTY reg{}, back{};
  const auto go_and_return = [&](ZV_VIDEO_PROPERTY &user) {
    zarvo::translate_video_property(reg, user);
    zarvo::inverse_translate_video_property(back, reg);
  };
  for (i32 step = 0; step <= 200; ++step) {
    ZV_VIDEO_PROPERTY user{0, step, 200 - step, step / 4 - 25};
    go_and_return(user);
    EXPECT_EQ(values(back), values(user));
  }
  // Hue as asked, as kept, in the register, as read back.
  for (const Values &hue :
       {Values{-178, -178, 1, -176}, Values{-7, -6, 123, -6}, Values{90, 90, 192, 90},
        Values{180, 180, 255, 180}, Values{-180, -180, 0, -180}, Values{179, 178, 254, 178}}) {
    ZV_VIDEO_PROPERTY user{hue[0], 0, 0, 0};
    go_and_return(user);
    EXPECT_EQ((Values{hue[0], user.hue, reg.hue, back.hue}), hue);
  }
}

TEST_F(Picture, MotionThresholdsAndAreas) {
  EXPECT_EQ(sent(zv_SetMotionSensitivity(handle, 3, 0x1234)),
            "VIN_IOC_SET_MOTION_MAP 3 0 0 64 64: 4096 x 4660; write 0x268 ffff");
  EXPECT_EQ(sent(zv_SetMotionSensitivity(handle, 5, 65535)),  // the highest: never
            "VIN_IOC_SET_MOTION_MAP 5 0 0 64 64: 4096 x 65535; write 0x268 ffff");
  struct Area {
    ZV_RECT rect;
    u32 mark;
    std::string map;
  };
  // An area off the raster counts the blocks of its size, not those it touches.
  for (const Area &area :
       {Area{{0, 0, 720, 480}, 1, "VIN_IOC_SET_MOTION_MAP 3 0 0 45 30: 1350 x 65535"},
        Area{{16, 32, 40, 40}, 0, "VIN_IOC_SET_MOTION_MAP 3 1 2 2 1: 2 x 4660"},
        Area{{8, 8, 24, 24}, 2, "VIN_IOC_SET_MOTION_MAP 3 0 0 1 1: 1 x 65535"}, Area{{8, 8, 8, 20}, 1, ""}})
    EXPECT_EQ(sent(zv_MarkMotionArea(handle, 3, &area.rect, area.mark)), area.map);

  // A refused map: the number is stored all the same.
  card::apply("fail=any/ioctl/VIN_IOC_SET_MOTION_MAP:EIO");
  const ZV_RECT block{0, 0, 16, 16};
  EXPECT_EQ(zv_SetMotionSensitivity(handle, 4, 77), ZV_ERR_DEVICE);
  EXPECT_EQ(zv_MarkMotionArea(handle, 4, &block, 1), ZV_ERR_DEVICE);
  u32 sensitivity = 0;
  EXPECT_EQ(zv_GetMotionSensitivity(handle, 4, &sensitivity), ZV_OK);
  EXPECT_EQ(sensitivity, 77u);
}

TEST_F(Picture, MotionOnOffAndStatus) {
  card::set_codec_register(0x260, 0x00AA0055);
  EXPECT_EQ(sent(zv_StartMotionDetection(handle)),
            "write 0x268 ffff; read 0x260; write 0x260 ffff0055; DISP_IOC_MOTION_TRACE_ON");
  EXPECT_EQ(sent(zv_StopMotionDetection(handle)),
            "read 0x260; write 0x260 55; DISP_IOC_MOTION_TRACE_OFF; write 0x268 ffff");
  card::script_motion(0xABCD0005);
  card::apply("lost=3");
  EXPECT_EQ(zv_GetMotionStatus(handle), 1u);
  EXPECT_EQ(kept().motion_status, 1u);  // the next frames are tagged with it
}

/// Catches: an area beyond the picture, or one within it that is refused, in either standard and width.
TEST_F(Picture, MasksAndMotionAreasFitThePicture) {
  struct Case {
    u32 standard, resolution;
    ZV_RECT rect;
    bool fits;
  };
  for (const auto &[standard, resolution, r, fits] :
       {Case{0, 0, {0, 0, 720, 480}, true}, Case{0, 0, {0, 0, 0, 0}, true},
        Case{1, 1, {80, 40, 704, 576}, true}, Case{0, 0, {0, 0, 721, 480}, false},
        Case{0, 0, {0, 0, 720, 481}, false}, Case{0, 0, {20, 0, 10, 16}, false},
        Case{0, 0, {0, 20, 16, 10}, false}, Case{0, 0, {~0u, 0, ~0u, 16}, false},
        Case{0, 1, {0, 0, 720, 480}, false}}) {
    zv_SetVideoStandard(handle, standard);
    zv_SetResolution(handle, resolution);
    EXPECT_EQ(zv_MarkMotionArea(handle, 3, &r, 1), fits ? ZV_OK : ZV_ERR_PARAM);
    issued();
    EXPECT_EQ(zv_SetShieldRect(handle, 9, &r), fits ? ZV_OK : ZV_ERR_PARAM);
    EXPECT_EQ(sent(), fits ? line("VIN_IOC_SET_MASK", 9, r.x_start, r.x_end, r.y_start, r.y_end) : "");
  }
  ZV_RECT rect{};
  card::set_video_input_register(0x144, 0x0A1E0514);
  ASSERT_EQ(zv_GetShieldRect(handle, 1, &rect), ZV_OK);
  EXPECT_EQ(line("", rect.x_start, rect.x_end, rect.y_start, rect.y_end), " 80 240 40 160");
}

}  // namespace

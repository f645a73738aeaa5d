#include "internal.h"
#include "sdk_test.h"

namespace vc = virtual_card;
using testing::ElementsAre;

namespace {

class Picture : public CardTest {};

bool same(const ZV_VIDEO_PROPERTY &a, const ZV_VIDEO_PROPERTY &b) {
  return a.hue == b.hue && a.saturation == b.saturation && a.contrast == b.contrast &&
         a.brightness == b.brightness;
}

TEST_F(Picture, PropertiesGoToTheChannelsRegisters) {
  ZV_VIDEO_PROPERTY property{7, 200, 0, -25};
  ASSERT_EQ(zv_SetVideoProperty(handle, 5, &property), ZV_OK);
  EXPECT_EQ(sent(), "c0037608 1 17 84; c0037608 1 18 ff; c0037608 1 19 0; c0037608 1 1a 0");
  EXPECT_EQ(property.hue, 6);
  EXPECT_TRUE(same(card().property[5], property));
  ASSERT_EQ(zv_GetVideoProperty(handle, 15, &property), ZV_OK);
  EXPECT_EQ(sent(), "c0037607 3 37 0; c0037607 3 38 0; c0037607 3 39 0; c0037607 3 3a 0");
  using Property = ZV_VIDEO_PROPERTY;
  for (Property bad :
       {Property{181, 0, 0, 0}, Property{-181, 0, 0, 0}, Property{0, -1, 0, 0}, Property{0, 201, 0, 0},
        Property{0, 0, 201, 0}, Property{0, 0, 0, 26}, Property{0, 0, 0, -26}, Property{7, 0, -1, 0}}) {
    const Property before = bad;
    EXPECT_EQ(zv_SetVideoProperty(handle, 5, &bad), ZV_ERR_PARAM);
    EXPECT_TRUE(same(bad, before));
  }
  EXPECT_EQ(zv_SetVideoProperty(handle, 16, &property), ZV_ERR_CHANNEL);
  EXPECT_EQ(zv_GetVideoProperty(handle, 16, &property), ZV_ERR_CHANNEL);
  EXPECT_EQ(sent(), "");
}

/// Rounding that drifts: a slider that moves by itself when the panel reads the value back.
TEST_F(Picture, PropertiesSurviveARoundTrip) {
  ZV_VIDEO_PROPERTY reg{}, back{};
  for (i32 step = 0; step <= 200; ++step) {
    ZV_VIDEO_PROPERTY user{0, step, 200 - step, step / 4 - 25};
    zarvo::translate_video_property(reg, user);
    zarvo::inverse_translate_video_property(back, reg);
    EXPECT_TRUE(same(back, user)) << step;
  }
  using Hue = std::array<i32, 4>;  // as asked, as kept, in the register, as read back
  for (const Hue &hue : {Hue{-178, -178, 1, -176}, Hue{-7, -6, 123, -6}, Hue{90, 90, 192, 90},
                         Hue{180, 180, 255, 180}, Hue{-180, -180, 0, -180}, Hue{179, 178, 254, 178}}) {
    ZV_VIDEO_PROPERTY user{hue[0], 0, 0, 0};
    zarvo::translate_video_property(reg, user);
    zarvo::inverse_translate_video_property(back, reg);
    EXPECT_EQ((Hue{hue[0], user.hue, reg.hue, back.hue}), hue);
  }
}

TEST_F(Picture, MotionThresholdsAndAreas) {
  ASSERT_EQ(zv_SetMotionSensitivity(handle, 3, 0x1234), ZV_OK);
  EXPECT_EQ(sent(), "40187602 3 0 0 64 64 4096 4660; c008640f 268 ffff");
  EXPECT_EQ(zv_SetMotionSensitivity(handle, 3, 0x10000), ZV_ERR_PARAM);
  EXPECT_EQ(zv_SetMotionSensitivity(handle, 16, 1), ZV_ERR_CHANNEL);

  struct Area {
    ZV_RECT rect;
    u32 mark;
    const char *map;
  };
  const Area areas[] = {{{0, 0, 720, 480}, 1, "40187602 3 0 0 45 30 1350 65535"},
                        {{16, 32, 40, 40}, 0, "40187602 3 1 2 2 1 2 4660"},
                        {{8, 0, 24, 16}, 2, "40187602 3 0 0 1 1 1 65535"},
                        {{8, 8, 8, 20}, 1, ""}};
  for (const Area &area : areas) {
    EXPECT_EQ(zv_MarkMotionArea(handle, 3, &area.rect, area.mark), ZV_OK);
    EXPECT_EQ(sent(), area.map);
  }
  for (const ZV_RECT &bad : {ZV_RECT{0, 0, 721, 480}, ZV_RECT{0, 0, 16, 500}, ZV_RECT{20, 0, 10, 16},
                             ZV_RECT{0, 20, 16, 10}, ZV_RECT{~0u, 0, ~0u, 16}})
    EXPECT_EQ(zv_MarkMotionArea(handle, 3, &bad, 1), ZV_ERR_PARAM);
  EXPECT_EQ(sent(), "");
  EXPECT_EQ(zv_MarkMotionArea(handle, 16, &areas[0].rect, 1), ZV_ERR_CHANNEL);

  // A refused map: the number is stored all the same.
  vc::inject({.operation = vc::Operation::ioctl, .for_good = true, .code = 0x40187602});
  EXPECT_EQ(zv_SetMotionSensitivity(handle, 4, 77), ZV_ERR_DEVICE);
  EXPECT_EQ(zv_MarkMotionArea(handle, 4, &areas[0].rect, 1), ZV_ERR_DEVICE);
  u32 sensitivity = 0;
  EXPECT_EQ(zv_GetMotionSensitivity(handle, 4, &sensitivity), ZV_OK);
  EXPECT_EQ(sensitivity, 77u);
  EXPECT_EQ(zv_GetMotionSensitivity(handle, 16, &sensitivity), ZV_ERR_CHANNEL);
}

TEST_F(Picture, MotionOnOffAndStatus) {
  vc::set_codec_register(0x260, 0x00AA0055);
  ASSERT_EQ(zv_StartMotionDetection(handle), ZV_OK);
  EXPECT_EQ(sent(), "c008640f 268 ffff; c008640e 260 0; c008640f 260 ffff0055; 00006409");
  ASSERT_EQ(zv_StopMotionDetection(handle), ZV_OK);
  EXPECT_EQ(sent(), "c008640e 260 0; c008640f 260 55; 0000640a; c008640f 268 ffff");
  vc::script_motion(0xABCD0005);
  vc::unplug_camera(2);
  EXPECT_EQ(zv_GetMotionStatus(handle), 1u);
}

TEST_F(Picture, PrivacyMask) {
  const auto set = [&](u32 resolution, const ZV_RECT &r) {
    zv_SetResolution(handle, resolution);
    issued();
    const int status = zv_SetShieldRect(handle, 9, &r);
    EXPECT_EQ(sent(), status != ZV_OK ? "" : cmd(0x40147601, {9, r.x_start, r.x_end, r.y_start, r.y_end}));
    return status;
  };
  for (const ZV_RECT &good : {ZV_RECT{0, 0, 720, 480}, ZV_RECT{0, 0, 0, 0}}) EXPECT_EQ(set(0, good), ZV_OK);
  for (const ZV_RECT &bad : {ZV_RECT{0, 0, 721, 480}, ZV_RECT{0, 0, 720, 481}, ZV_RECT{100, 100, 50, 200}})
    EXPECT_EQ(set(0, bad), ZV_ERR_PARAM);
  EXPECT_EQ(set(1, {0, 0, 720, 480}), ZV_ERR_PARAM);
  EXPECT_EQ(set(1, {80, 40, 240, 160}), ZV_OK);
  ZV_RECT rect{};
  vc::set_video_input_register(0x140, 0x0A1E0514);
  ASSERT_EQ(zv_GetShieldRect(handle, 0, &rect), ZV_OK);
  EXPECT_THAT((std::array{rect.x_start, rect.x_end, rect.y_start, rect.y_end}),
              ElementsAre(80, 240, 40, 160));
  EXPECT_EQ(zv_SetShieldRect(handle, 16, &rect), ZV_ERR_CHANNEL);
  EXPECT_EQ(zv_GetShieldRect(handle, 16, &rect), ZV_ERR_CHANNEL);
}

}  // namespace

// Tests of encoder settings: the frame-rate budget, and the way to the encoder and back.

#include <cstring>
#include <tuple>

#include "sdk_test.h"
#include "zv_video.h"

namespace {

using Encode = SdkTest;

constexpr auto kCif = SCALE_ZV_CIF, kHalfD1 = SCALE_ZV_HALF_D1, kD1 = SCALE_ZV_D1;
constexpr auto kBoth = TWOFIELD_ENABLE;

/// Catches: a budget that counts fractions, weighs a size wrongly, or refuses at exactly the limit.
TEST_F(Encode, BudgetCountsWholeFrames) {
  struct Load {
    u32 channels;
    ZV_SCALE_VALUE scale;
    u32 interval;
    ZV_TWOFIELD_MODE two = TWOFIELD_DISABLE;
  };
  struct Case {
    const char *name;
    u32 standard;
    std::vector<Load> loads;
    int status;
    const char *output = "";
  };
  const char *const exceeded = "Error: zv_CheckVideoEncodeConfig--Exceed maximum total frame rate!!\n";
  const char *const scale = "Error: invalid scale value, channel = 0, scale = 4.\n";
  const Case cases[] = {
      {"sixteen CIF in PAL", 1, {{16, kCif, 0}}, ZV_OK},
      {"22.5 count as 22", 0, {{5, kD1, 4}, {1, kD1, 9}, {1, kCif, 6}, {1, kCif, 15}}, ZV_OK},
      {"481", 0, {{5, kD1, 4}, {1, kD1, 9}, {1, kCif, 6}, {1, kCif, 13}}, ZV_ERR_CONFIG, exceeded},
      {"half D1: 60", 0, {{8, kHalfD1, 0}, {1, kCif, 15}}, ZV_ERR_CONFIG, exceeded},
      {"half D1, both fields: 120", 0, {{4, kHalfD1, 0, kBoth}}, ZV_OK},
      {"CIF, both fields: 60", 0, {{8, kCif, 0, kBoth}, {1, kCif, 15}}, ZV_ERR_CONFIG, exceeded},
      {"both fields at a lower rate", 0, {{1, kHalfD1, 6, kBoth}}, ZV_ERR_CONFIG},
      {"both fields of D1", 0, {{1, kD1, 0, kBoth}}, ZV_ERR_CONFIG},
      {"PAL has no interval 15", 1, {{4, kD1, 0}, {12, kCif, 15}}, ZV_OK},
      {"PAL interval 14 counts", 1, {{4, kD1, 0}, {1, kCif, 14}}, ZV_ERR_CONFIG, exceeded},
      {"unknown interval counts full", 0, {{4, kD1, 99}, {1, kCif, 15}}, ZV_ERR_CONFIG, exceeded},
      {"unknown scale", 0, {{1, SCALE_ZV_INVALID, 0}, {4, kD1, 0}}, ZV_OK, scale},
  };
  for (const Case &test : cases) {
    SCOPED_TRACE(test.name);
    EXPECT_EQ(zv_EnableVideoRecordChannels(handle, 0), ZV_OK);
    EXPECT_EQ(zv_SetVideoStandard(handle, test.standard), ZV_OK);
    u32 channel = 0;
    for (const Load &load : test.loads)
      for (u32 i = 0; i < load.channels; ++i)
        kept().config[channel++] = settings(load.scale, load.interval, load.two);
    EXPECT_EQ(printed_by([&] { EXPECT_EQ(zv_CheckVideoEncodeConfig(handle), test.status); }), test.output);
  }
}

TEST_F(Encode, RefusedSettingsAreStored) {
  ZV_VIDEO_CONFIG stored{}, slow = settings(kCif, 6, kBoth);
  slow.QPMax = 9;
  EXPECT_EQ(printed_by([&] { EXPECT_EQ(zv_SetVideoEncodeConfig(handle, 2, &slow), ZV_ERR_CONFIG); }), "");
  EXPECT_EQ(zv_GetVideoEncodeConfig(handle, 2, &stored), ZV_OK);
  EXPECT_EQ(std::memcmp(&stored, &slow, sizeof slow), 0);
  slow.enable = 1;
  slow.scale = SCALE_ZV_NO_ENCODE;
  EXPECT_EQ(printed_by([&] { EXPECT_EQ(zv_SetVideoEncodeConfig(handle, 2, &slow), ZV_ERR_CONFIG); }),
            "Error: zv_SetVideoEncodeConfig--invalid scale value.\n");
}

/// Catches: settings that reach the encoder with the wrong code, in the wrong order, or do not come back.
TEST_F(Encode, TransferToTheEncoderAndBack) {
  struct Case {
    ZV_VIDEO_CONFIG config;
    u32 scale_code, interval_code, drop, back;
  };
  std::vector<Case> cases = {{settings(kCif, 6, kBoth), 2, 1, 0, 0},
                             {settings(kCif, 0, kBoth), 2, 0, 0, 16},
                             {settings(kHalfD1, 1), 1, 512 + 9, 1, 1},
                             {settings(kCif, 15), 2, 30, 0, 15},
                             {settings(kCif, 77), 2, 1, 0, 0}};
  const u32 codes[] = {0, 512 + 9, 512 + 5, 512 + 4, 512 + 3, 512 + 2, 1, 2, 3, 4, 5, 7, 9, 14, 24, 29};
  for (u32 interval = 0; interval < 16; ++interval)
    cases.push_back({settings(kD1, interval), 9, codes[interval], codes[interval] >> 9, interval});
  for (const Case &test : cases) {
    SCOPED_TRACE(test.interval_code);
    kept().config[5] = test.config;
    kept().config[5].CBRValue = 500000;
    kept().config[5].CBREnable = 7;
    EXPECT_EQ(sent(zv_set_video_config(handle, 5)),
              line("ENC_IOC_SET_SCALE 5", test.scale_code) + "; " +
                  line("ENC_IOC_SET_INTERVAL 5", test.interval_code, test.drop) +
                  "; ENC_IOC_SET_QP 5 6; ENC_IOC_SET_GOP 5 25; ENC_IOC_SET_CBR 5 500000 1");
    kept().config[5] = {};
    EXPECT_EQ(sent(zv_get_video_config(handle, 5)),
              "ENC_IOC_GET_INTERVAL 5 0 0; ENC_IOC_GET_QP 5 0; ENC_IOC_GET_GOP 5 0; ENC_IOC_GET_SCALE 5 0");
    const ZV_VIDEO_CONFIG &back = kept().config[5];
    EXPECT_EQ(back.scale, test.config.scale);
    EXPECT_EQ(static_cast<u32>(back.interval), test.back);
    EXPECT_EQ(std::tie(back.gop, back.qp, back.enable), std::make_tuple(25u, 6u, 1u));
  }
  // A channel that is not encoded: its drop flag keeps standing.
  kept().config[5] = settings(SCALE_ZV_NO_ENCODE, 3);
  EXPECT_EQ(sent(zv_set_video_config(handle, 5)),
            "ENC_IOC_SET_SCALE 5 0; ENC_IOC_SET_INTERVAL 5 0 1; ENC_IOC_SET_QP 5 0; ENC_IOC_SET_GOP 5 0; "
            "ENC_IOC_SET_CBR 5 0 0");
  EXPECT_EQ(zv_get_video_config(handle, 5), ZV_OK);
  EXPECT_EQ(kept().config[5].enable, 0u);
}

TEST_F(Encode, QuantiserRangeIsSentOnlyWhenUsable) {
  using Range = std::array<u32, 3>;  // on, greatest, least
  for (const Range &range :
       {Range{1, 29, 2}, Range{1, 30, 1}, Range{1, 20, 0}, Range{1, 9, 9}, Range{0, 15, 2}}) {
    ZV_VIDEO_CONFIG &config = kept().config[1] = settings(kCif);
    std::tie(config.QPMinMaxEnable, config.QPMax, config.QPMin) = std::tie(range[0], range[1], range[2]);
    EXPECT_THAT(
        sent(zv_set_video_config(handle, 1)),
        testing::StartsWith(range[1] == 29 ? "ENC_IOC_SET_QP_RANGE 1 29 2 1; " : "ENC_IOC_SET_SCALE 1 2; "));
  }
}

TEST_F(Encode, EnablingSendsQualityThenEveryChannel) {
  ZV_VIDEO_CONFIG config = settings(kCif);
  config.mjpeg = VIDEO_CODEC_ZV_MJPEG;
  const std::pair<u32, ZV_JPEG_QUALITY> qualities[] = {
      {3, JPEG_QP_ZV_LOW}, {9, JPEG_QP_ZV_HIGH}, {12, JPEG_QP_ZV_UNSUPPORT}};
  for (const auto &[channel, quality] : qualities) {
    config.jpeg_qp = quality;
    EXPECT_EQ(zv_SetVideoEncodeConfig(handle, channel, &config), ZV_OK);
  }
  EXPECT_EQ(zv_EnableVideoRecordChannels(handle, 0x1208), ZV_OK);
  const Lines lines = issued();
  ASSERT_EQ(lines.size(), 3 + 16 * 5u);
  EXPECT_THAT(Lines(lines.begin(), lines.begin() + 3),
              ElementsAre("encoder write 0x670 2020202", "encoder write 0x670 2000102",
                          "encoder write 0x670 2000102"));
  EXPECT_EQ(lines[3], "ENC_IOC_SET_SCALE 0 0");
  EXPECT_EQ(lines[3 + 9 * 5], "ENC_IOC_SET_SCALE 9 2");
  EXPECT_EQ(kept().config[9].enable, 1u);

  // A channel without a scale stops the call; the channels before it are wiped already.
  EXPECT_EQ(
      printed_by([&] { EXPECT_EQ(zv_EnableVideoRecordChannels(handle, 0x0210), ZV_ERR_CONFIG); }),
      "ZarvoSDK: Error: zv_EnableVideoRecordChannels--invalid scale value of Channel4. Please confirm  video "
      "config first.\n");
  EXPECT_EQ(kept().config[3].scale, SCALE_ZV_NO_ENCODE);
  EXPECT_EQ(kept().config[12].scale, SCALE_ZV_CIF);
  EXPECT_EQ(sent(), "");
}

}  // namespace

#include <cstring>
#include <tuple>

#include "sdk_test.h"
#include "zv_video.h"

using testing::ElementsAre;

namespace {

class Encode : public CardTest {
 protected:
  static ZV_VIDEO_CONFIG settings(ZV_SCALE_VALUE scale, u32 interval,
                                  ZV_TWOFIELD_MODE two = TWOFIELD_DISABLE) {
    ZV_VIDEO_CONFIG config{};
    config.scale = scale;
    config.interval = static_cast<ZV_INTERVAL_VALUE>(interval);
    config.twofield = two;
    config.gop = 25;
    config.qp = 6;
    return config;
  }
};

const std::string kExceeded = "Error: zv_CheckVideoEncodeConfig--Exceed maximum total frame rate!!\n";

/// A budget that counts fractions, the wrong weight, or refuses at exactly the limit.
TEST_F(Encode, BudgetCountsWholeFrames) {
  struct Load {
    u32 channels;
    ZV_VIDEO_CONFIG config;
  };
  struct Case {
    const char *name;
    u32 standard;
    std::vector<Load> loads;
    std::string output;
    int status;
  };
  const auto cif = [](u32 interval) { return settings(SCALE_ZV_CIF, interval); };
  const auto d1 = [](u32 interval) { return settings(SCALE_ZV_D1, interval); };
  const auto both = [](ZV_SCALE_VALUE scale, u32 interval) {
    return settings(scale, interval, TWOFIELD_ENABLE);
  };
  const std::string scale = "Error: invalid scale value, channel = 0, scale = 4.\n";
  const Case cases[] = {
      {"sixteen CIF in PAL", 1, {{16, cif(0)}}, "", ZV_OK},
      {"22.5 count as 22", 0, {{5, d1(4)}, {1, d1(9)}, {1, cif(6)}, {1, cif(15)}}, "", ZV_OK},
      {"481", 0, {{5, d1(4)}, {1, d1(9)}, {1, cif(6)}, {1, cif(13)}}, kExceeded, ZV_ERR_CONFIG},
      {"half D1, both fields: 120", 0, {{4, both(SCALE_ZV_HALF_D1, 0)}}, "", ZV_OK},
      {"CIF, both fields: 60", 0, {{8, both(SCALE_ZV_CIF, 0)}, {1, cif(15)}}, kExceeded, ZV_ERR_CONFIG},
      {"both fields at a lower rate", 0, {{1, both(SCALE_ZV_HALF_D1, 6)}}, "", ZV_ERR_CONFIG},
      {"both fields of D1", 0, {{1, both(SCALE_ZV_D1, 0)}}, "", ZV_ERR_CONFIG},
      {"PAL has no interval 15", 1, {{4, d1(0)}, {12, cif(15)}}, "", ZV_OK},
      {"PAL interval 14 counts", 1, {{4, d1(0)}, {1, cif(14)}}, kExceeded, ZV_ERR_CONFIG},
      {"unknown interval counts full", 0, {{4, d1(99)}, {1, cif(15)}}, kExceeded, ZV_ERR_CONFIG},
      {"unknown scale", 0, {{1, settings(SCALE_ZV_INVALID, 0)}, {4, d1(0)}}, scale, ZV_OK},
  };
  for (const Case &test : cases) {
    SCOPED_TRACE(test.name);
    EXPECT_EQ(zv_EnableVideoRecordChannels(handle, 0), ZV_OK);
    EXPECT_EQ(zv_SetVideoStandard(handle, test.standard), ZV_OK);
    u32 channel = 0;
    for (const Load &load : test.loads)
      for (u32 i = 0; i < load.channels; ++i) zv_SetVideoEncodeConfig(handle, channel++, &load.config);
    int status = -1;
    EXPECT_EQ(printed_by([&] { status = zv_CheckVideoEncodeConfig(handle); }), test.output);
    EXPECT_EQ(status, test.status);
  }
}

TEST_F(Encode, RefusedSettingsAreStored) {
  ZV_VIDEO_CONFIG stored{}, slow = settings(SCALE_ZV_CIF, 6, TWOFIELD_ENABLE);
  int status = -1;
  EXPECT_EQ(printed_by([&] { status = zv_SetVideoEncodeConfig(handle, 2, &slow); }), "");
  EXPECT_EQ(status, ZV_ERR_CONFIG);
  EXPECT_EQ(zv_GetVideoEncodeConfig(handle, 2, &stored), ZV_OK);
  EXPECT_EQ(std::memcmp(&stored, &slow, sizeof slow), 0);
  slow.enable = 1;
  slow.scale = SCALE_ZV_NO_ENCODE;
  EXPECT_EQ(printed_by([&] { status = zv_SetVideoEncodeConfig(handle, 2, &slow); }),
            "Error: zv_SetVideoEncodeConfig--invalid scale value.\n");
  EXPECT_EQ(status, ZV_ERR_CONFIG);
  EXPECT_EQ(zv_SetVideoEncodeConfig(handle, 16, &slow), ZV_ERR_CHANNEL);
  EXPECT_EQ(zv_GetVideoEncodeConfig(handle, 16, &slow), ZV_ERR_CHANNEL);
}

/// Settings that reach the encoder with the wrong code, in the wrong order, or do not come back.
TEST_F(Encode, TransferToTheEncoderAndBack) {
  struct Case {
    ZV_SCALE_VALUE scale;
    u32 interval;
    ZV_TWOFIELD_MODE two;
    std::string scale_code, interval_code;
    u32 back;
  };
  for (const Case &test : {
           Case{SCALE_ZV_D1, 6, TWOFIELD_DISABLE, "9", "1 0", 6},
           Case{SCALE_ZV_CIF, 6, TWOFIELD_DISABLE, "2", "2 0", 6},
           Case{SCALE_ZV_CIF, 6, TWOFIELD_ENABLE, "2", "1 0", 0},
           Case{SCALE_ZV_CIF, 0, TWOFIELD_ENABLE, "2", "0 0", 16},
           Case{SCALE_ZV_HALF_D1, 1, TWOFIELD_DISABLE, "1", "521 1", 1},
           Case{SCALE_ZV_D1, 1, TWOFIELD_ENABLE, "9", "521 1", 1},
           Case{SCALE_ZV_CIF, 15, TWOFIELD_DISABLE, "2", "30 0", 15},
           Case{SCALE_ZV_D1, 13, TWOFIELD_DISABLE, "9", "14 0", 13},
           Case{SCALE_ZV_CIF, 77, TWOFIELD_DISABLE, "2", "1 0", 0},
       }) {
    SCOPED_TRACE(test.interval);
    card().config[5] = settings(test.scale, test.interval, test.two);
    card().config[5].CBRValue = 500000;
    card().config[5].CBREnable = 7;
    EXPECT_EQ(zv_set_video_config(handle, 5), ZV_OK);
    EXPECT_EQ(sent(), "40086500 5 " + test.scale_code + "; 400c6501 5 " + test.interval_code +
                          "; 40086503 5 6; 40086502 5 25; c00c6513 5 500000 1");
    card().config[5] = {};
    EXPECT_EQ(zv_get_video_config(handle, 5), ZV_OK);
    EXPECT_EQ(sent(), "c00c6505 5 0 0; c0086507 5 0; c0086506 5 0; c0086504 5 0");
    const ZV_VIDEO_CONFIG &back = card().config[5];
    EXPECT_EQ(back.scale, test.scale);
    EXPECT_EQ(static_cast<u32>(back.interval), test.back);
    EXPECT_EQ(std::tie(back.gop, back.qp, back.enable), std::make_tuple(25u, 6u, 1u));
  }
  // A channel that is not encoded: its drop flag keeps standing.
  card().config[5] = settings(SCALE_ZV_NO_ENCODE, 3);
  EXPECT_EQ(zv_set_video_config(handle, 5), ZV_OK);
  EXPECT_EQ(sent(), "40086500 5 0; 400c6501 5 0 1; 40086503 5 0; 40086502 5 0; c00c6513 5 0 0");
  EXPECT_EQ(zv_set_video_config(handle, 16), ZV_ERR_CHANNEL);
  EXPECT_EQ(zv_get_video_config(handle, 16), ZV_ERR_CHANNEL);
}

TEST_F(Encode, QuantiserRangeIsSentOnlyWhenUsable) {
  using Range = std::array<u32, 3>;  // on, greatest, least
  for (const Range &range :
       {Range{1, 29, 1}, Range{1, 30, 1}, Range{1, 20, 0}, Range{1, 9, 9}, Range{0, 15, 2}}) {
    ZV_VIDEO_CONFIG &config = card().config[1] = settings(SCALE_ZV_CIF, 0);
    std::tie(config.QPMinMaxEnable, config.QPMax, config.QPMin) = std::tie(range[0], range[1], range[2]);
    EXPECT_EQ(zv_set_video_config(handle, 1), ZV_OK);
    EXPECT_EQ(issued().front(), range[1] == 29 ? "c0106514 1 29 1 1" : "40086500 1 2");
  }
}

TEST_F(Encode, EnablingSendsQualityThenEveryChannel) {
  ZV_VIDEO_CONFIG config = settings(SCALE_ZV_CIF, 0);
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
              ElementsAre("c008650e 670 2020202", "c008650e 670 2000102", "c008650e 670 2000102"));
  EXPECT_EQ(lines[3], "40086500 0 0");
  EXPECT_EQ(lines[3 + 9 * 5], "40086500 9 2");

  // A channel without a scale stops the call; the channels before it are wiped already.
  int status = -1;
  EXPECT_EQ(
      printed_by([&] { status = zv_EnableVideoRecordChannels(handle, 0x0210); }),
      "ZarvoSDK: Error: zv_EnableVideoRecordChannels--invalid scale value of Channel4. Please confirm  video "
      "config first.\n");
  EXPECT_EQ(status, ZV_ERR_CONFIG);
  EXPECT_EQ(card().config[3].scale, SCALE_ZV_NO_ENCODE);
  EXPECT_EQ(card().config[12].scale, SCALE_ZV_CIF);
  EXPECT_EQ(sent(), "");
  EXPECT_EQ(zv_EnableVideoRecordChannels(handle, 0x10000), ZV_ERR_CHANNEL);
  EXPECT_EQ(zv_EnableAudioChannels(handle, 0x10), ZV_ERR_CHANNEL);
  EXPECT_EQ(zv_GetAudioStream(handle, 3), ZV_OK);
  EXPECT_EQ(zv_GetAudioStream(handle, 4), ZV_ERR_CHANNEL);
}

}  // namespace

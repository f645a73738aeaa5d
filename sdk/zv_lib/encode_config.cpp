/**
 * @file encode_config.cpp
 * Stores the encoder settings of the channels, checks them against the frame-rate budget and enables
 * channels.
 */

#include "command.h"
#include "internal.h"
#include "interval.h"
#include "print.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

namespace {

/// Copies a record word by word, since the video data thread may read the stored one.
void store_config(ZV_VIDEO_CONFIG &stored, const ZV_VIDEO_CONFIG &record) {
  set_word(stored.mjpeg, word_of(record.mjpeg));
  set_word(stored.scale, word_of(record.scale));
  stored.gop = record.gop;
  stored.qp = record.qp;
  set_word(stored.interval, word_of(record.interval));
  set_word(stored.twofield, word_of(record.twofield));
  set_word(stored.jpeg_qp, word_of(record.jpeg_qp));
  stored.enable = record.enable;
  stored.CBRValue = record.CBRValue;
  stored.CBREnable = record.CBREnable;
  stored.QPMinMaxEnable = record.QPMinMaxEnable;
  stored.QPMax = record.QPMax;
  stored.QPMin = record.QPMin;
}

int set_encode_config(ZV_CARD &card, u32 channel, const ZV_VIDEO_CONFIG *record) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (record == nullptr) return ZV_ERR_PARAM;
  ZV_VIDEO_CONFIG &config = card.config[channel];
  store_config(config, *record);
  if (config.enable != 0 && word_of(config.scale) == SCALE_ZV_NO_ENCODE) {
    print("Error: zv_SetVideoEncodeConfig--invalid scale value.\n");
    return ZV_ERR_CONFIG;
  }
  const bool two_field_slow = word_of(config.twofield) == TWOFIELD_ENABLE && word_of(config.interval) != 0;
  return two_field_slow ? ZV_ERR_CONFIG : ZV_OK;
}

int get_encode_config(ZV_CARD &card, u32 channel, ZV_VIDEO_CONFIG *record) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (record == nullptr) return ZV_ERR_PARAM;
  *record = card.config[channel];
  return ZV_OK;
}

/// What the budget check needs of a channel's configuration.
struct Load {
  u32 skip;
  bool drop;
  bool d1;
  bool both_fields;  ///< both fields of every frame are encoded
};

Load load_of(const ZV_VIDEO_CONFIG &config) {
  const u32 value = word_of(config.interval);
  const FrameInterval interval = frame_interval(value);
  const bool d1 = word_of(config.scale) == SCALE_ZV_D1 && value < kIntervalCount;
  const bool two_field = word_of(config.twofield) != TWOFIELD_DISABLE;
  const u32 skip = interval.skip + (d1 || (two_field && value == 0) ? 0 : 1);
  return {skip, interval.drop, d1, two_field && skip == 0};
}

/// Returns frames a second, rounded down to a whole number as the card's budget counts.
u32 counted_rate(const Load &load, u32 base) {
  if (load.both_fields) return load.drop ? 0 : base;
  const u32 group = load.skip + (load.d1 ? 1 : 0);
  return load.drop ? (group - 1) * base / group : base / group;
}

/// Returns the size of a channel's picture in CIF pictures.
u32 weight_of(const ZV_VIDEO_CONFIG &config, const Load &load, u32 channel) {
  switch (word_of(config.scale)) {
    case SCALE_ZV_NO_ENCODE:
      return 0;
    case SCALE_ZV_HALF_D1:
      return load.both_fields ? 4 : 2;
    case SCALE_ZV_CIF:
      return load.both_fields ? 2 : 1;
    case SCALE_ZV_D1:
      return 4;
    default:
      print("Error: invalid scale value, channel = %d, scale = %d.\n", static_cast<int>(channel),
            static_cast<int>(word_of(config.scale)));
      return 0;
  }
}

}  // namespace

int check_encode_config(ZV_CARD &card) {
  const u32 base = card.standard == VIDEO_STANDARD_ZV_NTSC ? 30 : 25;
  // The budget is sixteen CIF channels at the full rate.
  const float budget = static_cast<float>(ZV_CHANNELS * base);
  float total = 0;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    const ZV_VIDEO_CONFIG &config = card.config[channel];
    const Load load = load_of(config);
    const u32 rate = word_of(config.scale) == SCALE_ZV_NO_ENCODE ? 0 : counted_rate(load, base);
    if (word_of(config.twofield) == TWOFIELD_ENABLE && (load.skip != 0 || load.d1)) return ZV_ERR_CONFIG;
    total += static_cast<float>(weight_of(config, load, channel) * rate);
    if (total > budget) {
      print("Error: zv_CheckVideoEncodeConfig--Exceed maximum total frame rate!!\n");
      return ZV_ERR_CONFIG;
    }
  }
  return ZV_OK;
}

namespace {

/// Sets `enable` on the channels of `mask` and wipes the other channels. Returns ZV_ERR_CONFIG at the first
/// channel of `mask` that has no scale.
int mark_channels(ZV_CARD &card, u32 mask) {
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    ZV_VIDEO_CONFIG &config = card.config[channel];
    if ((mask >> channel & 1) == 0) {
      store_config(config, ZV_VIDEO_CONFIG{});
      continue;
    }
    config.enable = 1;
    if (word_of(config.scale) == SCALE_ZV_NO_ENCODE) {
      print(
          "ZarvoSDK: Error: zv_EnableVideoRecordChannels--invalid scale value of Channel%d. Please confirm  "
          "video config first.\n",
          static_cast<int>(channel));
      return ZV_ERR_CONFIG;
    }
  }
  return ZV_OK;
}

/// Writes the card's only quality register once for each Motion-JPEG channel; the last word written stays.
void send_jpeg_quality(const ZV_CARD &card) {
  // By ZV_JPEG_QUALITY.
  constexpr u32 kQualityWords[] = {driver::kMjpegCoarse, driver::kMjpegFine, driver::kMjpegFine};
  u32 word = kQualityWords[JPEG_QP_ZV_MEDIUM];
  for (const ZV_VIDEO_CONFIG &config : card.config) {
    if (word_of(config.mjpeg) == VIDEO_CODEC_ZV_MPEG4) continue;
    const u32 quality = word_of(config.jpeg_qp);
    if (quality <= JPEG_QP_ZV_HIGH) word = kQualityWords[quality];
    issue(card.enc_fd, driver::ENC_IOC_WRITE_REG, driver::Register{driver::kRegMjpegQuality, word});
  }
}

}  // namespace

int enable_record_channels(ZV_CARD &card, u32 mask) {
  if (mask >> ZV_CHANNELS != 0) return ZV_ERR_CHANNEL;
  card.record_mask = mask;
  if (mark_channels(card, mask) != ZV_OK || check_encode_config(card) != ZV_OK) return ZV_ERR_CONFIG;
  send_jpeg_quality(card);
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) set_video_config(card, channel);
  return ZV_OK;
}

int enable_audio_channels(ZV_CARD &card, u32 mask) {
  if (mask >> ZV_AUDIO_CHANNELS != 0) return ZV_ERR_CHANNEL;
  card.audio_mask = mask;
  return ZV_OK;
}

}  // namespace zarvo

using namespace zarvo;

int zv_GetVideoEncodeConfig(HANDLE handle, u32 channel, ZV_VIDEO_CONFIG *config) {
  return status_from(handle, get_encode_config, channel, config);
}

int zv_SetVideoEncodeConfig(HANDLE handle, u32 channel, const ZV_VIDEO_CONFIG *config) {
  return status_from(handle, set_encode_config, channel, config);
}

int zv_CheckVideoEncodeConfig(HANDLE handle) {
  return status_from(handle, check_encode_config);
}

int zv_EnableVideoRecordChannels(HANDLE handle, u32 mask) {
  return status_from(handle, enable_record_channels, mask);
}

int zv_EnableAudioChannels(HANDLE handle, u32 mask) {
  return status_from(handle, enable_audio_channels, mask);
}

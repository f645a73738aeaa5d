/**
 * @file zv_video.cpp
 * Sends one channel's stored encoder settings to the encoder device and reads them back.
 */
#include "zv_video.h"

#include <unistd.h>

#include "command.h"
#include "internal.h"
#include "interval.h"
#include "zv_card.h"

namespace zarvo {

namespace {

/// Returns whether the encoder accepts the quantiser range.
bool usable_qp_range(const ZV_VIDEO_CONFIG &config) {
  constexpr u32 kHighestQp = 29;
  return config.QPMinMaxEnable != 0 && config.QPMax > config.QPMin && config.QPMin != 0 &&
         config.QPMax <= kHighestQp;
}

/// Returns the interval record of a channel. For one-field pictures in keep mode the encoder takes skip count
/// n as one field of every n-th frame and 0 as both fields, so the count is 1 higher than the table entry.
driver::Interval encoder_interval(const ZV_VIDEO_CONFIG &config, u32 channel) {
  auto [skip, drop] = frame_interval(word_of(config.interval));
  if (!drop && word_of(config.twofield) == TWOFIELD_DISABLE && word_of(config.scale) != SCALE_ZV_D1) ++skip;
  const u32 flag = drop ? 1 : 0;
  return {channel, skip | flag << driver::kIntervalDropShift, flag};
}

int get_video_config(ZV_CARD &card, u32 channel) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  driver::Interval interval{channel, 0, 0};
  driver::ChannelValue qp{channel, 0};
  driver::ChannelValue gop{channel, 0};
  driver::ChannelValue scale{channel, 0};
  issue(card.enc_fd, driver::ENC_IOC_GET_INTERVAL, interval);
  issue(card.enc_fd, driver::ENC_IOC_GET_QP, qp);
  issue(card.enc_fd, driver::ENC_IOC_GET_GOP, gop);
  issue(card.enc_fd, driver::ENC_IOC_GET_SCALE, scale);

  const bool d1 = scale.value == driver::kScaleCodeD1;
  const bool drop = interval.code >> driver::kIntervalDropShift != 0;
  const u32 count = interval.code & driver::kIntervalSkipMask;
  // In keep mode the count of a one-field picture is 1 higher than its table entry. Count 0 wraps around
  // and matches no entry.
  const u32 skip = drop || d1 ? count : count - 1;

  ZV_VIDEO_CONFIG &config = card.config[channel];
  config.qp = qp.value;
  config.gop = gop.value;
  set_word(config.scale, d1 ? u32{SCALE_ZV_D1} : scale.value);
  set_word(config.interval, interval_value({skip, drop}));
  config.enable = (scale.value & 0xF) != 0 ? 1 : 0;
  return ZV_OK;
}

}  // namespace

int set_video_config(ZV_CARD &card, u32 channel) {
  constexpr useconds_t kSettle = 500;
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  const ZV_VIDEO_CONFIG &config = card.config[channel];
  const u32 stored = word_of(config.scale);
  const u32 scale = stored == SCALE_ZV_D1 ? driver::kScaleCodeD1 : stored;
  if (usable_qp_range(config))
    issue(card.enc_fd, driver::ENC_IOC_SET_QP_RANGE, driver::QpRange{channel, config.QPMax, config.QPMin, 1});
  driver::Interval interval = encoder_interval(config, channel);
  driver::ChannelValue qp{channel, config.qp};
  driver::ChannelValue gop{channel, config.gop};
  if (scale == SCALE_ZV_NO_ENCODE) interval.code = qp.value = gop.value = 0;
  issue(card.enc_fd, driver::ENC_IOC_SET_SCALE, driver::ChannelValue{channel, scale});
  issue(card.enc_fd, driver::ENC_IOC_SET_INTERVAL, interval);
  issue(card.enc_fd, driver::ENC_IOC_SET_QP, qp);
  issue(card.enc_fd, driver::ENC_IOC_SET_GOP, gop);
  issue(card.enc_fd, driver::ENC_IOC_SET_CBR,
        driver::Cbr{channel, static_cast<u32>(config.CBRValue), config.CBREnable != 0 ? 1u : 0u});
  usleep(kSettle);
  return ZV_OK;
}

}  // namespace zarvo

using namespace zarvo;

int zv_set_video_config(HANDLE handle, u32 channel) {
  return status_from(handle, set_video_config, channel);
}

int zv_get_video_config(HANDLE handle, u32 channel) {
  return status_from(handle, get_video_config, channel);
}

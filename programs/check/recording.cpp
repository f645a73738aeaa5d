// Records with the SDK.
#include "recording.h"

#include <algorithm>
#include <chrono>

#include "bench.h"
#include "check.h"
#include "programs/common/card.h"

namespace contract {
namespace {

Recording *running;  ///< the callbacks have no argument for it

void keep(Track &track, const u8 *data, i32 length, i32 flags) {
  track.push_back({monotonic_seconds(), static_cast<u32>(flags), {data, data + length}});
}
void on_mpeg4(u32 channel, u8 *data, i32 length, i32 flags) {
  keep(running->mpeg4.at(channel), data, length, flags);
}
void on_mjpeg(u32 channel, u8 *data, i32 length, i32 flags) {
  keep(running->mjpeg.at(channel), data, length, flags);
}
void on_audio(u32 channel, u8 *data, i32 length, i32 flags) {
  keep(running->audio.at(channel), data, length, flags);
}

Setup rates(u32 standard, bool quick) {
  Setup setup;
  setup.standard = standard;
  setup.seconds = quick ? 3 : 12;
  const u32 count = standard == VIDEO_STANDARD_ZV_NTSC ? 16 : 15;
  for (u32 n = 0; n < count; ++n) {
    setup.config[n] = cif_config();
    setup.config[n].interval = static_cast<ZV_INTERVAL_VALUE>(n);
  }
  return setup;
}

Setup settings() {
  Setup setup;
  setup.seconds = 4;
  for (u32 n = 0; n <= kTwoFieldChannel; ++n) setup.config[n] = cif_config();
  for (u32 n = 0; n < kGroupLengths.size(); ++n) setup.config[n].gop = kGroupLengths[n];
  for (u32 n = 0; n < kBitRates.size(); ++n) {
    setup.config[kFirstBitRate + n].CBRValue = kBitRates[n];
    setup.config[kFirstBitRate + n].CBREnable = 1;
  }
  setup.config[kTwoFieldChannel].twofield = TWOFIELD_ENABLE;
  return setup;
}

Setup quality(u32 step) {
  Setup setup;
  setup.seconds = 1.5;
  for (u32 n = 0; n < kQualityChannels; ++n) {
    setup.config[n] = cif_config();
    setup.config[n].mjpeg = VIDEO_CODEC_ZV_MJPEG;  // only these channels set the quality
    setup.config[n].qp = kQuantisers.at(step);
    setup.config[n].jpeg_qp = static_cast<ZV_JPEG_QUALITY>(step);
  }
  return setup;
}

Setup sizes(u32 standard, u32 resolution) {
  Setup setup{standard, resolution, 1.5, {}};
  for (u32 n = 0; n < SCALE_ZV_D1; ++n) {
    setup.config[n] = cif_config();
    setup.config[n].scale = static_cast<ZV_SCALE_VALUE>(n + 1);
  }
  return setup;
}

/// Stops capture, whatever happens while it exists.
struct Capture {
  HANDLE card;

  ~Capture() {
    zv_Stop(card);
    running = nullptr;
  }
};

}  // namespace

double monotonic_seconds() {
  return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

ZV_VIDEO_CONFIG cif_config() {
  ZV_VIDEO_CONFIG config{};
  config.scale = SCALE_ZV_CIF;
  config.gop = 30;
  config.qp = 8;
  return config;
}

double rate_of(const Track &track) {
  if (track.size() < 3) return 0;
  // The slope of a straight line through all arrivals: a single late frame hardly changes it.
  const double count = static_cast<double>(track.size()), middle = (count - 1) / 2;
  double squares = 0, products = 0;
  for (std::size_t n = 0; n < track.size(); ++n) {
    const double from_middle = static_cast<double>(n) - middle;
    squares += from_middle * from_middle;
    products += from_middle * (track[n].time - track.front().time);
  }
  return products > 0 ? squares / products : 0;
}

Setup setup_named(const std::string &name, bool quick) {
  if (name == "rates-ntsc") return rates(VIDEO_STANDARD_ZV_NTSC, quick);
  if (name == "rates-pal") return rates(VIDEO_STANDARD_ZV_PAL, quick);
  if (name == "settings") return settings();
  if (name.starts_with("quality-")) return quality(static_cast<u32>(name.back() - '0'));
  return sizes(name.starts_with("size-pal") ? VIDEO_STANDARD_ZV_PAL : VIDEO_STANDARD_ZV_NTSC,
               name.ends_with("704") ? RESOLUTION_ZV_704 : RESOLUTION_ZV_720);
}

Recording record(HANDLE card, const Setup &setup) {
  Recording recording;
  u32 mask = 0;
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    if (setup.config[n].scale == SCALE_ZV_NO_ENCODE) continue;
    mask |= 1u << n;
    check(zv_SetVideoEncodeConfig(card, n, &setup.config[n]), "zv_SetVideoEncodeConfig");
  }
  const Capture capture{card};
  running = &recording;
  check(zv_EnableVideoRecordChannels(card, mask), "zv_EnableVideoRecordChannels");
  check(zv_EnableAudioChannels(card, 0xF), "zv_EnableAudioChannels");
  check(zv_RegisterCallBack(card, on_mpeg4, on_mjpeg, on_audio), "zv_RegisterCallBack");
  check(zv_Start(card), "zv_Start");
  recording.start = monotonic_seconds();
  pause_for(setup.seconds);
  check(zv_Stop(card), "zv_Stop");
  return recording;
}

}  // namespace contract

/**
 * @file recording.h
 * What the SDK's callbacks receive in a few seconds. Many checks look at the same recording.
 */
#ifndef CONTRACT_RECORDING_H
#define CONTRACT_RECORDING_H

#include <array>
#include <string>
#include <vector>

#include "zv_lib.h"

namespace contract {

struct Frame {
  double time;  ///< seconds of the monotonic clock
  u32 flags;
  std::vector<u8> data;

  /// Whether it is an intra frame: only these have the SDK's header in front.
  bool intra() const { return data.size() > 3 && data[3] == 0; }
};

using Track = std::vector<Frame>;

struct Recording {
  double start = 0;  ///< when zv_Start() returned
  std::array<Track, ZV_CHANNELS> mpeg4, mjpeg;
  std::array<Track, ZV_AUDIO_CHANNELS> audio;
};

/// Frames a second; 0 with less than three frames.
double rate_of(const Track &track);

struct Setup {
  u32 standard = VIDEO_STANDARD_ZV_NTSC;
  u32 resolution = RESOLUTION_ZV_720;
  double seconds = 0;
  std::array<ZV_VIDEO_CONFIG, ZV_CHANNELS> config{};  ///< channels without a scale are not enabled
};

// What the channels of the recording "settings" are for.
inline constexpr std::array<u32, 3> kGroupLengths{1, 5, 30};            // channels 0-2
inline constexpr std::array<i32, 3> kBitRates{128000, 192000, 256000};  // channels 3-5
inline constexpr u32 kFirstBitRate = 3;
inline constexpr u32 kTwoFieldChannel = 6;
// What the recordings "quality-0" to "quality-2" are for.
inline constexpr std::array<u32, 3> kQuantisers{2, 8, 24};
inline constexpr u32 kQualityChannels = 4;

/// The recordings: rates-ntsc, rates-pal, settings, quality-0 to quality-2, and size-STANDARD-WIDTH, e.g.
/// size-pal-704, whose channels 0-2 have the scales 1-3.
Setup setup_named(const std::string &name, bool quick);

/// CIF at the full rate.
ZV_VIDEO_CONFIG cif_config();

/// Records; the card has the standard and the width of the setup. Throws std::runtime_error.
Recording record(HANDLE card, const Setup &setup);

double monotonic_seconds();

}  // namespace contract

#endif

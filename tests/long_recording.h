/**
 * @file long_recording.h
 * What the tests of long recordings share: frames of all sizes, and hashes of what callbacks get and files
 * hold.
 */
#ifndef TESTS_LONG_RECORDING_H
#define TESTS_LONG_RECORDING_H

#include <cstdlib>
#include <map>
#include <string>
#include <string_view>

#include "support.h"
#include "virtual_card.h"

inline constexpr double kVideoRate = 480;  // frames a second of sixteen channels

inline double setting(const char *name, double otherwise) {
  const char *text = std::getenv(name);
  return text != nullptr ? std::atof(text) : otherwise;
}

/// A hash of all bytes of a channel, by the name of its folder.
using Hashes = std::map<std::string, std::uint64_t>;

inline std::string folder_name(unsigned channel) {
  return (channel < 9 ? "CH0" : "CH") + std::to_string(channel + 1);
}

inline void add(std::uint64_t &hash, std::string_view bytes) {
  for (const char byte : bytes) hash = hash * 0x100000001B3 + static_cast<std::uint8_t>(byte) + 1;
}

/// Frames of all sizes up to a kilobyte, no two alike. Every eighth of a channel is intra, as its picture
/// start code says too.
inline virtual_card::Supply long_recording_frames() {
  virtual_card::Supply supply;
  std::uint32_t noise = 1;
  const auto bytes = [&noise](std::size_t size) {
    std::vector<std::uint8_t> data(size);
    for (std::uint8_t &byte : data)
      byte = static_cast<std::uint8_t>((noise = noise * 1664525 + 1013904223) >> 24);
    return data;
  };
  for (unsigned n = 0; n < 16 * 32; ++n) {
    const unsigned type = n / 16 % 8;
    std::vector<std::uint8_t> picture{0, 0, 1, 0xB6, static_cast<std::uint8_t>(type == 0 ? 0x10 : 0x50)};
    const std::vector<std::uint8_t> rest = bytes(100 + n * 2);
    picture.insert(picture.end(), rest.begin(), rest.end());
    supply.mpeg4.push_back(virtual_card::mpeg4_frame(n % 16, type, picture));
    supply.mjpeg.push_back(virtual_card::mjpeg_frame(n % 16, 352, 240, {0x00, 0xFF, 0xD9}));
    supply.audio.push_back({bytes(192), 192});
  }
  supply.video_rate = kVideoRate;
  supply.audio_rate = 62.5;
  return supply;
}

/// Waits until the card has handed out so many frames. Returns false if none came for half a minute.
inline bool delivered(std::uint64_t due) {
  const auto handed_out = [] { return virtual_card::counters().mpeg4.delivered; };
  for (std::uint64_t seen = handed_out(); seen < due; seen = handed_out())
    if (!eventually([&] { return handed_out() > seen; })) return false;
  return true;
}

#endif

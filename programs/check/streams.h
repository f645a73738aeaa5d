/**
 * @file streams.h
 * What the checks of all streams have in common.
 */
#ifndef CONTRACT_STREAMS_H
#define CONTRACT_STREAMS_H

#include <algorithm>
#include <map>
#include <set>

#include "check.h"
#include "driver_capture.h"
#include "recording.h"

namespace contract {

/// An encoded size: a channel of a recording, and what its pictures must be like.
struct SizeCase {
  std::string name;  ///< e.g. pal.704.d1
  std::string recording;
  u32 channel;
  u32 width, height;
  bool interlaced;
  bool quick;
  std::string meaning;
};
std::vector<SizeCase> size_cases();

/// Expects that no read of a stream has failed. The number is the index in DriverCapture::errors.
Result no_read_error(const DriverCapture &capture, std::size_t stream);

inline u32 channel_of(const Mpeg4Read &frame) {
  return frame.head.channel;
}
inline u32 channel_of(const MjpegRead &picture) {
  return picture.descriptor.channel;
}
inline u32 channel_of(const OtherRead &) {
  return 0;
}

/// Expects the first read of each channel within half a second.
template <typename Read>
Result starts_soon(const DriverCapture &capture, const std::vector<Read> &reads) {
  constexpr double kSoon = 0.5;
  std::set<u32> started;
  for (const Read &each : reads) {
    const double delay = each.time - capture.start;
    if (started.insert(channel_of(each)).second && delay >= kSoon)
      return broken(words("less than ", kSoon, " s"), words(delay, " s on channel ", channel_of(each) + 1));
  }
  return started.empty() ? broken("data", "none") : held();
}

/// Expects reads from all encoded channels and from no others.
template <typename Read>
Result channels_seen(const DriverCapture &capture, const std::vector<Read> &reads) {
  u32 seen = 0;
  for (const Read &each : reads) {
    const u32 channel = channel_of(each);
    if (channel >= ZV_CHANNELS) return broken("a channel from 0 to 15", words(channel));
    seen |= 1u << channel;
  }
  return expect(seen == capture.channels, words("channel mask 0x", std::hex, capture.channels), "0x",
                std::hex, seen);
}

/// Expects no long pause between the reads of a channel, nor behind the last one.
template <typename Read>
Result no_gap(const DriverCapture &capture, const std::vector<Read> &reads) {
  constexpr double kLongest = 0.4;
  std::map<u32, double> last;
  double longest = 0;
  for (const Read &each : reads) {
    const auto [before, first] = last.try_emplace(channel_of(each), each.time);
    if (!first) longest = std::max(longest, each.time - before->second);
    before->second = each.time;
  }
  if (last.empty()) return broken("data", "none");
  for (const auto &[channel, time] : last) longest = std::max(longest, capture.end - time);
  return expect(longest < kLongest, words("less than ", kLongest, " s"), longest, " s");
}

/// Counts the preview reads that name another buffer than the read before: the new pictures.
inline std::size_t new_pictures(const std::vector<OtherRead> &reads) {
  std::size_t pictures = 0;
  for (std::size_t n = 1; n < reads.size(); ++n) pictures += reads[n].index != reads[n - 1].index ? 1 : 0;
  return pictures;
}

/// Returns the mean bytes of a frame of a channel in the recordings quality-0 to quality-2.
std::array<double, 3> mean_sizes(Bench &bench, std::array<Track, ZV_CHANNELS> Recording::*tracks,
                                 u32 channel);

}  // namespace contract

#endif

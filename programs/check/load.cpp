// Theme load: nothing is lost with all channels, audio and preview, nor when the host pauses.
#include <cmath>
#include <map>

#include "bench.h"
#include "check.h"
#include "streams.h"

namespace contract {
namespace {

constexpr double kFrames = 30000.0 / 1001;
constexpr double kBlocks = 62.5;

/// Expects as many reads on each channel of a mask as its rate gives from the first read to the end, but a
/// few that may still be on their way.
template <typename Read>
Result complete(const DriverCapture &capture, const std::vector<Read> &reads, u32 channels, double rate,
                double allowed) {
  std::map<u32, std::size_t> counts;
  for (const Read &each : reads) ++counts[channel_of(each)];
  if (reads.empty()) return broken("data", "none");
  const double least = (capture.end - reads.front().time) * rate - allowed;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel)
    if ((channels >> channel & 1) != 0 && static_cast<double>(counts[channel]) < least)
      return broken(words("at least ", std::floor(least), " of each channel"),
                    words(counts[channel], " of channel ", channel + 1));
  return held();
}

/// The time stamps tell lost frames from frames that the host has read late.
Result no_lost_frame(const DriverCapture &capture) {
  constexpr double kTwoPeriods = 2 / kFrames + 0.002;
  std::map<u32, double> last;
  for (const Mpeg4Read &frame : capture.mpeg4) {
    const auto [before, first] = last.try_emplace(frame.head.channel, frame.stamp);
    const double gap = frame.stamp - before->second;
    if (!first && gap > kTwoPeriods)
      return broken(words("at most ", kTwoPeriods, " s between frames"),
                    words(gap, " s on channel ", frame.head.channel + 1));
    before->second = frame.stamp;
  }
  return last.empty() ? broken("frames", "none") : held();
}

constexpr double kOnTheWay = 6;

Result preview_rate(Bench &bench) {
  const std::size_t pictures = new_pictures(bench.full_load().preview);
  const double expected = (bench.full_load().end - bench.full_load().start) * kFrames;
  return expect(static_cast<double>(pictures) > expected * 0.9 - kOnTheWay,
                words("about ", expected, " pictures"), pictures);
}

constexpr const char *kLost = "Recordings of all cameras have gaps.";
constexpr const char *kPaused = "A busy machine loses frames sooner than it should.";
constexpr CheckRow kRows[] = {
    {"channels", "All sixteen channels deliver frames at the same time.", kLost,
     [](Bench &bench) { return channels_seen(bench.full_load(), bench.full_load().mpeg4); }},
    {"mpeg4.gap", "No gap between the time stamps of a channel is longer than two periods.", kLost,
     [](Bench &bench) { return no_lost_frame(bench.full_load()); }},
    {"mpeg4.complete", "No MPEG-4 frame is missing.", kLost,
     [](Bench &bench) {
       return complete(bench.full_load(), bench.full_load().mpeg4, bench.full_load().channels, kFrames,
                       kOnTheWay);
     }},
    {"mjpeg.complete", "No Motion-JPEG picture is missing.", kLost,
     [](Bench &bench) {
       return complete(bench.full_load(), bench.full_load().mjpeg, bench.full_load().channels, kFrames,
                       kOnTheWay);
     }},
    {"audio.complete", "No audio block is missing.", "Sound and picture drift apart.",
     [](Bench &bench) {
       return complete(bench.full_load(), bench.full_load().audio, 1, kBlocks, 2 * kOnTheWay);
     }},
    {"preview.rate", "The preview keeps its rate.", "The preview stutters while all cameras are recorded.",
     preview_rate},
    {"pause.mpeg4", "No frame is lost when the host does not read for 0.2 seconds.", kPaused,
     [](Bench &bench) {
       const DriverCapture &capture = bench.after_pause();
       Result gaps = no_lost_frame(capture);
       if (gaps.outcome != Outcome::held) return gaps;
       return complete(capture, capture.mpeg4, capture.channels, kFrames, kOnTheWay);
     }},
    {"pause.mjpeg", "No picture is lost when the host does not read for 0.2 seconds.", kPaused,
     [](Bench &bench) {
       return complete(bench.after_pause(), bench.after_pause().mjpeg, bench.after_pause().channels, kFrames,
                       3);
     }},
    {"pause.audio", "No audio block is lost when the host does not read for 0.2 seconds.", kPaused,
     [](Bench &bench) { return complete(bench.after_pause(), bench.after_pause().audio, 1, kBlocks, 5); }},
};

}  // namespace

void add_load(Checks &checks) {
  add_rows(checks, "load", kRows);
}

}  // namespace contract

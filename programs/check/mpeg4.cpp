// Theme mpeg4: rates, sizes, groups, bit rates, time stamps, and that every frame decodes.
#include <algorithm>
#include <cmath>
#include <map>
#include <set>

#include "bench.h"
#include "check.h"
#include "decode.h"
#include "recording/frame_rates.h"
#include "streams.h"

namespace contract {
namespace {

Result stamps_rise(Bench &bench) {
  std::map<u32, double> last;
  for (const Mpeg4Read &frame : bench.capture().mpeg4) {
    const auto before = last.find(frame.head.channel);
    if (before != last.end() && frame.stamp <= before->second)
      return broken("later than the frame before",
                    words(frame.stamp - before->second, " s later on channel ", frame.head.channel + 1));
    last[frame.head.channel] = frame.stamp;
  }
  return last.empty() ? broken("frames", "none") : held();
}

Result stamps_agree(Bench &bench) {
  constexpr double kEarly = -0.1, kLate = 0.4;
  std::vector<double> delays;
  for (const Mpeg4Read &frame : bench.capture().mpeg4) delays.push_back(frame.wall - frame.stamp);
  if (delays.empty()) return broken("frames", "none");
  std::nth_element(delays.begin(), delays.begin() + static_cast<std::ptrdiff_t>(delays.size() / 2),
                   delays.end());
  return expect_between("seconds from stamp to arrival", delays[delays.size() / 2], kEarly, kLate);
}

Result lengths(Bench &bench) {
  for (const Mpeg4Read &frame : bench.capture().mpeg4) {
    const long least = static_cast<long>(driver::kMpeg4DescriptorSize + frame.head.length);
    if (frame.head.length == 0 || frame.result < least ||
        frame.result > static_cast<long>(driver::kMpeg4ReadSize))
      return broken("a bitstream, and a result that covers descriptor and bitstream",
                    words("length ", frame.head.length, ", result ", frame.result));
  }
  return bench.capture().mpeg4.empty() ? broken("frames", "none") : held();
}

Result types(Bench &bench) {
  for (const Mpeg4Read &frame : bench.capture().mpeg4)
    if (frame.picture_type > 1 || (frame.head.type == 0) != (frame.picture_type == 0) || frame.head.type > 1)
      return broken("type 0 for intra, 1 for predicted pictures",
                    words("type ", frame.head.type, " for a picture of type ", frame.picture_type));
  return bench.capture().mpeg4.empty() ? broken("frames", "none") : held();
}

Result starts_with_intra(Bench &bench) {
  std::set<u32> seen;
  for (const Mpeg4Read &frame : bench.capture().mpeg4)
    if (seen.insert(frame.head.channel).second && frame.picture_type != 0)
      return broken("an intra frame first",
                    words("type ", frame.picture_type, " on channel ", frame.head.channel + 1));
  return seen.empty() ? broken("frames", "none") : held();
}

Result group_length(Bench &bench, u32 channel) {
  const u32 expected = kGroupLengths[channel];
  const Track &track = bench.recording("settings").mpeg4[channel];
  std::size_t last = 0;
  for (std::size_t n = 0; n < track.size(); ++n) {
    if (!track[n].intra()) continue;
    if (n > 0 && n - last != expected) return broken(words(expected, " frames"), words(n - last, " frames"));
    last = n;
  }
  return expect(last > 0 && track.size() - last <= expected,
                words("an intra frame every ", expected, " frames"), "the last one is frame ", last + 1,
                " of ", track.size());
}

Result bit_rate(Bench &bench, u32 n) {
  // The rate control needs a second to settle.
  const Recording &recording = bench.recording("settings");
  const Track &track = recording.mpeg4[kFirstBitRate + n];
  double bytes = 0, first = 0, last = 0;
  for (const Frame &frame : track) {
    if (frame.time < recording.start + 1) continue;
    if (first == 0) first = frame.time;
    last = frame.time;
    bytes += static_cast<double>(frame.data.size());
  }
  return expect_between("bits a second", last > first ? bytes * 8 / (last - first) : 0, kBitRates[n] * 0.8,
                        kBitRates[n] * 1.2);
}

Result quantiser(Bench &bench) {
  for (u32 channel = 0; channel < kQualityChannels; ++channel) {
    const auto mean = mean_sizes(bench, &Recording::mpeg4, channel);
    if (mean[0] <= mean[1] || mean[1] <= mean[2] || mean[2] == 0)
      return broken("fewer bytes a frame with quantisers 2, 8, 24",
                    words(mean[0], ", ", mean[1], ", ", mean[2]));
  }
  return held();
}

Result decodes(Bench &bench, const std::string &recording) {
  const Recording &taken = bench.recording(recording);
  std::size_t pictures = 0;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    const Decoded decoded = decode_mpeg4(taken.mpeg4[channel]);
    if (decoded.errors > 0 || decoded.pictures != taken.mpeg4[channel].size())
      return broken("every frame decodes",
                    words(decoded.pictures, " pictures and ", decoded.errors, " errors in ",
                          taken.mpeg4[channel].size(), " frames of channel ", channel + 1));
    pictures += decoded.pictures;
  }
  return expect(pictures > 0, "frames", "none");
}

Result size(Bench &bench, const SizeCase &expected) {
  const Track &track = bench.recording(expected.recording).mpeg4[expected.channel];
  const Decoded decoded = decode_mpeg4(track);
  return expect(decoded.errors == 0 && decoded.pictures > 0 && decoded.one_size &&
                    decoded.width == expected.width && decoded.height == expected.height &&
                    decoded.interlaced == expected.interlaced,
                words(expected.width, " x ", expected.height, expected.interlaced ? ", interlaced" : ""),
                decoded.width, " x ", decoded.height, decoded.interlaced ? ", interlaced" : "", ", ",
                decoded.errors, " errors in ", track.size(), " frames");
}

constexpr CheckRow kRows[] = {
    {"read.no-error", "No read of a frame fails.", "Frames are missing in recordings.",
     [](Bench &bench) { return no_read_error(bench.capture(), 0); }},
    {"read.length", "The result of a read covers descriptor and bitstream.",
     "Recordings end within a frame, or the SDK discards frames.", lengths},
    {"descriptor.channel", "Frames come from all encoded channels and from no others.",
     "Pictures of one camera are in the recording of another one.",
     [](Bench &bench) { return channels_seen(bench.capture(), bench.capture().mpeg4); }},
    {"descriptor.type", "The descriptor marks every intra frame as intra, and no other frame.",
     "Recordings do not play from their start: the header stands before the wrong frames.", types},
    {"start.intra", "The first frame of each channel is an intra frame.",
     "The first second of a recording is grey.", starts_with_intra},
    {"start.soon", "The first frame of each channel comes within half a second.",
     "The start of each recording is missing.",
     [](Bench &bench) { return starts_soon(bench.capture(), bench.capture().mpeg4); }},
    {"stamp.rises", "Time stamps of a channel rise.", "Frames are played in a wrong order.", stamps_rise},
    {"stamp.wall-clock", "Time stamps agree with the wall clock.",
     "Motion and signal loss are noticed too late, or frames arrive late.", stamps_agree},
    {"gap", "No pause between frames of a channel is longer than 0.4 seconds.", "Recordings stutter.",
     [](Bench &bench) { return no_gap(bench.capture(), bench.capture().mpeg4); }},
    {"quantiser", "A larger quantiser means fewer bits.", "The quality of recordings cannot be chosen.",
     quantiser},
};

void add_rates(Checks &checks, ZV_VIDEO_STANDARD standard) {
  constexpr double kTolerance = 0.02;
  constexpr std::size_t kQuickRates = 8;
  const bool ntsc = standard == VIDEO_STANDARD_ZV_NTSC;
  const std::string recording = ntsc ? "rates-ntsc" : "rates-pal";
  const char *const *labels = recording::frame_rate_list(standard);
  for (u32 n = 0; labels[n] != nullptr; ++n)
    checks.push_back({words("mpeg4.rate.", name_of(standard), ".", labels[n]),
                      words("The interval gives ", labels[n], " frames a second, within 2 %."),
                      "Recordings play too fast or too slowly.", ntsc && n < kQuickRates, [=](Bench &bench) {
                        const auto exact = recording::exact_frame_rate(standard, n);
                        const double rate = exact ? double{1} * exact->numerator / exact->denominator : 0;
                        return expect_between("frames a second", rate_of(bench.recording(recording).mpeg4[n]),
                                              rate * (1 - kTolerance), rate * (1 + kTolerance));
                      }});
}

}  // namespace

void add_mpeg4(Checks &checks) {
  add_rows(checks, "mpeg4", kRows);
  for (u32 n = 0; n < kGroupLengths.size(); ++n)
    checks.push_back({words("mpeg4.group.", kGroupLengths[n]),
                      words("An intra frame comes every ", kGroupLengths[n], " frames."),
                      "Seeking in recordings is coarse, or recordings are too large.", true,
                      [n](Bench &bench) { return group_length(bench, n); }});
  for (u32 n = 0; n < kBitRates.size(); ++n)
    checks.push_back({words("mpeg4.bit-rate.", kBitRates[n] / 1000),
                      words("A constant bit rate of ", kBitRates[n], " bits a second is kept within 20 %."),
                      "The disk is full sooner than planned, or pictures are worse than paid for.", true,
                      [n](Bench &bench) { return bit_rate(bench, n); }});
  checks.push_back({"mpeg4.two-fields", "With both fields, twice the frames come.",
                    "Recordings of fast motion stutter.", true, [](Bench &bench) {
                      constexpr double kFields = 60000.0 / 1001;
                      return expect_between("frames a second",
                                            rate_of(bench.recording("settings").mpeg4[kTwoFieldChannel]),
                                            kFields * 0.98, kFields * 1.02);
                    }});
  checks.push_back(
      {"mpeg4.decodes.settings", "Every frame decodes, whatever the group length and the bit rate.",
       "Recordings have damaged pictures.", true, [](Bench &bench) { return decodes(bench, "settings"); }});
  checks.push_back({"mpeg4.decodes.rates", "Every frame decodes at every rate.",
                    "Recordings have damaged pictures.", false,
                    [](Bench &bench) { return decodes(bench, "rates-ntsc"); }});
  for (const SizeCase &row : size_cases())
    checks.push_back({"mpeg4.size." + row.name,
                      words("Frames decode behind the SDK's header to ", row.width, " x ", row.height, "."),
                      row.meaning, row.quick, [row](Bench &bench) { return size(bench, row); }});
  add_rates(checks, VIDEO_STANDARD_ZV_NTSC);
  add_rates(checks, VIDEO_STANDARD_ZV_PAL);
}

}  // namespace contract

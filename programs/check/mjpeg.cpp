// Theme mjpeg, and what the checks of all streams have in common.
#include "bench.h"
#include "check.h"
#include "decode.h"
#include "streams.h"

namespace contract {

std::vector<SizeCase> size_cases() {
  struct Scale {
    const char *name;
    bool full_width, full_height;
  };
  constexpr Scale kScales[] = {{"half-d1", true, false}, {"cif", false, false}, {"d1", true, true}};
  constexpr u32 kCifWidth = 352;
  std::vector<SizeCase> cases;
  for (const bool pal : {false, true})
    for (const u32 width : {720u, 704u})
      for (u32 channel = 0; channel < std::size(kScales); ++channel) {
        const Scale &scale = kScales[channel];
        const char *const standard = name_of(pal ? VIDEO_STANDARD_ZV_PAL : VIDEO_STANDARD_ZV_NTSC);
        const u32 lines = pal ? 576 : 480;
        cases.push_back({words(standard, ".", width, ".", scale.name), words("size-", standard, "-", width),
                         channel, scale.full_width ? width : kCifWidth, scale.full_height ? lines : lines / 2,
                         scale.full_height, pal == (width == 704),
                         words("Recordings of ", pal ? "PAL" : "NTSC", " cameras have the wrong size.")});
      }
  return cases;
}

Result no_read_error(const DriverCapture &capture, std::size_t stream) {
  const int error = capture.errors.at(stream);
  return expect(error == 0, "no read fails", error_name(error));
}

std::array<double, 3> mean_sizes(Bench &bench, std::array<Track, ZV_CHANNELS> Recording::*tracks,
                                 u32 channel) {
  std::array<double, 3> means{};
  for (u32 step = 0; step < means.size(); ++step) {
    const Track &track = (bench.recording(words("quality-", step)).*tracks)[channel];
    double bytes = 0;
    for (const Frame &frame : track) bytes += static_cast<double>(frame.data.size());
    means[step] = track.empty() ? 0 : bytes / static_cast<double>(track.size());
  }
  return means;
}

namespace {

Result results(Bench &bench) {
  for (const MjpegRead &picture : bench.capture().mjpeg)
    if (picture.result <= static_cast<long>(driver::kMjpegDescriptorSize) ||
        picture.result > static_cast<long>(driver::kMjpegReadSize))
      return broken("more than the descriptor and no more than was asked for",
                    words(picture.result, " bytes"));
  return bench.capture().mjpeg.empty() ? broken("pictures", "none") : held();
}

Result descriptor_size(Bench &bench) {
  for (const MjpegRead &picture : bench.capture().mjpeg)
    if (picture.descriptor.width != 352 || picture.descriptor.height != 240)
      return broken("352 x 240", words(picture.descriptor.width, " x ", picture.descriptor.height));
  return bench.capture().mjpeg.empty() ? broken("pictures", "none") : held();
}

Result eoi(Bench &bench) {
  std::size_t without = 0;
  for (const MjpegRead &picture : bench.capture().mjpeg) without += picture.ends_with_eoi ? 0 : 1;
  if (bench.capture().mjpeg.empty()) return broken("pictures", "none");
  return expect(without == 0, "an EOI marker in every picture", "none in ", without, " of ",
                bench.capture().mjpeg.size(), " pictures");
}

Result qualities(Bench &bench) {
  for (u32 channel = 0; channel < kQualityChannels; ++channel) {
    const auto mean = mean_sizes(bench, &Recording::mjpeg, channel);
    if (mean[0] == 0 || mean[0] >= mean[1] || mean[2] < mean[1] * 0.9 || mean[2] > mean[1] * 1.1)
      return broken("more bytes for medium than for low, the same for high",
                    words(mean[0], ", ", mean[1], ", ", mean[2], " bytes"));
  }
  return held();
}

Result size(Bench &bench, const SizeCase &expected) {
  const Track &track = bench.recording(expected.recording).mjpeg[expected.channel];
  const Decoded decoded = decode_mjpeg(track);
  return expect(decoded.errors == 0 && decoded.pictures == track.size() && !track.empty() &&
                    decoded.one_size && decoded.width == expected.width && decoded.height == expected.height,
                words(expected.width, " x ", expected.height), decoded.width, " x ", decoded.height, ", ",
                decoded.errors, " errors in ", track.size(), " pictures");
}

Result decodes(Bench &bench) {
  for (u32 channel = 0; channel < kQualityChannels; ++channel)
    for (u32 step = 0; step < 3; ++step) {
      const Track &track = bench.recording(words("quality-", step)).mjpeg[channel];
      const Decoded decoded = decode_mjpeg(track);
      if (track.empty() || decoded.errors > 0 || decoded.pictures != track.size())
        return broken("every picture decodes",
                      words(decoded.errors, " errors in ", track.size(), " pictures"));
    }
  return held();
}

constexpr CheckRow kRows[] = {
    {"read.no-error", "No read of a picture fails.", "Pictures are missing in recordings.",
     [](Bench &bench) { return no_read_error(bench.capture(), 1); }},
    {"read.length", "The result of a read counts descriptor and data.", "The SDK discards pictures.",
     results},
    {"descriptor.channel", "Pictures come from all encoded channels and from no others.",
     "Pictures of one camera are in the recording of another one.",
     [](Bench &bench) { return channels_seen(bench.capture(), bench.capture().mjpeg); }},
    {"descriptor.size", "The descriptor tells the size of the picture.", "Pictures have the wrong size.",
     descriptor_size},
    {"eoi", "Each picture ends with an EOI marker.", "Pictures are cut or discarded.", eoi},
    {"start.soon", "The first picture of each channel comes within half a second.",
     "The start of each recording is missing.",
     [](Bench &bench) { return starts_soon(bench.capture(), bench.capture().mjpeg); }},
    {"gap", "No pause between pictures of a channel is longer than 0.4 seconds.", "Recordings stutter.",
     [](Bench &bench) { return no_gap(bench.capture(), bench.capture().mjpeg); }},
    {"qualities", "Low quality has fewer bytes than medium, and high as many as medium.",
     "The quality of recordings cannot be chosen.", qualities},
    {"decodes", "Every picture decodes, in each quality.", "Recordings have damaged pictures.", decodes},
};

}  // namespace

void add_mjpeg(Checks &checks) {
  add_rows(checks, "mjpeg", kRows);
  for (const SizeCase &row : size_cases())
    checks.push_back({"mjpeg.size." + row.name,
                      words("Pictures decode behind the SDK's header to ", row.width, " x ", row.height, "."),
                      row.meaning, row.quick, [row](Bench &bench) { return size(bench, row); }});
  constexpr std::pair<u32, int> kRates[] = {{0, 30}, {2, 25}, {6, 15}, {7, 10}};  // channel and label
  for (const auto &[channel, label] : kRates)
    checks.push_back(
        {words("mjpeg.rate.", label), words("The interval gives ", label, " pictures a second, within 2 %."),
         "Recordings play too fast or too slowly.", true,
         [channel = channel, rate = label * 1000.0 / 1001](Bench &bench) {
           return expect_between("pictures a second", rate_of(bench.recording("rates-ntsc").mjpeg[channel]),
                                 rate * 0.98, rate * 1.02);
         }});
}

}  // namespace contract

// Theme audio: rate, blocks, and that sound agrees with the status.
#include <cmath>

#include "bench.h"
#include "check.h"
#include "decode.h"
#include "streams.h"

namespace contract {
namespace {

constexpr long kBlocks = driver::kAudioReadCount, kBytes = kBlocks * driver::kAudioBlockSize;
constexpr double kRate = 62.5;
constexpr double kQuiet = 100;  ///< root mean square of what counts as silence, of 32768

double loudness(const Track &track) {
  double squares = 0;
  const std::vector<std::int16_t> samples = decode_audio(track);
  for (const std::int16_t sample : samples) squares += double{1} * sample * sample;
  return samples.empty() ? 0 : std::sqrt(squares / static_cast<double>(samples.size()));
}

Result results(Bench &bench) {
  for (const OtherRead &block : bench.capture().audio)
    if (block.result != kBlocks && block.result != kBytes)
      return broken("result 4 (blocks) or 192 (bytes)", words(block.result));
  return bench.capture().audio.empty() ? broken("blocks", "none") : held();
}

Result block_size(Bench &bench) {
  std::size_t blocks = 0;
  for (const Track &track : bench.recording("settings").audio)
    for (const Frame &block : track) {
      if (block.data.size() != driver::kAudioBlockSize)
        return broken("48 bytes", words(block.data.size(), " bytes"));
      ++blocks;
    }
  return expect(blocks > 0, "blocks", "none");
}

Result rate(Bench &bench, u32 input) {
  return expect_between("blocks a second", rate_of(bench.recording("settings").audio[input]), kRate * 0.99,
                        kRate * 1.01);
}

Result sounds(Bench &bench, u32 input) {
  if ((bench.sounds() >> input & 1) == 0) return skipped("the input has no signal");
  const Track &track = bench.recording("settings").audio[input];
  const std::size_t samples = decode_audio(track).size();
  const std::size_t expected = track.size() * 128;
  if (samples != expected || track.empty()) return broken(words(expected, " samples"), words(samples));
  const double found = loudness(track);
  return expect(found > kQuiet, words("louder than ", kQuiet), found);
}

Result silence(Bench &bench) {
  const u32 silent = ~bench.sounds() & 0xF;
  if (silent == 0) return skipped("all four inputs have a signal");
  for (u32 input = 0; input < ZV_AUDIO_CHANNELS; ++input) {
    if ((silent >> input & 1) == 0) continue;
    const double found = loudness(bench.recording("settings").audio[input]);
    if (found > kQuiet) return broken(words("silence on input ", input + 1), words("loudness ", found));
  }
  return held();
}

Result apart(Bench &bench) {
  const u32 inputs = bench.sounds();
  const auto &tracks = bench.recording("settings").audio;
  unsigned pairs = 0;
  for (u32 one = 0; one < ZV_AUDIO_CHANNELS; ++one)
    for (u32 other = one + 1; other < ZV_AUDIO_CHANNELS; ++other) {
      if ((inputs >> one & inputs >> other & 1) == 0) continue;
      ++pairs;
      std::size_t same = 0;
      const std::size_t blocks = std::min(tracks[one].size(), tracks[other].size());
      for (std::size_t n = 0; n < blocks; ++n) same += tracks[one][n].data == tracks[other][n].data ? 1 : 0;
      if (blocks == 0 || same * 2 > blocks)
        return broken(words("different sound on inputs ", one + 1, " and ", other + 1),
                      words(same, " of ", blocks, " blocks are the same"));
    }
  return pairs == 0 ? skipped("fewer than two inputs have a signal") : held();
}

constexpr CheckRow kRows[] = {
    {"read.no-error", "No read of audio fails.", "Recordings have gaps in the sound.",
     [](Bench &bench) { return no_read_error(bench.capture(), 2); }},
    {"read.blocks", "A read returns one block for each of the four inputs.", "Inputs are mixed up.", results},
    {"start.soon", "The first block comes within half a second.", "The start of each recording is silent.",
     [](Bench &bench) { return starts_soon(bench.capture(), bench.capture().audio); }},
    {"gap", "No pause between blocks is longer than 0.4 seconds.", "Sound stutters.",
     [](Bench &bench) { return no_gap(bench.capture(), bench.capture().audio); }},
    {"block", "A block has 48 bytes.", "Players do not understand the recording.", block_size},
    {"apart", "The inputs have different sounds.", "Two recordings have the sound of one microphone.", apart},
    {"silence", "An input without a signal is silent.", "The status is wrong, or the input picks up noise.",
     silence},
};

}  // namespace

void add_audio(Checks &checks) {
  add_rows(checks, "audio", kRows);
  for (u32 input = 0; input < ZV_AUDIO_CHANNELS; ++input) {
    checks.push_back({words("audio.rate.input-", input + 1), "62.5 blocks a second come, within 1 %.",
                      "Sound and picture drift apart.", true,
                      [input](Bench &bench) { return rate(bench, input); }});
    checks.push_back({words("audio.sound.input-", input + 1), "An input with a signal decodes to sound.",
                      "Recordings are silent or noise.", true,
                      [input](Bench &bench) { return sounds(bench, input); }});
  }
}

}  // namespace contract

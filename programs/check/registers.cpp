// Theme registers: what is written can be read back, and stays.
#include <set>

#include "bench.h"
#include "check.h"

namespace contract {
namespace {

Result codec_read_back(Bench &bench, u32 address, u32 one, u32 other) {
  const Nodes &nodes = bench.nodes();
  const u32 found = nodes.codec(address);
  for (const u32 value : {one, other, found}) {
    nodes.write_codec(address, value);
    const u32 now = nodes.codec(address);
    if (now != value) return broken(words("0x", std::hex, value), words("0x", std::hex, now));
  }
  return held();
}

/// Reads registers many times; nothing writes them meanwhile.
Result steady(Bench &bench) {
  const Nodes &nodes = bench.nodes();
  const auto all = [&] {
    std::vector<u32> values{nodes.codec(driver::kRegDisplayState), nodes.codec(driver::kRegMotionEnable),
                            nodes.codec(driver::kRegMjpegQuality)};
    for (u32 n = 0; n < ZV_CHANNELS; ++n) {
      values.push_back(nodes.video_input(driver::kRegRouting + 4 * n));
      values.push_back(nodes.video_input(driver::kRegPrivacyMask + 4 * n));
    }
    return values;
  };
  const std::vector<u32> first = all();
  for (int time = 0; time < 5; ++time)
    if (all() != first) return broken("the same values in every read", "other values");
  return held();
}

Result mask_register(Bench &bench, u32 channel) {
  const Nodes &nodes = bench.nodes();
  const u32 address = driver::kRegPrivacyMask + 4 * channel;
  const u32 found = nodes.video_input(address);
  driver::Mask mask{channel, 80, 160, 40, 96};
  const u32 expected = driver::packed_mask({channel, 10, 20, 5, 12});
  nodes.issue(kVideoInput, driver::VIN_IOC_SET_MASK, &mask);
  const u32 now = nodes.video_input(address);
  nodes.write_video_input(address, found);
  return expect(now == expected, words("0x", std::hex, expected), "0x", std::hex, now);
}

Result routing_permutation(Bench &bench) {
  std::set<u32> channels;
  for (u32 n = 0; n < ZV_CHANNELS; ++n)
    channels.insert(bench.nodes().video_input(driver::kRegRouting + 4 * n) >> driver::kRoutingShift);
  return expect(channels.size() == ZV_CHANNELS, "16 channels in 16 windows", channels.size(), " channels");
}

Result routing_read_back(Bench &bench) {
  const Nodes &nodes = bench.nodes();
  constexpr u32 kFirst = driver::kRegRouting, kSecond = driver::kRegRouting + 4;
  constexpr u32 kKept = (1u << driver::kRoutingShift) - 1;
  const u32 first = nodes.video_input(kFirst), second = nodes.video_input(kSecond);
  const u32 swapped = (second & ~kKept) | (first & kKept);
  nodes.write_video_input(kFirst, swapped);
  const u32 now = nodes.video_input(kFirst);
  nodes.write_video_input(kFirst, first);
  return expect(now == swapped, words("0x", std::hex, swapped), "0x", std::hex, now);
}

Result decoder_read_back(Bench &bench, u8 chip) {
  const Nodes &nodes = bench.nodes();
  constexpr u32 kProperties = 4;
  for (u32 n = 0; n < driver::kChannelsPerChip * kProperties; ++n) {
    const auto address = static_cast<u8>(driver::kDecoderProperty + n % kProperties +
                                         driver::kDecoderChannelStride * (n / kProperties));
    const u8 found = nodes.decoder(chip, address);
    for (const u8 value : {u8{0x35}, u8{0xCA}, found}) {
      nodes.write_decoder(chip, address, value);
      if (const u8 now = nodes.decoder(chip, address); now != value)
        return broken(words("value ", +value, " at address ", +address), words(+now));
    }
  }
  return held();
}

/// A signal that comes and goes is a loose plug or a bad camera.
Result steady_signals(Bench &bench) {
  const auto status = [&] {
    u32 bits = 0;
    for (u8 chip = 0; chip < driver::kDecoderChips; ++chip)
      bits = bits << 8 | bench.nodes().decoder(chip, driver::kDecoderStatus);
    return bits;
  };
  const u32 first = status();
  for (int time = 0; time < 50; ++time) {
    pause_for(0.02);
    if (const u32 now = status(); now != first)
      return broken("the same video and audio bits for a second",
                    words("0x", std::hex, first, ", then 0x", now));
  }
  return held();
}

Result status_high_bits(Bench &bench) {
  for (u8 chip = 1; chip < driver::kDecoderChips; ++chip)
    if (const u8 status = bench.nodes().decoder(chip, driver::kDecoderStatus); status > 0xF)
      return broken("audio bits on decoder 0 only", words("status ", +status, " of decoder ", +chip));
  return held();
}

Result encoder_read_back(Bench &bench, u32 get, u32 set, const std::array<u32, 2> &values) {
  const Nodes &nodes = bench.nodes();
  for (const u32 channel : {0u, ZV_CHANNELS - 1}) {
    driver::Interval found{channel, 0, 0};
    nodes.issue(kEncoder, get, &found);
    for (const u32 value : {values[0], values[1], found.code}) {
      driver::Interval record{channel, value, value >> driver::kIntervalDropShift & 1}, now{channel, 0, 0};
      nodes.issue(kEncoder, set, &record);
      nodes.issue(kEncoder, get, &now);
      if (now.code != value) return broken(words(value, " of channel ", channel + 1), words(now.code));
    }
  }
  return held();
}

/// Settings of the card stay when all programs have closed it.
Result survives_reopening(Bench &bench) {
  driver::ChannelValue gop{5, 77}, gop_now{5, 0};
  constexpr u32 kMaskAddress = driver::kRegPrivacyMask + 4 * 5;
  const u32 mask = driver::packed_mask({5, 1, 9, 2, 8});
  const u32 found_mask = bench.nodes().video_input(kMaskAddress);
  driver::ChannelValue found_gop{5, 0};
  bench.nodes().issue(kEncoder, driver::ENC_IOC_GET_GOP, &found_gop);
  bench.nodes().issue(kEncoder, driver::ENC_IOC_SET_GOP, &gop);
  bench.nodes().write_video_input(kMaskAddress, mask);
  bench.close_all();
  bench.nodes().issue(kEncoder, driver::ENC_IOC_GET_GOP, &gop_now);
  const u32 mask_now = bench.nodes().video_input(kMaskAddress);
  bench.nodes().issue(kEncoder, driver::ENC_IOC_SET_GOP, &found_gop);
  bench.nodes().write_video_input(kMaskAddress, found_mask);
  return expect(gop_now.value == gop.value && mask_now == mask, words("GOP 77, mask ", mask), "GOP ",
                gop_now.value, ", mask ", mask_now);
}

Result set_up_by_sdk(Bench &bench) {
  bench.sdk();
  for (const auto &[address, value] : driver::kDecoderSetup)
    if (const u8 now = bench.nodes().decoder(0, address); now != value)
      return broken(words("decoder register ", +address, " has ", +value), words(+now));
  const u32 control = bench.nodes().codec(driver::kRegMotionControl);
  return expect(control == driver::kMotionControlAll, "0xffff in codec register 0x268", "0x", std::hex,
                control);
}

Result board_version(Bench &bench) {
  const u32 version = zv_GetHardwareVersion(bench.sdk());
  return expect(version < 3, "version 0, 1 or 2", version,
                version == 3 ? ": no reply, or an unknown one" : "");
}

Result display_size(Bench &bench, u32 standard, u32 lines) {
  const Nodes &nodes = bench.nodes();
  nodes.set_standard(standard);
  u32 now = 0;
  nodes.issue(kDisplay, driver::DISP_IOC_GET_HEIGHT, &now);
  return expect(now == lines, words(lines, " lines of a field"), now);
}

constexpr CheckRow kRows[] = {
    {"steady", "Registers that nobody writes do not change.", "Settings that a program reads are random.",
     steady},
    {"routing.permutation", "Each of the sixteen windows shows another channel.",
     "A camera is missing in the preview, another one is there twice.", routing_permutation},
    {"routing.read-back", "The routing register of a window can be read back.",
     "The focus channel cannot be set.", routing_read_back},
    {"decoders.signal", "The decoders' video and audio bits do not change for a second.",
     "A camera or its plug is loose, or programs see lost video at random.", steady_signals},
    {"decoders.audio-bits", "Only decoder 0 reports audio inputs.", "The audio status is wrong.",
     status_high_bits},
    {"reopening", "GOP and mask stay when the last program closes the card.",
     "Settings are lost between two programs, privacy masks among them.", survives_reopening},
    {"opening", "Opening the SDK writes its set-up registers.", "Audio and motion detection do not work.",
     set_up_by_sdk},
    {"board.version", "The board tells a known version.", "The program shows an unknown board.",
     board_version},
};

}  // namespace

void add_registers(Checks &checks) {
  struct Codec {
    const char *name;
    u32 address, one, other;
  };
  constexpr Codec kCodec[] = {
      {"display-state", driver::kRegDisplayState, 0, driver::kDisplayStateBit},
      {"motion-enable", driver::kRegMotionEnable, driver::kMotionEnableMask, 0},
      {"motion-control", driver::kRegMotionControl, 0x1234, driver::kMotionControlAll},
      {"jpeg-quality", driver::kRegMjpegQuality, driver::kMjpegCoarse, driver::kMjpegFine}};
  for (const Codec &row : kCodec)
    checks.push_back(
        {words("registers.codec.", row.name, ".read-back"), "The codec register can be read back.",
         "A setting has no effect, or programs read another one.", true,
         [row](Bench &bench) { return codec_read_back(bench, row.address, row.one, row.other); }});
  for (const u32 channel : {0u, ZV_CHANNELS - 1})
    checks.push_back({words("registers.mask.channel-", channel + 1),
                      "A privacy mask appears in the channel's register, in units of 8.",
                      "Programs read another mask than the card has.", true,
                      [channel](Bench &bench) { return mask_register(bench, channel); }});
  for (u8 chip = 0; chip < driver::kDecoderChips; ++chip)
    checks.push_back({words("registers.decoder-", +chip, ".read-back"),
                      "The property registers of four channels can be read back.",
                      "Hue, contrast and brightness of four cameras do not change.", true,
                      [chip](Bench &bench) { return decoder_read_back(bench, chip); }});
  struct Encoder {
    const char *name;
    u32 get, set;
    std::array<u32, 2> values;
  };
  constexpr Encoder kEncoders[] = {
      {"scale", driver::ENC_IOC_GET_SCALE, driver::ENC_IOC_SET_SCALE, {2, driver::kScaleCodeD1}},
      {"interval", driver::ENC_IOC_GET_INTERVAL, driver::ENC_IOC_SET_INTERVAL, {5, 0x209}},
      {"gop", driver::ENC_IOC_GET_GOP, driver::ENC_IOC_SET_GOP, {1, 300}},
      {"quantiser", driver::ENC_IOC_GET_QP, driver::ENC_IOC_SET_QP, {1, 31}}};
  for (const Encoder &row : kEncoders)
    checks.push_back(
        {words("registers.encoder.", row.name, ".read-back"), "The encoder's setting can be read back.",
         "zv_get_video_config returns wrong settings.", true,
         [row](Bench &bench) { return encoder_read_back(bench, row.get, row.set, row.values); }});
  for (const u32 standard : {u32{VIDEO_STANDARD_ZV_NTSC}, u32{VIDEO_STANDARD_ZV_PAL}})
    checks.push_back({words("registers.display.lines-", name_of(standard)),
                      "The display has the lines of the standard.",
                      "The preview is cut or has a black border.", true, [standard](Bench &bench) {
                        return display_size(bench, standard, standard == VIDEO_STANDARD_ZV_PAL ? 288 : 240);
                      }});
  add_rows(checks, "registers", kRows);
}

}  // namespace contract

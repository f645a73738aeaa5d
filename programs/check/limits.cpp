// Theme boundary: the driver refuses what is wrong, and changes nothing then.
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "bench.h"
#include "check.h"

namespace contract {
namespace {

struct Wrong {
  const char *name;
  Node node;
  u32 code;
  std::array<u32, 8> record;
};

constexpr u32 kBeyond = ZV_CHANNELS;

constexpr Wrong kWrong[] = {
    {"scale.channel", kEncoder, driver::ENC_IOC_SET_SCALE, {kBeyond, 2}},
    {"scale.code", kEncoder, driver::ENC_IOC_SET_SCALE, {3, 7}},
    {"interval.channel", kEncoder, driver::ENC_IOC_SET_INTERVAL, {kBeyond, 1}},
    {"gop.channel", kEncoder, driver::ENC_IOC_SET_GOP, {kBeyond, 30}},
    {"quantiser.channel", kEncoder, driver::ENC_IOC_SET_QP, {kBeyond, 8}},
    {"quantiser.value", kEncoder, driver::ENC_IOC_SET_QP, {3, 32}},
    {"get-scale.channel", kEncoder, driver::ENC_IOC_GET_SCALE, {kBeyond}},
    {"get-interval.channel", kEncoder, driver::ENC_IOC_GET_INTERVAL, {kBeyond}},
    {"get-gop.channel", kEncoder, driver::ENC_IOC_GET_GOP, {kBeyond}},
    {"get-quantiser.channel", kEncoder, driver::ENC_IOC_GET_QP, {kBeyond}},
    {"number-on.channel", kEncoder, driver::ENC_IOC_CHANNEL_NUMBER_ON, {kBeyond}},
    {"number-off.channel", kEncoder, driver::ENC_IOC_CHANNEL_NUMBER_OFF, {kBeyond}},
    {"bit-rate.channel", kEncoder, driver::ENC_IOC_SET_CBR, {kBeyond, 512000, 1}},
    {"quantiser-range.channel", kEncoder, driver::ENC_IOC_SET_QP_RANGE, {kBeyond, 20, 4, 1}},
    {"encoder.standard", kEncoder, driver::ENC_IOC_SET_STANDARD, {VIDEO_STANDARD_ZV_INVALID}},
    {"display.standard", kDisplay, driver::DISP_IOC_SET_STANDARD, {VIDEO_STANDARD_ZV_INVALID}},
    {"window.index", kDisplay, driver::DISP_IOC_SET_WINDOW, {16, 0, 1, 0, 0, 720, 480, 1}},
    {"window.channel", kDisplay, driver::DISP_IOC_SET_WINDOW, {0, kBeyond, 1, 0, 0, 720, 480, 1}},
    {"window.reversed", kDisplay, driver::DISP_IOC_SET_WINDOW, {0, 0, 1, 360, 0, 0, 480, 1}},
    {"frame.number", kDisplay, driver::DISP_IOC_SET_RECT, {2, 0, 0, 718, 478, 1}},
    {"source.group",
     kDisplay,
     driver::DISP_IOC_SET_SOURCE_CFG,
     {driver::kSourceGroups << driver::kSourceGroupShift}},
    {"buffer.index", kDisplay, driver::DISP_IOC_SELECT_BUFFER, {driver::kPreviewBuffers}},
    {"video-input.standard", kVideoInput, driver::VIN_IOC_SET_STANDARD, {VIDEO_STANDARD_ZV_INVALID}},
    {"width.value", kVideoInput, driver::VIN_IOC_SET_WIDTH, {721}},
    {"mask.channel", kVideoInput, driver::VIN_IOC_SET_MASK, {kBeyond, 0, 80, 0, 80}},
    {"mask.reversed", kVideoInput, driver::VIN_IOC_SET_MASK, {3, 160, 80, 0, 80}},
    {"mask.outside", kVideoInput, driver::VIN_IOC_SET_MASK, {3, 0, 800, 0, 80}},
    {"read-decoder.chip", kVideoInput, driver::VIN_IOC_READ_TW2815, {0x00005A04}},
    {"write-decoder.chip", kVideoInput, driver::VIN_IOC_WRITE_TW2815, {0x00007204}},
};

Result refuses(const Nodes &nodes, Node node, u32 code, void *record, int expected) {
  const int error = nodes.issue(node, code, record);
  return expect(error == expected, error_name(expected), error_name(error));
}

Result refuses_wrong(Bench &bench, const Wrong &wrong) {
  bench.touch_layout();
  std::array<u32, 8> record = wrong.record;
  return refuses(bench.nodes(), wrong.node, wrong.code, record.data(), EINVAL);
}

Result refuses_motion_map(Bench &bench, driver::MotionMap map, bool with_thresholds, int expected) {
  const std::vector<u16> thresholds(std::size_t{driver::kMotionMapSide} * 65, 7);
  if (with_thresholds) map.thresholds = thresholds.data();
  return refuses(bench.nodes(), kVideoInput, driver::VIN_IOC_SET_MOTION_MAP, &map, expected);
}

struct Pointed {
  const char *name;
  Node node;
  u32 code;
};
constexpr Pointed kPointed[] = {{"ENC_IOC_SET_SCALE", kEncoder, driver::ENC_IOC_SET_SCALE},
                                {"ENC_IOC_GET_SCALE", kEncoder, driver::ENC_IOC_GET_SCALE},
                                {"DISP_IOC_SET_WINDOW", kDisplay, driver::DISP_IOC_SET_WINDOW},
                                {"DISP_IOC_GET_WIDTH", kDisplay, driver::DISP_IOC_GET_WIDTH},
                                {"VIN_IOC_SET_MASK", kVideoInput, driver::VIN_IOC_SET_MASK},
                                {"VIN_IOC_BOARD_CMD", kVideoInput, driver::VIN_IOC_BOARD_CMD}};

void add_addresses(Checks &checks) {
  for (const Pointed &row : kPointed)
    for (const bool null : {true, false})
      checks.push_back(
          {words("boundary.", null ? "null" : "bad", "-address.", row.name, "-is-EFAULT"),
           words("A record at ", null ? "the null address" : "an address without memory", " is refused."),
           "A wrong program stops the machine instead of itself.", true, [&row, null](Bench &bench) {
             void *nowhere = nullptr;
             const std::uintptr_t bad = 64;
             if (!null) std::memcpy(&nowhere, &bad, sizeof nowhere);
             return refuses(bench.nodes(), row.node, row.code, nowhere, EFAULT);
           }});
  checks.push_back({"boundary.motion-map.null-thresholds-are-EFAULT",
                    "A motion map without thresholds is refused.",
                    "A wrong program stops the machine instead of itself.", true, [](Bench &bench) {
                      return refuses_motion_map(bench, {3, 0, 0, 4, 4, nullptr}, false, EFAULT);
                    }});
}

void add_foreign(Checks &checks) {
  constexpr u32 kUnknown = 0x00007A01;
  for (unsigned node = 0; node < kNodes; ++node)
    checks.push_back({words("boundary.", kNodeNames[node], ".unknown-command-is-ENOTTY"),
                      "A command that no driver of this card has is refused.",
                      "A newer SDK cannot find out what the driver lacks.", true, [node](Bench &bench) {
                        return refuses(bench.nodes(), Node{node}, kUnknown, nullptr, ENOTTY);
                      }});
  constexpr std::pair<Node, u32> kOther[] = {{kEncoder, driver::DISP_IOC_GET_WIDTH},
                                             {kDisplay, driver::ENC_IOC_GET_SCALE},
                                             {kVideoInput, driver::DISP_IOC_GET_WIDTH},
                                             {kAudio, driver::ENC_IOC_GET_SCALE}};
  for (const auto &[node, code] : kOther)
    checks.push_back({words("boundary.", kNodeNames[node], ".command-of-another-node-is-ENOTTY"),
                      "A command of another node is refused.", "Two nodes change each other's settings.",
                      true, [node = node, code = code](Bench &bench) {
                        std::array<u32, 2> record{};
                        return refuses(bench.nodes(), node, code, record.data(), ENOTTY);
                      }});
}

void add_reads(Checks &checks) {
  struct Count {
    const char *name;
    Node node;
    std::size_t count;
  };
  constexpr Count kCounts[] = {{"frame-of-1000-bytes", kEncoder, 1000},
                               {"frame-of-0x200000-bytes", kEncoder, 0x200000},
                               {"audio-of-3-blocks", kAudio, 3},
                               {"audio-of-192-bytes", kAudio, 192},
                               {"preview-of-3-bytes", kDisplay, 3}};
  for (const Count &row : kCounts)
    checks.push_back({words("boundary.read.", row.name, "-is-EINVAL"),
                      "A read with a wrong byte count is refused.", "A wrong program reads parts of frames.",
                      true, [row](Bench &bench) {
                        std::vector<u8> bytes(0x200000);
                        const ssize_t result = read(bench.nodes().fd(row.node), bytes.data(), row.count);
                        return expect(result < 0 && errno == EINVAL, "EINVAL",
                                      result < 0 ? error_name(errno) : words("result ", result));
                      }});
}

Result changes_nothing(Bench &bench) {
  const Nodes &nodes = bench.nodes();
  driver::ChannelValue before{3, 0}, wrong{3, 7}, after{3, 0};
  nodes.issue(kEncoder, driver::ENC_IOC_GET_SCALE, &before);
  nodes.issue(kEncoder, driver::ENC_IOC_SET_SCALE, &wrong);
  nodes.issue(kEncoder, driver::ENC_IOC_GET_SCALE, &after);
  return expect(after.value == before.value, words("scale code ", before.value, " as before"), after.value);
}

Result mask_unchanged(Bench &bench) {
  const Nodes &nodes = bench.nodes();
  constexpr u32 kAddress = driver::kRegPrivacyMask + 4 * 3;
  const u32 before = nodes.video_input(kAddress);
  driver::Mask wrong{3, 160, 80, 0, 80};
  nodes.issue(kVideoInput, driver::VIN_IOC_SET_MASK, &wrong);
  const u32 after = nodes.video_input(kAddress);
  return expect(after == before, words("mask ", before, " as before"), after);
}

}  // namespace

void add_limits(Checks &checks) {
  for (const Wrong &wrong : kWrong)
    checks.push_back({words("boundary.", wrong.name, ".out-of-range-is-EINVAL"),
                      "A value out of its range is refused.",
                      "A wrong program writes into memory or registers of another channel.", true,
                      [&wrong](Bench &bench) { return refuses_wrong(bench, wrong); }});
  checks.push_back({"boundary.motion-map.out-of-range-is-EINVAL", "A motion map of 65 columns is refused.",
                    "A wrong program writes into the map of another channel.", true, [](Bench &bench) {
                      return refuses_motion_map(bench, {3, 0, 0, 65, 1, nullptr}, true, EINVAL);
                    }});
  checks.push_back({"boundary.motion-map.channel-out-of-range-is-EINVAL",
                    "A motion map of channel 17 is refused.",
                    "A wrong program writes into memory of the driver.", true, [](Bench &bench) {
                      return refuses_motion_map(bench, {kBeyond, 0, 0, 4, 4, nullptr}, true, EINVAL);
                    }});
  checks.push_back({"boundary.refused.scale-stays", "A refused scale changes nothing.",
                    "A wrong call stops a recording.", true, changes_nothing});
  checks.push_back({"boundary.refused.mask-stays", "A refused mask changes nothing.",
                    "A wrong call removes a privacy mask.", true, mask_unchanged});
  add_addresses(checks);
  add_foreign(checks);
  add_reads(checks);
}

}  // namespace contract

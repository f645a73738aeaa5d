// zarvo_check in front of a driver with one small fault at a time, and what it puts back in the end.
#include <sys/ioctl.h>

#include <cerrno>
#include <cstring>

#include "check_test.h"
#include "support.h"
#include "virtual_card.h"

namespace contract {

/// A command on its way to the driver, as words or as the bytes of a decoder register.
struct Command {
  int fd;
  u32 code;
  void *record;

  u32 &word(std::size_t n) const { return static_cast<u32 *>(record)[n]; }
  u8 &byte(std::size_t n) const { return static_cast<u8 *>(record)[n]; }
  int pass() const;  ///< returns 0 or the error number
};
std::function<int(const Command &)> fault;  // the answer of the driver
u32 fault_code;                             // to this command

extern "C" {
int __real_ioctl(int fd, unsigned long code, void *record);   // NOLINT: the linker chooses these names
int __wrap_ioctl(int fd, unsigned long code, void *record) {  // NOLINT
  if (!fault || code != fault_code) return __real_ioctl(fd, code, record);
  const int error = fault({fd, static_cast<u32>(code), record});
  if (error != 0) errno = error;
  return error == 0 ? 0 : -1;
}
}

int Command::pass() const {
  return __real_ioctl(fd, code, record) == 0 ? 0 : errno;
}

namespace {

using namespace zarvo::driver;
using testing::HasSubstr;

/// A driver that passes a command on, and then changes the record that it returns.
auto returning(const std::function<void(const Command &)> &change) {
  return [change](const Command &c) {
    const int error = c.pass();
    change(c);
    return error;
  };
}
/// A driver that changes the record before it takes it.
auto taking(const std::function<void(const Command &)> &change) {
  return [change](const Command &c) {
    std::array<u8, 64> copy{};
    std::memcpy(copy.data(), c.record, c.code >> 16 & 0x3FFF);
    const Command changed{c.fd, c.code, copy.data()};
    change(changed);
    const int error = changed.pass();
    std::memcpy(c.record, copy.data(), c.code >> 16 & 0x3FFF);
    return error;
  };
}
int ignore(const Command &) {
  return 0;
}
int refuse(const Command &) {
  return EIO;
}

TEST(CheckDriver, EachFaultIsNoticed) {
  const struct {
    const char *check;
    u32 code;
    std::function<int(const Command &)> answer;
  } rows[] = {
      {"registers.codec.motion-control.read-back", DISP_IOC_READ_REG,
       returning([](auto &c) { c.word(1) &= 0xFF; })},
      {"registers.mask.channel-1", VIN_IOC_SET_MASK,
       taking([](auto &c) { std::swap(c.word(2), c.word(3)); })},
      {"registers.mask.channel-16", VIN_IOC_SET_MASK, [](auto &c) { return c.word(0) == 15 ? 0 : c.pass(); }},
      {"registers.routing.read-back", VIN_IOC_WRITE_REG, ignore},
      {"registers.steady", VIN_IOC_READ_REG,
       returning([count = 0](auto &c) mutable { c.word(1) ^= ++count == 90 ? 1 : 0; })},
      {"registers.decoder-3.read-back", VIN_IOC_WRITE_TW2815,
       [](auto &c) { return c.byte(1) == 0x3A ? 0 : c.pass(); }},
      {"registers.decoders.audio-bits", VIN_IOC_READ_TW2815, returning([](auto &c) {
         if (c.byte(0) == 3) c.byte(2) = 0x1F;
       })},
      {"registers.encoder.interval.read-back", ENC_IOC_SET_INTERVAL,
       taking([](auto &c) { c.word(1) &= 0xFF; })},
      {"registers.reopening", ENC_IOC_GET_GOP, returning([](auto &c) { c.word(1) = 30; })},
      {"registers.opening", VIN_IOC_READ_TW2815,
       returning([](auto &c) { c.byte(2) = c.byte(1) == 0x74 ? 0 : c.byte(2); })},
      {"registers.display.lines-pal", DISP_IOC_GET_HEIGHT, returning([](auto &c) { c.word(0) *= 2; })},
      {"switches.width.704", DISP_IOC_GET_WIDTH, returning([](auto &c) { c.word(0) = 720; })},
      {"boundary.motion-map.pointer", VIN_IOC_SET_MOTION_MAP, ignore},
      {"boundary.motion-levels.size", VIN_IOC_GET_MOTION_LEVELS,
       [](auto &c) {
         MotionLevels all{};
         const int error = Command{c.fd, c.code, &all}.pass();
         std::memcpy(c.record, &all, 30);
         return error;
       }},
      {"boundary.scale.channel.out-of-range-is-EINVAL", ENC_IOC_SET_SCALE, refuse},
      {"boundary.refused.scale-stays", ENC_IOC_SET_SCALE,
       [](auto &c) {
         taking([](auto &r) { r.word(1) = 1; })(c);
         return EINVAL;
       }},
      {"boundary.null-address.VIN_IOC_BOARD_CMD-is-EFAULT", VIN_IOC_BOARD_CMD, [](auto &) { return EINVAL; }},
      {"boundary.display.unknown-command-is-ENOTTY", 0x7A01, [](auto &) { return EINVAL; }},
      {"watchdog.stops", VIN_IOC_BOARD_CMD, returning([](auto &c) { c.word(1) = kBoardWatchdogOnReply; })},
      {"watchdog.fed", VIN_IOC_BOARD_CMD,
       returning([count = 0](auto &c) mutable { c.word(1) = ++count == 5 ? 0 : c.word(1); })},
  };
  const Checks checks = all_checks();
  for (std::size_t n = 0; n < std::size(rows); ++n) {
    card::reset();
    Bench bench(true, 1);
    expect_outcome(checks, rows[n].check, bench, kHeld, n);
    fault_code = rows[n].code;
    fault = rows[n].answer;
    expect_outcome(checks, rows[n].check, bench, kBroken, n);
    fault = nullptr;
  }
}

/// A setting that the driver tells: the commands that get and set it, and its record.
struct Setting {
  Node node;
  u32 get, set;
  std::array<u32, 3> record;
};

std::vector<Setting> all_settings() {
  std::vector<Setting> all;
  for (const u32 address : {kRegMotionEnable, kRegMotionControl, kRegMjpegQuality})
    all.push_back({kDisplay, DISP_IOC_READ_REG, DISP_IOC_WRITE_REG, {address}});
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    all.push_back({kVideoInput, VIN_IOC_READ_REG, VIN_IOC_WRITE_REG, {kRegPrivacyMask + 4 * n}});
    all.push_back({kEncoder, ENC_IOC_GET_SCALE, ENC_IOC_SET_SCALE, {n}});
    all.push_back({kEncoder, ENC_IOC_GET_INTERVAL, ENC_IOC_SET_INTERVAL, {n}});
    all.push_back({kEncoder, ENC_IOC_GET_GOP, ENC_IOC_SET_GOP, {n}});
    all.push_back({kEncoder, ENC_IOC_GET_QP, ENC_IOC_SET_QP, {n}});
    for (u32 property = 0; property < 4; ++property)
      all.push_back({kVideoInput,
                     VIN_IOC_READ_TW2815,
                     VIN_IOC_WRITE_TW2815,
                     {n / 4 | (7 + n % 4 * 16 + property) << 8}});
  }
  return all;
}

/// Sets everything to values that follow from a seed below 16.
void set_all(const Nodes &nodes, u32 seed) {
  u32 width = seed % 2 == 0 ? 720 : 704;
  nodes.set_standard(seed % 2);
  nodes.issue(kVideoInput, VIN_IOC_SET_WIDTH, &width);
  for (Setting &each : all_settings()) {
    each.record[1] = each.get == ENC_IOC_GET_SCALE ? seed % 3 : each.record[0] % 16 + seed;
    if (each.get == VIN_IOC_READ_TW2815) each.record[0] |= (each.record[0] / 256 + seed) << 16;
    nodes.issue(each.node, each.set, each.record.data());
  }
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    const std::vector<u16> thresholds(64 * 64, static_cast<u16>(100 * seed + n));
    MotionMap map{n, 0, 0, 64, 64, thresholds.data()};
    nodes.issue(kVideoInput, VIN_IOC_SET_MOTION_MAP, &map);
  }
}

/// Returns what the driver tells of the card.
std::vector<std::array<u32, 3>> told(const Nodes &nodes) {
  std::vector<std::array<u32, 3>> values(1);
  nodes.issue(kDisplay, DISP_IOC_GET_WIDTH, &values[0][0]);
  nodes.issue(kDisplay, DISP_IOC_GET_HEIGHT, &values[0][1]);
  for (const Setting &each : all_settings())
    nodes.issue(each.node, each.get, values.emplace_back(each.record).data());
  MotionLevels levels{};
  nodes.issue(kVideoInput, VIN_IOC_GET_MOTION_LEVELS, &levels);
  for (const u16 level : levels.level) values.push_back({level});
  return values;
}

// Catches: a channel, chip or property that is forgotten, and a failure that keeps the rest from coming back.
TEST(CheckRestore, EverythingIsAsBefore) {
  for (const bool failing : {false, true}) {
    card::reset();
    Nodes nodes;
    set_all(nodes, 5);
    const auto before = told(nodes);
    Bench bench(true, 1);
    set_all(bench.nodes(), 12);
    EXPECT_NE(told(nodes), before);
    if (failing) {
      bench.touch_layout();
      card::apply("frozen=preview");
      fault_code = VIN_IOC_WRITE_REG;
      fault = [](const Command &c) { return c.word(0) == kRegPrivacyMask ? EIO : c.pass(); };
    }
    const std::string left = bench.restore();
    fault = nullptr;
    EXPECT_THAT(left, failing ? HasSubstr("the preview stands still") : HasSubstr(""));
    EXPECT_EQ(left.find("EIO") != std::string::npos, failing) << left;
    if (failing) nodes.write_video_input(kRegPrivacyMask, before[4][1]);
    EXPECT_EQ(told(nodes), before);
  }
  card::apply("reset");
}

}  // namespace
}  // namespace contract

// Theme boundary: the driver has every command, and keeps to the records of sdk/zv_driver.h.
#include <sys/mman.h>
#include <unistd.h>

#include <cstring>

#include "bench.h"
#include "check.h"

namespace contract {
namespace {

/// A command with a record that changes nothing a user would miss. `undo` is the command that ends its
/// effect.
struct Command {
  const char *name;
  Node node;
  u32 code;
  std::size_t size;
  std::array<u32, 12> record;
  u32 undo = 0;
};

#define COMMAND(node, code, ...) \
  { #code, node, driver::code, __VA_ARGS__ }

constexpr u32 kLast = ZV_CHANNELS - 1;
constexpr std::size_t kNone = 0, kWord = sizeof(u32), kPair = sizeof(driver::ChannelValue);

constexpr Command kCommands[] = {
    COMMAND(kEncoder, ENC_IOC_SET_SCALE, kPair, {kLast, 0}),
    COMMAND(kEncoder, ENC_IOC_SET_INTERVAL, sizeof(driver::Interval), {kLast, 0, 0}),
    COMMAND(kEncoder, ENC_IOC_SET_GOP, kPair, {kLast, 0}),
    COMMAND(kEncoder, ENC_IOC_SET_QP, kPair, {kLast, 0}),
    COMMAND(kEncoder, ENC_IOC_GET_SCALE, kPair, {kLast}),
    COMMAND(kEncoder, ENC_IOC_GET_INTERVAL, sizeof(driver::Interval), {kLast}),
    COMMAND(kEncoder, ENC_IOC_GET_GOP, kPair, {kLast}),
    COMMAND(kEncoder, ENC_IOC_GET_QP, kPair, {kLast}),
    COMMAND(kEncoder, ENC_IOC_MPEG4_DONE, kNone, {}),
    COMMAND(kEncoder, ENC_IOC_CHANNEL_NUMBER_ON, kWord, {kLast}, driver::ENC_IOC_CHANNEL_NUMBER_OFF),
    COMMAND(kEncoder, ENC_IOC_CHANNEL_NUMBER_OFF, kWord, {kLast}),
    COMMAND(kEncoder, ENC_IOC_WRITE_REG, kPair, {driver::kRegMjpegQuality, driver::kMjpegFine}),
    COMMAND(kEncoder, ENC_IOC_MPEG4_REQUEST, kNone, {}),
    COMMAND(kEncoder, ENC_IOC_STOP, kNone, {}),
    COMMAND(kEncoder, ENC_IOC_SET_STANDARD, kWord, {VIDEO_STANDARD_ZV_NTSC}),
    COMMAND(kEncoder, ENC_IOC_START, kNone, {}, driver::ENC_IOC_STOP),
    COMMAND(kEncoder, ENC_IOC_SET_CBR, sizeof(driver::Cbr), {kLast, 0, 0}),
    COMMAND(kEncoder, ENC_IOC_SET_QP_RANGE, sizeof(driver::QpRange), {kLast, 0, 0, 0}),
    COMMAND(kDisplay, DISP_IOC_BEGIN_UPDATE, kNone, {}, driver::DISP_IOC_END_UPDATE),
    COMMAND(kDisplay, DISP_IOC_END_UPDATE, kNone, {}),
    COMMAND(kDisplay, DISP_IOC_SET_WINDOW, sizeof(ZV_DISPLAY_WINDOW), {kLast, kLast}),
    COMMAND(kDisplay, DISP_IOC_SET_ZOOM, sizeof(driver::Zoom), {}),
    COMMAND(kDisplay, DISP_IOC_SET_SOURCE_CFG, kWord, {}),
    COMMAND(kDisplay, DISP_IOC_SET_GRID, sizeof(driver::Grid), {}),
    COMMAND(kDisplay, DISP_IOC_SET_RECT, sizeof(driver::FrameRect), {driver::kPipFrame}),
    COMMAND(kDisplay, DISP_IOC_MOTION_TRACE_ON, kNone, {}, driver::DISP_IOC_MOTION_TRACE_OFF),
    COMMAND(kDisplay, DISP_IOC_MOTION_TRACE_OFF, kNone, {}),
    COMMAND(kDisplay, DISP_IOC_GET_WIDTH, kWord, {}),
    COMMAND(kDisplay, DISP_IOC_GET_HEIGHT, kWord, {}),
    COMMAND(kDisplay, DISP_IOC_SET_STANDARD, kWord, {VIDEO_STANDARD_ZV_NTSC}),
    COMMAND(kDisplay, DISP_IOC_READ_REG, kPair, {driver::kRegDisplayState}),
    COMMAND(kDisplay, DISP_IOC_WRITE_REG, kPair, {driver::kRegMjpegQuality, driver::kMjpegFine}),
    COMMAND(kDisplay, DISP_IOC_PREVIEW_ON, kNone, {}, driver::DISP_IOC_PREVIEW_OFF),
    COMMAND(kDisplay, DISP_IOC_PREVIEW_OFF, kNone, {}),
    COMMAND(kDisplay, DISP_IOC_GET_MOTION, kWord, {}),
    COMMAND(kDisplay, DISP_IOC_SELECT_BUFFER, kWord, {driver::kPreviewBuffers - 1}),
    COMMAND(kVideoInput, VIN_IOC_SET_MASK, sizeof(driver::Mask), {kLast, 0, 0, 0, 0}),
    COMMAND(kVideoInput, VIN_IOC_SET_STANDARD, kWord, {VIDEO_STANDARD_ZV_NTSC}),
    COMMAND(kVideoInput, VIN_IOC_READ_REG, kPair, {driver::kRegRouting}),
    COMMAND(kVideoInput, VIN_IOC_WRITE_REG, kPair, {driver::kRegPrivacyMask + 4 * kLast, 0}),
    COMMAND(kVideoInput, VIN_IOC_READ_TW2815, sizeof(driver::DecoderRegister), {0x00005A00}),
    COMMAND(kVideoInput, VIN_IOC_WRITE_TW2815, sizeof(driver::DecoderRegister), {0x00007200}),
    COMMAND(kVideoInput, VIN_IOC_SET_WIDTH, kWord, {720}),
    COMMAND(kVideoInput, VIN_IOC_BOARD_CMD, sizeof(driver::BoardCommand), {driver::kBoardVersion}),
    COMMAND(kVideoInput, VIN_IOC_GET_MOTION_LEVELS, sizeof(driver::MotionLevels), {}),
};

/// Memory whose end nobody may pass: the next page cannot be accessed.
class GuardedRecord {
 public:
  GuardedRecord(const void *record, std::size_t size)
      : page_(static_cast<std::size_t>(sysconf(_SC_PAGESIZE))) {
    memory_ = static_cast<u8 *>(
        mmap(nullptr, 2 * page_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    if (memory_ == MAP_FAILED) throw std::bad_alloc();
    mprotect(memory_ + page_, page_, PROT_NONE);
    record_ = memory_ + page_ - size;
    std::memcpy(record_, record, size);
  }
  ~GuardedRecord() { munmap(memory_, 2 * page_); }
  GuardedRecord(const GuardedRecord &) = delete;
  GuardedRecord &operator=(const GuardedRecord &) = delete;
  void *record() const { return record_; }

 private:
  std::size_t page_;
  u8 *memory_;
  u8 *record_;
};

Result accepts(Bench &bench, const Command &command) {
  const Nodes &nodes = bench.nodes();
  bench.touch_layout();
  const GuardedRecord guarded(command.record.data(), command.size);
  const int error =
      nodes.issue(command.node, command.code, command.size == kNone ? nullptr : guarded.record());
  u32 channel = kLast;
  if (command.undo != 0) nodes.issue(command.node, command.undo, &channel);
  return expect(error == 0, "success", error_name(error));
}

constexpr u32 kSide = driver::kMotionMapSide;

Result accepts_motion_map(Bench &bench) {
  const std::vector<u16> thresholds(std::size_t{kSide} * kSide, 7);
  const driver::MotionMap map{kLast, 0, 0, kSide, kSide, thresholds.data()};
  const GuardedRecord guarded(&map, sizeof map);
  const int error = bench.nodes().issue(kVideoInput, driver::VIN_IOC_SET_MOTION_MAP, guarded.record());
  return expect(error == 0, "success", error_name(error));
}

/// The driver takes the pointer from where this machine's compiler puts it.
Result motion_map_layout(Bench &bench) {
  driver::MotionLevels levels{};
  bench.nodes().issue(kVideoInput, driver::VIN_IOC_GET_MOTION_LEVELS, &levels);
  const auto level = static_cast<u16>(levels.level[kLast] ^ 0x1234);  // another one than now
  const std::vector<u16> thresholds(std::size_t{kSide} * kSide, level);
  driver::MotionMap map{kLast, 0, 0, kSide, kSide, thresholds.data()};
  const int error = bench.nodes().issue(kVideoInput, driver::VIN_IOC_SET_MOTION_MAP, &map);
  if (error != 0) return broken("success", error_name(error));
  bench.nodes().issue(kVideoInput, driver::VIN_IOC_GET_MOTION_LEVELS, &levels);
  return expect(levels.level[kLast] == level, words("level ", level, " of channel 16"), levels.level[kLast]);
}

Result motion_levels_size(Bench &bench) {
  constexpr u16 kUntouched = 0xA5C3;
  driver::MotionLevels levels{};
  for (u16 &level : levels.level) level = kUntouched;
  const int error = bench.nodes().issue(kVideoInput, driver::VIN_IOC_GET_MOTION_LEVELS, &levels);
  if (error != 0) return broken("success", error_name(error));
  unsigned untouched = 0;
  for (const u16 level : levels.level) untouched += level == kUntouched ? 1 : 0;
  return expect(untouched == 0, "16 levels, 32 bytes", 16 - untouched, " levels");
}

Result maps_stream(Bench &bench) {
  const Mapping whole(bench.nodes().fd(kEncoder), driver::kStreamRegionSize, PROT_READ | PROT_WRITE);
  if (whole.bytes() == nullptr) return broken("0x200000 bytes can be mapped", error_name(whole.error()));
  u8 *const last = whole.bytes() + driver::kStreamRegionSize - 1;
  *last = 0x5A;
  return expect(*last == 0x5A, "the last byte can be written", "it cannot");
}

Result refuses_mapping(Bench &bench, Node node, std::size_t size, int protection) {
  const Mapping mapping(bench.nodes().fd(node), size, protection);
  return expect(mapping.bytes() == nullptr, "the mapping is refused", "it succeeds");
}

Result maps_preview(Bench &bench, u32 buffer) {
  const Nodes &nodes = bench.nodes();
  u32 index = buffer;
  if (const int error = nodes.issue(kDisplay, driver::DISP_IOC_SELECT_BUFFER, &index))
    return broken("DISP_IOC_SELECT_BUFFER succeeds", error_name(error));
  const Mapping mapping(nodes.fd(kDisplay), driver::kPreviewBufferSize, PROT_READ);
  if (mapping.bytes() == nullptr) return broken("0x240000 bytes can be mapped", error_name(mapping.error()));
  volatile const u8 *const bytes = mapping.bytes();
  (void)bytes[driver::kPreviewBufferSize - 1];
  return held();
}

constexpr const char *kNoMap = "The SDK cannot open the card (status 3).";
constexpr const char *kUnsafe = "A wrong program can damage the card's memory.";

void add_regions(Checks &checks) {
  checks.push_back({"boundary.region.stream", "The stream region has 0x200000 bytes, to read and write.",
                    kNoMap, true, maps_stream});
  for (u32 n = 0; n < driver::kPreviewBuffers; ++n)
    checks.push_back({words("boundary.region.preview-", n), "The preview buffer has 0x240000 bytes, to read.",
                      kNoMap, true, [n](Bench &bench) { return maps_preview(bench, n); }});
  struct Refused {
    const char *name;
    const char *proves;
    Node node;
    std::size_t size;
    int protection;
  };
  constexpr Refused kRefused[] = {
      {"stream-too-large", "More than the stream region cannot be mapped.", kEncoder,
       2 * driver::kStreamRegionSize, PROT_READ | PROT_WRITE},
      {"preview-too-large", "More than a preview buffer cannot be mapped.", kDisplay,
       8 * driver::kPreviewBufferSize, PROT_READ},
      {"preview-writable", "A preview buffer cannot be mapped for writing.", kDisplay,
       driver::kPreviewBufferSize, PROT_READ | PROT_WRITE},
      {"audio", "The audio node has no region.", kAudio, 4096, PROT_READ},
      {"video-input", "The video-input node has no region.", kVideoInput, 4096, PROT_READ},
  };
  for (const Refused &row : kRefused)
    checks.push_back(
        {words("boundary.region.", row.name, "-is-refused"), row.proves, kUnsafe, true,
         [row](Bench &bench) { return refuses_mapping(bench, row.node, row.size, row.protection); }});
}

}  // namespace

void add_boundary(Checks &checks) {
  for (const Command &command : kCommands)
    checks.push_back({words("boundary.accepts.", command.name),
                      "The command succeeds and touches no byte behind its record.",
                      "The SDK ignores most refused commands: what the command sets does not change.", true,
                      [&command](Bench &bench) { return accepts(bench, command); }});
  checks.push_back({"boundary.accepts.VIN_IOC_SET_MOTION_MAP",
                    "The command succeeds and touches no byte behind its record.",
                    "Motion thresholds cannot be set (status 16).", true, accepts_motion_map});
  checks.push_back(
      {"boundary.motion-map.pointer",
       "The driver reads the pointer in a motion map at the offset that this machine's compiler gives it.",
       "Motion detection uses random thresholds.", true, motion_map_layout});
  checks.push_back({"boundary.motion-levels.size",
                    "Motion levels have 32 bytes, although the command code says 2.",
                    "A program sees wrong motion thresholds after a start.", true, motion_levels_size});
  add_regions(checks);
}

}  // namespace contract

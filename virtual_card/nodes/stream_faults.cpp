// The table of stream faults, and what each does to a frame.
#include "stream_faults.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string_view>

namespace virtual_card {
namespace {

using std::chrono::nanoseconds;
using Bytes = std::vector<std::uint8_t>;

constexpr unsigned kMpeg4 = 1u << static_cast<unsigned>(StreamKind::mpeg4);
constexpr unsigned kMjpeg = 1u << static_cast<unsigned>(StreamKind::mjpeg);
constexpr unsigned kAudio = 1u << static_cast<unsigned>(StreamKind::audio);
constexpr unsigned kPreview = 1u << static_cast<unsigned>(StreamKind::preview);
constexpr unsigned kVideo = kMpeg4 | kMjpeg;
constexpr unsigned kFrames = kVideo | kAudio;
constexpr unsigned kAll = kFrames | kPreview;
constexpr long kHugeResult = 0x1000000;

u32 word_at(const Bytes &bytes, std::size_t offset) {
  u32 word = 0;
  if (offset + sizeof word <= bytes.size()) std::memcpy(&word, bytes.data() + offset, sizeof word);
  return word;
}

void put_word(Bytes &bytes, std::size_t offset, u32 word) {
  if (offset + sizeof word <= bytes.size()) std::memcpy(bytes.data() + offset, &word, sizeof word);
}

/// The part of a frame in front of its data.
std::size_t descriptor_size(const Passing &passing) {
  switch (passing.stream) {
    case StreamKind::mpeg4:
      return driver::kMpeg4DescriptorSize;
    case StreamKind::mjpeg:
      return driver::kMjpegDescriptorSize;
    default:
      return 0;
  }
}

driver::Mpeg4Head head(const Passing &passing) {
  return driver::unpacked_head(word_at(passing.frame.area, 0));
}

void put_head(Passing &passing, driver::Mpeg4Head head) {
  put_word(passing.frame.area, 0, driver::packed_head(head));
}

bool at_nth(std::int64_t n, const FaultMemory &memory) {
  return memory.frames % static_cast<std::uint64_t>(n) == 0;
}

std::size_t random_below(std::size_t limit, FaultMemory &memory) {
  return std::uniform_int_distribution<std::size_t>(0, limit - 1)(memory.random);
}

bool hold_stalled(nanoseconds, nanoseconds, std::int64_t) {
  return true;
}

bool hold_late(nanoseconds taken, nanoseconds now, std::int64_t milliseconds) {
  return now < taken + std::chrono::milliseconds{milliseconds};
}

bool hold_burst(nanoseconds taken, nanoseconds now, std::int64_t milliseconds) {
  const nanoseconds period = std::chrono::milliseconds{milliseconds};
  return taken / period == now / period;
}

void drop(Passing &passing, std::int64_t n, FaultMemory &memory) {
  if (at_nth(n, memory)) passing.copies = 0;
}

void repeat(Passing &passing, std::int64_t n, FaultMemory &memory) {
  if (at_nth(n, memory)) passing.copies = 2;
}

void tear(Passing &passing, std::int64_t n, FaultMemory &memory) {
  Bytes &area = passing.frame.area;
  const std::size_t first = descriptor_size(passing);
  if (!at_nth(n, memory) || area.size() <= first + 1) return;
  area.resize(first + 1 + random_below(area.size() - first - 1, memory));
  passing.frame.result = static_cast<long>(area.size());
  if (passing.stream != StreamKind::mpeg4) return;
  driver::Mpeg4Head cut = head(passing);
  cut.length = static_cast<u32>(area.size() - first);
  put_head(passing, cut);
}

void flip_bits(Passing &passing, std::int64_t bits, FaultMemory &memory) {
  Bytes &area = passing.frame.area;
  const std::size_t first = descriptor_size(passing);
  if (area.size() <= first) return;
  for (std::int64_t n = 0; n < bits; ++n) {
    const std::size_t bit = random_below((area.size() - first) * 8, memory);
    area[first + bit / 8] ^= static_cast<std::uint8_t>(1u << bit % 8);
  }
}

void make_long(Passing &passing, std::int64_t, FaultMemory &) {
  driver::Mpeg4Head longest = head(passing);
  longest.length = driver::kMpeg4LengthMask;
  put_head(passing, longest);
}

void make_empty(Passing &passing, std::int64_t, FaultMemory &) {
  if (passing.stream == StreamKind::mpeg4) {
    driver::Mpeg4Head none = head(passing);
    none.length = 0;
    put_head(passing, none);
  } else {
    passing.frame.result = static_cast<long>(descriptor_size(passing));
  }
}

void move_channel(Passing &passing, std::int64_t channel, FaultMemory &) {
  const auto wrong = static_cast<u32>(channel - 1);
  if (passing.stream == StreamKind::mpeg4) {
    driver::Mpeg4Head other = head(passing);
    other.channel = wrong;
    put_head(passing, other);
  } else {
    put_word(passing.frame.area, offsetof(driver::MjpegDescriptor, channel), wrong);
  }
}

void change_type(Passing &passing, std::int64_t type, FaultMemory &) {
  driver::Mpeg4Head other = head(passing);
  other.type = static_cast<u32>(type);
  put_head(passing, other);
}

void move_time(Passing &passing, std::int64_t seconds) {
  Bytes &area = passing.frame.area;
  put_word(area, driver::kMpeg4TimeSeconds,
           word_at(area, driver::kMpeg4TimeSeconds) + static_cast<u32>(seconds));
}

void move_time_ahead(Passing &passing, std::int64_t seconds, FaultMemory &) {
  move_time(passing, seconds);
}

void move_time_back(Passing &passing, std::int64_t seconds, FaultMemory &) {
  move_time(passing, -seconds);
}

void drop_intra(Passing &passing, std::int64_t, FaultMemory &) {
  if (head(passing).type == 0) passing.copies = 0;
}

void spoil_eoi(Passing &passing, std::int64_t, FaultMemory &) {
  if (passing.frame.area.size() > descriptor_size(passing)) passing.frame.area.back() = 0;
}

void make_oversize(Passing &passing, std::int64_t, FaultMemory &) {
  passing.frame.result = kHugeResult;
}

void make_negative(Passing &passing, std::int64_t, FaultMemory &) {
  passing.frame.result = -EIO;
}

void shorten(Passing &passing, std::int64_t bytes, FaultMemory &) {
  passing.frame.area.resize(std::min(passing.frame.area.size(), static_cast<std::size_t>(bytes)));
  passing.frame.result = static_cast<long>(passing.frame.area.size());
}

void change_index(Passing &passing, std::int64_t index, FaultMemory &) {
  put_word(passing.frame.area, 0, static_cast<u32>(index));
}

void freeze_index(Passing &passing, std::int64_t, FaultMemory &memory) {
  if (!memory.frozen) memory.frozen = word_at(passing.frame.area, 0);
  put_word(passing.frame.area, 0, *memory.frozen);
}

constexpr std::int64_t kMaxCount = 1'000'000;
constexpr std::int64_t kMaxHold = 60'000;
constexpr const char *kNth = "every how many frames";
constexpr const char *kMilliseconds = "milliseconds of card time";
constexpr const char *kSeconds = "seconds";

constexpr StreamFaultRow kRows[] = {
    {"stall", kAll, nullptr, 0, 0, "no frame comes; the queue fills and frames are lost", hold_stalled, {}},
    {"late", kFrames, kMilliseconds, 1, kMaxHold, "each frame comes later", hold_late, {}},
    {"burst", kFrames, kMilliseconds, 1, kMaxHold, "frames are held, then come all at once", hold_burst, {}},
    {"queue", kFrames, "frames", 1, kMaxCount, "the queue holds at most this number of frames", {}, {}},
    {"drop", kFrames, kNth, 1, kMaxCount, "every n-th frame is missing", {}, drop},
    {"twice", kFrames, kNth, 1, kMaxCount, "every n-th frame comes twice", {}, repeat},
    {"torn", kFrames, kNth, 1, kMaxCount, "every n-th frame is cut at a random place", {}, tear},
    {"bits",
     kFrames,
     "bits",
     1,
     kMaxCount,
     "this number of random bits in the data of each frame is wrong",
     {},
     flip_bits},
    {"nointra", kMpeg4, nullptr, 0, 0, "intra frames are missing", {}, drop_intra},
    {"noeoi", kMjpeg, nullptr, 0, 0, "the EOI marker at the end of a picture is missing", {}, spoil_eoi},
    {"type", kMpeg4, "type 0-3", 0, 3, "each frame claims this type; 0 is intra", {}, change_type},
    {"channel", kVideo, "channel 1-16", 1, 16, "each frame claims this channel", {}, move_channel},
    {"foreign",
     kMjpeg,
     "channel above 16",
     17,
     65536,
     "each frame claims a channel that does not exist",
     {},
     move_channel},
    {"ahead", kMpeg4, kSeconds, 1, kMaxCount, "time stamps jump ahead", {}, move_time_ahead},
    {"back", kMpeg4, kSeconds, 1, kMaxCount, "time stamps jump back", {}, move_time_back},
    {"long", kMpeg4, nullptr, 0, 0, "the length in the descriptor is larger than the area", {}, make_long},
    {"empty",
     kAll,
     nullptr,
     0,
     0,
     "frames without data; the preview and audio reads return 0",
     {},
     make_empty},
    {"oversize", kAll, nullptr, 0, 0, "a read returns more than was asked for", {}, make_oversize},
    {"negative", kAll, nullptr, 0, 0, "a read fails with EIO", {}, make_negative},
    {"short", kAudio, "bytes 1-191", 1, 191, "an audio read returns only this number of bytes", {}, shorten},
    {"index",
     kPreview,
     "index above 3",
     4,
     0xFFFFFFFF,
     "a preview read returns the index of a buffer that does not exist",
     {},
     change_index},
    {"frozen", kPreview, nullptr, 0, 0, "each preview read returns the same buffer index", {}, freeze_index},
};
static_assert(std::size(kRows) == kStreamFaults);

constexpr std::size_t row_named(std::string_view name) {
  for (std::size_t row = 0; row < kStreamFaults; ++row)
    if (name == kRows[row].name) return row;
  return kStreamFaults;
}
constexpr std::size_t kStall = row_named("stall");
constexpr std::size_t kQueue = row_named("queue");
static_assert(kStall < kStreamFaults && kQueue < kStreamFaults);

}  // namespace

std::span<const StreamFaultRow, kStreamFaults> stream_fault_rows() {
  return kRows;
}

void StreamFaults::set(const FaultAmounts &amounts, u32 seed) {
  if (amounts == amounts_ && seed == seed_) return;
  if (!any()) memory_ = {0, std::minstd_rand{seed + static_cast<u32>(stream_)}, {}};
  amounts_ = amounts;
  seed_ = seed;
  memory_.frozen.reset();
}

bool StreamFaults::held(nanoseconds taken, nanoseconds now) const {
  for (std::size_t row = 0; row < kStreamFaults; ++row)
    if (amounts_[row] && kRows[row].hold != nullptr && kRows[row].hold(taken, now, *amounts_[row]))
      return true;
  return false;
}

void StreamFaults::change(Passing &passing) {
  ++memory_.frames;
  for (std::size_t row = 0; row < kStreamFaults; ++row)
    if (amounts_[row] && kRows[row].change != nullptr) kRows[row].change(passing, *amounts_[row], memory_);
}

bool StreamFaults::holds() const {
  for (std::size_t row = 0; row < kStreamFaults; ++row)
    if (amounts_[row] && kRows[row].hold != nullptr) return true;
  return false;
}

bool StreamFaults::stalled() const {
  return amounts_[kStall].has_value();
}

std::optional<std::int64_t> StreamFaults::queue_limit() const {
  return amounts_[kQueue];
}

}  // namespace virtual_card

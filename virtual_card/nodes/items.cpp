// The table of items: names, possible values and effects.
#include "items.h"

#include <algorithm>
#include <cstring>

#include "commands.h"
#include "item_values.h"
#include "picture/film.h"

namespace virtual_card {
namespace {

/// Reads a value. Returns an empty function for an invalid value; `reason` can then say why.
using Reader = Effect (*)(std::string_view value, std::string &reason);

struct ItemRow {
  const char *name;
  const char *usage;  ///< what follows the name
  const char *values;
  const char *effect;
  Reader read;
  bool power_up = false;
};

template <typename Change>
Effect changing(Change change) {
  return [change](Conditions &conditions, PowerUp &) { change(conditions); };
}

template <u32 Conditions::*Mask, unsigned Count>
Effect read_mask(std::string_view value, std::string &) {
  const auto mask = mask_in(value, Count);
  if (!mask) return {};
  return changing([bits = *mask](Conditions &conditions) { conditions.*Mask |= bits; });
}

template <bool Conditions::*Flag>
Effect read_flag(std::string_view value, std::string &) {
  if (!value.empty()) return {};
  return changing([](Conditions &conditions) { conditions.*Flag = true; });
}

template <std::set<u32> Conditions::*Set>
Effect read_register(std::string_view value, std::string &) {
  const auto address = address_in(value);
  if (!address) return {};
  return changing([at = *address](Conditions &conditions) { (conditions.*Set).insert(at); });
}

template <std::string PowerUp::*Path>
Effect read_path(std::string_view value, std::string &) {
  if (value.empty()) return {};
  return [path = std::string(value)](Conditions &, PowerUp &power_up) { power_up.*Path = path; };
}

Effect read_flicker(std::string_view value, std::string &) {
  constexpr u32 kMaxFields = 100'000;
  const auto [channels, fields] = split(value, ':');
  const auto mask = mask_in(channels, kChannels);
  const auto period = number_in(fields, 1u, kMaxFields);
  if (!mask || !period) return {};
  return changing([bits = *mask, length = *period](Conditions &conditions) {
    conditions.flicker |= bits;
    conditions.flicker_fields = length;
  });
}

Effect read_speed(std::string_view value, std::string &) {
  const auto speed = number_in(value, 0.01, 1000.0);
  if (!speed) return {};
  return [factor = *speed](Conditions &, PowerUp &power_up) { power_up.speed = factor; };
}

Effect read_seed(std::string_view value, std::string &) {
  const auto seed = number_in(value, 0u, ~0u);
  if (!seed) return {};
  return changing([number = *seed](Conditions &conditions) { conditions.seed = number; });
}

Effect read_slow(std::string_view value, std::string &) {
  const auto delay = number_in(value, 1, 10'000);
  if (!delay) return {};
  return changing(
      [ms = *delay](Conditions &conditions) { conditions.delay = std::chrono::milliseconds{ms}; });
}

Effect read_board(std::string_view value, std::string &) {
  constexpr std::pair<std::string_view, u32> kBoards[] = {{"bb", driver::kBoardVersionReplies[0]},
                                                          {"cc", driver::kBoardVersionReplies[1]},
                                                          {"dd", driver::kBoardVersionReplies[2]}};
  for (const auto &[name, version] : kBoards)
    if (name == value)
      return changing([reply = version](Conditions &conditions) { conditions.board_version = reply; });
  return {};
}

/// Reads e.g. "EIO". Returns 0 for a name that is no error.
int error_number(std::string_view name) {
  constexpr int kLastError = 133;
  for (int error = 1; error <= kLastError; ++error)
    if (const char *known = strerrorname_np(error); known != nullptr && name == known) return error;
  return 0;
}

/// Reads NODE/OPERATION[/COMMAND], e.g. "display/ioctl/DISP_IOC_SET_WINDOW".
bool read_call(std::string_view text, CallFault &fault) {
  const auto [node, rest] = split(text, '/');
  const auto [operation, command] = split(rest, '/');
  const auto device = device_named(node);
  const auto known = operation_named(operation);
  if ((!device && node != "any") || !known) return false;
  fault.device = device.value_or(Device::none);
  fault.operation = *known;
  if (command.empty()) return true;
  const CommandRow *row = command_named(fault.device, command);
  if (fault.operation != Operation::ioctl || row == nullptr) return false;
  fault.code = row->code;
  return true;
}

/// Reads NODE/OPERATION[/COMMAND]:ERROR[:TIMES[:SKIP]], where TIMES can also be "everyN".
Effect read_fail(std::string_view value, std::string &) {
  constexpr std::string_view kEvery = "every";
  constexpr std::uint64_t kMax = 1'000'000'000;
  const auto fault = std::make_shared<CallFault>();
  const auto [call, rest] = split(value, ':');
  const auto [error, counts] = split(rest, ':');
  const auto [times, skip] = split(counts, ':');
  fault->error = error_number(error);
  if (!read_call(call, *fault) || fault->error == 0) return {};
  const bool every = times.substr(0, kEvery.size()) == kEvery;
  if (!times.empty()) {
    const auto number = number_in(every ? times.substr(kEvery.size()) : times, std::uint64_t{1}, kMax);
    if (!number) return {};
    (every ? fault->every : fault->times) = *number;
  }
  if (!skip.empty()) {
    const auto number = number_in(skip, std::uint64_t{0}, kMax);
    if (!number) return {};
    fault->skip = *number;
  }
  return changing([fault](Conditions &conditions) { conditions.failing.push_back(fault); });
}

constexpr const char *kChannelList = "channels 1-16, e.g. 3,7 or 1-4";
constexpr const char *kRegister = "a register address, e.g. 0x310";
constexpr const char *kNoValue = "no value";

constexpr ItemRow kRows[] = {
    {"lost", "=CHANNELS", kChannelList,
     "no signal: a blue picture, no motion, the decoder's video bit is clear",
     read_mask<&Conditions::lost, kChannels>},
    {"flicker", "=CHANNELS:FIELDS", "channels 1-16 and a number of fields, e.g. 3:10",
     "the signal goes and comes back, each time for this number of fields", read_flicker},
    {"black", "=CHANNELS", kChannelList, "a black picture, as from a covered lens",
     read_mask<&Conditions::black, kChannels>},
    {"still", "=CHANNELS", kChannelList, "bars and the number; nothing moves",
     read_mask<&Conditions::still, kChannels>},
    {"silent", "=INPUTS", "audio inputs 1-4, e.g. 2 or 1-3", "silence; the decoder's audio bit is clear",
     read_mask<&Conditions::silent, kAudioInputs>},
    {"fail", "=NODE/OPERATION[/COMMAND]:ERROR[:TIMES[:SKIP]]",
     "a node (encoder, display, audio, video_input, any), an operation (open, close, ioctl, read, mmap, "
     "munmap), "
     "a command name, an error name, how often (a number, or everyN), and how many calls pass before; e.g. "
     "display/ioctl/DISP_IOC_SET_WINDOW:EIO:3",
     "the call fails with this error, for good unless a number of times is given", read_fail},
    {"slow", "=MILLISECONDS", "milliseconds 1-10000", "each call on a node takes longer by this time",
     read_slow},
    {"vanish", "", kNoValue, "the card is pulled out: opens and reads fail with ENODEV",
     read_flag<&Conditions::vanished>},
    {"absent", "", kNoValue, "opening a node fails with ENOENT, as without a card",
     read_flag<&Conditions::absent>},
    {"nowait", "", kNoValue, "reads of an empty stream return at once", read_flag<&Conditions::nowait>},
    {"stuck", "=ADDRESS", kRegister, "writes of this register have no effect",
     read_register<&Conditions::stuck>},
    {"garbage", "=ADDRESS", kRegister, "this register reads as random values",
     read_register<&Conditions::garbage>},
    {"noreply", "", kNoValue, "the board controller replies 0 and does nothing",
     read_flag<&Conditions::board_mute>},
    {"wrongreply", "", kNoValue, "the board controller sends a wrong reply and does nothing",
     read_flag<&Conditions::board_wrong>},
    {"bite", "", kNoValue, "a running watchdog runs out although it is fed",
     read_flag<&Conditions::watchdog_bites>},
    {"board", "=VERSION", "bb, cc or dd", "the version that the board controller reports", read_board},
    {"seed", "=NUMBER", "a number from 0 to 4294967295", "the start of all random values", read_seed},
    {"speed", "=FACTOR", "a number from 0.01 to 1000", "card time runs this many times as fast as real time",
     read_speed, true},
    {"log", "=FILE", "a regular file, or /dev/stderr", "writes a line for each call on a node",
     read_path<&PowerUp::log_file>, true},
    {"state", "=FILE", "a regular file, or none yet", "keeps registers and settings from program to program",
     read_path<&PowerUp::state_file>, true},
    {"control", "=SOCKET", "a path for a UNIX socket", "zarvo_card can change and watch the card",
     read_path<&PowerUp::control_socket>, true},
};

constexpr std::string_view kCamera = "camera";
constexpr const char *kCameraValues =
    "camera number 1-16 and a regular file that libavformat reads as video, e.g. camera3=/path/clip.mp4";

Effect read_camera(unsigned number, std::string_view path, std::string &reason) {
  if (!Film::open(std::string(path), &reason)) return {};
  return changing([channel = number - 1, file = std::string(path)](Conditions &conditions) {
    conditions.films[channel] = file;
  });
}

std::string stream_values(const StreamFaultRow &row) {
  std::string text;
  for (std::size_t n = 0; n < kStreamKinds; ++n)
    if ((row.streams >> n & 1) != 0) text += (text.empty() ? "" : ", ") + std::string(kStreamNames[n]);
  if (row.amount != nullptr) text += "; " + std::string(row.amount);
  return text;
}

/// Reads STREAM[,STREAM...][:AMOUNT].
Effect read_stream_fault(std::size_t index, std::string_view value) {
  const StreamFaultRow &row = stream_fault_rows()[index];
  auto [streams, amount_text] = split(value, ':');
  std::int64_t amount = 1;
  if ((value.find(':') != std::string_view::npos) != (row.amount != nullptr)) return {};
  if (row.amount != nullptr) {
    const auto number = number_in(amount_text, row.min, row.max);
    if (!number) return {};
    amount = *number;
  }
  unsigned mask = 0;
  do {
    const auto [name, rest] = split(streams, ',');
    const auto *const known = std::find(kStreamNames.begin(), kStreamNames.end(), name);
    const auto bit = static_cast<unsigned>(known - kStreamNames.begin());
    if (known == kStreamNames.end() || (row.streams >> bit & 1) == 0) return {};
    mask |= 1u << bit;
    streams = rest;
  } while (!streams.empty());
  return changing([index, mask, amount](Conditions &conditions) {
    for (std::size_t n = 0; n < kStreamKinds; ++n)
      if ((mask >> n & 1) != 0) conditions.streams[n][index] = amount;
  });
}

std::string quoted(std::string_view text) {
  return "\"" + std::string(text) + "\"";
}

std::string possible_names() {
  std::string names = "possible are cameraN";
  for (const ItemRow &row : kRows) names += ", " + std::string(row.name);
  for (const StreamFaultRow &row : stream_fault_rows()) names += ", " + std::string(row.name);
  return names;
}

}  // namespace

std::string parse_item(std::string_view text, Item &item) {
  const auto [name, value] = split(text, '=');
  const bool undo = value.empty() && text.find('=') != std::string_view::npos;
  std::string expected;
  std::string reason;
  item = {std::string(name), {}, false};
  if (name.substr(0, kCamera.size()) == kCamera) {
    const auto number = number_in(name.substr(kCamera.size()), 1u, kChannels);
    if (number && undo) return {};
    expected = kCameraValues;
    if (number && !value.empty()) item.effect = read_camera(*number, value, reason);
  } else if (const auto *const row =
                 std::find_if(std::begin(kRows), std::end(kRows),
                              [name = name](const ItemRow &each) { return each.name == name; });
             row != std::end(kRows)) {
    if (undo && !row->power_up) return {};
    expected = row->values;
    item.power_up = row->power_up;
    item.effect = row->read(value, reason);
  } else {
    const auto rows = stream_fault_rows();
    const auto fault = std::find_if(rows.begin(), rows.end(),
                                    [name = name](const StreamFaultRow &each) { return each.name == name; });
    if (fault == rows.end()) return "item " + quoted(name) + " is unknown; " + possible_names();
    if (undo) return {};
    expected = stream_values(*fault);
    item.effect = read_stream_fault(static_cast<std::size_t>(fault - rows.begin()), value);
  }
  if (item.effect) return {};
  if (!reason.empty()) return "item " + quoted(name) + ": " + reason;
  return "item " + quoted(name) + ": value " + quoted(value) + " is wrong; expected: " + expected;
}

std::vector<ItemText> item_texts() {
  std::vector<ItemText> texts;
  texts.push_back(
      {"cameraN=FILE", kCameraValues, "the camera shows a video file instead of the drawn picture"});
  for (const ItemRow &row : kRows)
    texts.push_back({std::string(row.name) + row.usage, row.values, row.effect});
  for (const StreamFaultRow &row : stream_fault_rows())
    texts.push_back({std::string(row.name) + (row.amount != nullptr ? "=STREAM:NUMBER" : "=STREAM"),
                     stream_values(row), row.effect});
  return texts;
}

}  // namespace virtual_card

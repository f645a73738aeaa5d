// Reads the options of the environment variable ZARVO_VIRTUAL_CARD.
#include "options.h"

#include <algorithm>
#include <charconv>

namespace virtual_card {
namespace {

/// Sets an option. Returns false when the value is not possible.
using Setter = bool (*)(Options &options, std::string_view value);

struct OptionRow {
  std::string_view name;
  const char *values;  ///< the possible values, for the error text
  Setter set;
};

template <typename Number>
bool to_number(std::string_view text, Number &number) {
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  return error == std::errc{} && end == text.data() + text.size();
}

/// Splits at the first separator. Without a separator the second part is empty.
std::pair<std::string_view, std::string_view> split(std::string_view text, char separator) {
  const auto place = text.find(separator);
  if (place == std::string_view::npos) return {text, {}};
  return {text.substr(0, place), text.substr(place + 1)};
}

/// Converts a list such as "3", "1-4" or "1-4,7" to a mask: numbers from 1 to `count`, bits from 0. Returns
/// false when the list is wrong.
bool to_mask(std::string_view text, unsigned count, u32 &mask) {
  for (bool more = true; more;) {
    more = text.find(',') != std::string_view::npos;
    const auto [item, rest] = split(text, ',');
    const bool range = item.find('-') != std::string_view::npos;
    const auto [first_text, last_text] = split(item, '-');
    unsigned first = 0;
    unsigned last = 0;
    if (!to_number(first_text, first) || !to_number(range ? last_text : first_text, last)) return false;
    if (first < 1 || last < first || last > count) return false;
    for (unsigned number = first; number <= last; ++number) mask |= 1u << (number - 1);
    text = rest;
  }
  return true;
}

template <u32 Options::*Mask, unsigned Count>
bool set_mask(Options &options, std::string_view value) {
  return to_mask(value, Count, options.*Mask);
}

template <bool Options::*Flag>
bool set_flag(Options &options, std::string_view value) {
  options.*Flag = true;
  return value.empty();
}

bool set_speed(Options &options, std::string_view value) {
  constexpr double kSlowest = 0.01;
  constexpr double kFastest = 1000;
  return to_number(value, options.speed) && options.speed >= kSlowest && options.speed <= kFastest;
}

bool set_board(Options &options, std::string_view value) {
  constexpr std::pair<std::string_view, u32> kBoards[] = {{"bb", driver::kBoardVersionReplies[0]},
                                                          {"cc", driver::kBoardVersionReplies[1]},
                                                          {"dd", driver::kBoardVersionReplies[2]}};
  for (const auto &[name, version] : kBoards) {
    if (name != value) continue;
    options.board_version = version;
    return true;
  }
  return false;
}

bool set_log(Options &options, std::string_view value) {
  options.log_file = value;
  return !value.empty();
}

bool set_vanish(Options &options, std::string_view value) {
  const auto [from_text, to_text] = split(value, '-');
  double from = 0;
  double to = 0;
  constexpr double kLongest = 1e6;
  if (!to_number(from_text, from) || !to_number(to_text, to) || from < 0 || to <= from || to > kLongest)
    return false;
  options.vanish_from = nanoseconds{static_cast<std::int64_t>(from * 1e9)};
  options.vanish_to = nanoseconds{static_cast<std::int64_t>(to * 1e9)};
  return true;
}

constexpr OptionRow kOptions[] = {
    {"lost", "channels 1-16, e.g. 3,7 or 1-4", set_mask<&Options::lost, kChannels>},
    {"silent", "audio inputs 1-4, e.g. 2 or 1-3", set_mask<&Options::silent, kAudioInputs>},
    {"still", "channels 1-16, e.g. 3,7 or 1-4", set_mask<&Options::still, kChannels>},
    {"black", "channels 1-16, e.g. 3,7 or 1-4", set_mask<&Options::black, kChannels>},
    {"speed", "a number from 0.01 to 1000", set_speed},
    {"nowait", "no value", set_flag<&Options::nowait>},
    {"absent", "no value", set_flag<&Options::absent>},
    {"board", "bb, cc or dd", set_board},
    {"log", "a file to write", set_log},
    {"vanish", "seconds after power-up, FROM-TO, e.g. 5-8", set_vanish},
};

constexpr std::string_view kCamera = "camera";
constexpr const char *kCameraValues = "camera number 1-16 and a video file, e.g. camera3=/path/clip.mp4";

std::string quoted(std::string_view text) {
  return "\"" + std::string(text) + "\"";
}

std::string possible_names() {
  std::string names = "possible are cameraN";
  for (const OptionRow &row : kOptions) names += ", " + std::string(row.name);
  return names;
}

/// Applies one item. Returns an empty text, or a text that says what is wrong with it.
std::string apply(Options &options, std::string_view item) {
  const auto [name, value] = split(item, '=');
  if (name.substr(0, kCamera.size()) == kCamera) {
    unsigned number = 0;
    if (!to_number(name.substr(kCamera.size()), number) || number < 1 || number > kChannels || value.empty())
      return "option " + quoted(item) + " is wrong; expected: " + kCameraValues;
    options.films[number - 1] = value;
    return {};
  }
  const auto *const row = std::find_if(std::begin(kOptions), std::end(kOptions),
                                       [name = name](const OptionRow &entry) { return entry.name == name; });
  if (row == std::end(kOptions)) return "option " + quoted(name) + " is unknown; " + possible_names();
  if (row->set(options, value)) return {};
  return "option " + quoted(name) + ": value " + quoted(value) + " is wrong; expected: " + row->values;
}

}  // namespace

Options parse_options(std::string_view text) {
  Options options;
  while (!text.empty() && options.error.empty()) {
    const auto [item, rest] = split(text, ';');
    if (!item.empty()) options.error = apply(options, item);
    text = rest;
  }
  return options;
}

}  // namespace virtual_card

// Reads lines of items with their times, and returns the conditions that are in effect at a time.
#include "script.h"

#include <algorithm>

#include "item_values.h"

namespace virtual_card {
namespace {

using std::chrono::nanoseconds;

constexpr const char *kTimes =
    "a time is @FROM-TO, @FROM or @every SECONDS for SECONDS, with a blank and an item behind it";

std::optional<nanoseconds> seconds_in(std::string_view text, double min) {
  constexpr double kLongest = 1e8;
  const auto seconds = number_in(text, min, kLongest);
  if (!seconds) return {};
  return nanoseconds{static_cast<std::int64_t>(*seconds * 1e9)};
}

/// Takes the first word from a text.
std::string_view take_word(std::string_view &text) {
  const auto [word, rest] = split(text, ' ');
  text = trimmed(rest);
  return word;
}

/// Takes the time from the start of an item and returns the period. The text begins behind the '@'.
std::optional<Period> take_period(std::string_view &text, nanoseconds now) {
  constexpr double kShortest = 0.001;
  Period period;
  period.from = now;
  const std::string_view first = take_word(text);
  if (first == "every") {
    const auto every = seconds_in(take_word(text), kShortest);
    const bool has_for = take_word(text) == "for";
    const auto length = seconds_in(take_word(text), kShortest);
    if (!every || !has_for || !length || *length >= *every) return {};
    period.every = *every;
    period.length = *length;
    return period;
  }
  const auto [from_text, to_text] = split(first, '-');
  const auto from = seconds_in(from_text, 0);
  if (!from) return {};
  period.from = now + *from;
  if (first.find('-') == std::string_view::npos) return period;
  const auto to = seconds_in(to_text, 0);
  if (!to || *to <= *from) return {};
  period.to = now + *to;
  return period;
}

}  // namespace

bool Period::contains(nanoseconds time) const {
  if (time < from) return false;
  if (every == nanoseconds{0}) return time < to;
  return time - from >= every && (time - from) % every < length;
}

nanoseconds Period::next_change(nanoseconds time) const {
  if (time < from) return from;
  if (every == nanoseconds{0}) return time < to ? to : nanoseconds::max();
  const nanoseconds round = from + (time - from) / every * every;
  return contains(time) ? round + length : round + every;
}

std::string Script::add(std::string_view line, nanoseconds now, PowerUp *power_up) {
  std::vector<Entry> added;
  bool reset = false;
  while (!line.empty()) {
    auto [text, rest] = split(line, ';');
    line = rest;
    text = trimmed(text);
    if (text.empty()) continue;
    if (text == "reset") {
      reset = true;
      added.clear();
      continue;
    }
    Entry entry;
    if (text.front() == '@') {
      const std::string_view whole = text;
      text.remove_prefix(1);
      const auto period = take_period(text, now);
      if (!period || text.empty()) return "\"" + std::string(whole) + "\" is wrong; " + kTimes;
      entry.period = *period;
      if (std::string error = parse_item(text, entry.item); !error.empty()) return error;
      if (entry.item.power_up) return "item \"" + entry.item.name + "\" counts at power-up only";
    } else if (std::string error = parse_item(text, entry.item); !error.empty()) {
      return error;
    }
    if (entry.item.power_up && power_up == nullptr)
      return "item \"" + entry.item.name + "\" counts at power-up only";
    added.push_back(std::move(entry));
  }
  std::erase_if(entries_, [&](const Entry &old) {
    return reset || std::any_of(added.begin(), added.end(),
                                [&](const Entry &entry) { return entry.item.name == old.item.name; });
  });
  Conditions unused;
  for (Entry &entry : added) {
    if (!entry.item.effect) continue;
    if (entry.item.power_up)
      entry.item.effect(unused, *power_up);
    else
      entries_.push_back(std::move(entry));
  }
  return {};
}

Conditions Script::conditions(nanoseconds now) const {
  Conditions conditions;
  PowerUp unused;
  for (const Entry &entry : entries_)
    if (entry.period.contains(now)) entry.item.effect(conditions, unused);
  return conditions;
}

nanoseconds Script::next_change(nanoseconds now) const {
  nanoseconds next = nanoseconds::max();
  for (const Entry &entry : entries_) next = std::min(next, entry.period.next_change(now));
  return next;
}

}  // namespace virtual_card

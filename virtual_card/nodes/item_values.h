/**
 * @file item_values.h
 * Reads the values of items: numbers, lists of channels, register addresses.
 */
#ifndef VIRTUAL_CARD_ITEM_VALUES_H
#define VIRTUAL_CARD_ITEM_VALUES_H

#include <charconv>
#include <optional>
#include <string_view>
#include <utility>

#include "zv_type.h"

namespace virtual_card {

/// Splits at the first separator. Without a separator the second part is empty.
inline std::pair<std::string_view, std::string_view> split(std::string_view text, char separator) {
  const auto place = text.find(separator);
  if (place == std::string_view::npos) return {text, {}};
  return {text.substr(0, place), text.substr(place + 1)};
}

inline std::string_view trimmed(std::string_view text) {
  const auto first = text.find_first_not_of(" \t\r\n");
  if (first == std::string_view::npos) return {};
  return text.substr(first, text.find_last_not_of(" \t\r\n") - first + 1);
}

/// Reads a number that is the whole text and lies in the range.
template <typename Number>
std::optional<Number> number_in(std::string_view text, Number min, Number max) {
  Number number{};
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc{} || end != text.data() + text.size() || !(number >= min && number <= max))
    return {};
  return number;
}

/// Converts a list such as "3", "1-4" or "1-4,7" to a mask: numbers from 1 to `count`, bits from 0.
inline std::optional<u32> mask_in(std::string_view text, unsigned count) {
  u32 mask = 0;
  for (bool more = true; more;) {
    more = text.find(',') != std::string_view::npos;
    const auto [item, rest] = split(text, ',');
    const bool range = item.find('-') != std::string_view::npos;
    const auto [first_text, last_text] = split(item, '-');
    const auto first = number_in(first_text, 1u, count);
    const auto last = range ? number_in(last_text, 1u, count) : first;
    if (!first || !last || *last < *first) return {};
    for (unsigned number = *first; number <= *last; ++number) mask |= 1u << (number - 1);
    text = rest;
  }
  return mask;
}

/// Reads a register address, e.g. 0x310.
inline std::optional<u32> address_in(std::string_view text) {
  if (text.substr(0, 2) != "0x") return {};
  u32 address = 0;
  const auto [end, error] = std::from_chars(text.data() + 2, text.data() + text.size(), address, 16);
  if (error != std::errc{} || end != text.data() + text.size()) return {};
  return address;
}

}  // namespace virtual_card

#endif

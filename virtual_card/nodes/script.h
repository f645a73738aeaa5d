/**
 * @file script.h
 * The items that are in effect now, and those that take effect later.
 */
#ifndef VIRTUAL_CARD_SCRIPT_H
#define VIRTUAL_CARD_SCRIPT_H

#include "items.h"

namespace virtual_card {

/// A time in which an item counts, in card time.
struct Period {
  std::chrono::nanoseconds from{0};
  std::chrono::nanoseconds to = std::chrono::nanoseconds::max();
  std::chrono::nanoseconds every{0};   ///< above 0: counts from each multiple of this after `from`
  std::chrono::nanoseconds length{0};  ///< how long it counts each time

  bool contains(std::chrono::nanoseconds time) const;
  /// Returns the first moment after `time` at which contains() can change, or nanoseconds::max().
  std::chrono::nanoseconds next_change(std::chrono::nanoseconds time) const;
};

/// The items of all lines so far.
class Script {
 public:
  /// Adds a line of items, separated by ';'. An item can stand behind a time, counted from `now`:
  /// "@5-8 lost=3", "@12 lost=3", "@every 10 for 0.5 stall=mpeg4". The line replaces what earlier lines said
  /// of the same names; "lost=" only undoes it, and "reset" undoes all items but those of power-up.
  /// Returns an empty text, or what is wrong; then nothing has changed. Items that count at power-up only
  /// need `power_up`.
  std::string add(std::string_view line, std::chrono::nanoseconds now, PowerUp *power_up);

  Conditions conditions(std::chrono::nanoseconds now) const;
  /// Returns the first moment after `now` at which the conditions can change, or nanoseconds::max().
  std::chrono::nanoseconds next_change(std::chrono::nanoseconds now) const;

 private:
  struct Entry {
    Item item;
    Period period;
  };
  std::vector<Entry> entries_;
};

}  // namespace virtual_card

#endif

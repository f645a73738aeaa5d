/**
 * @file items.h
 * The table of items "name=value": everything about the card that people and tests can set up, change or
 * break.
 */
#ifndef VIRTUAL_CARD_ITEMS_H
#define VIRTUAL_CARD_ITEMS_H

#include <functional>
#include <string_view>

#include "conditions.h"

namespace virtual_card {

/// How an item changes the conditions while it is in effect, or the power-up settings.
using Effect = std::function<void(Conditions &, PowerUp &)>;

struct Item {
  std::string name;
  Effect effect;          ///< none: the item undoes earlier items of its name
  bool power_up = false;  ///< the item counts at power-up only
};

/// Reads an item "name=value" or "name". Returns an empty text, or what is wrong and what is possible.
std::string parse_item(std::string_view text, Item &item);

/// Returns the table as text.
std::vector<ItemText> item_texts();

}  // namespace virtual_card

#endif

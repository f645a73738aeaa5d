/**
 * @file options.h
 * What a person can ask of the card through the environment variable ZARVO_VIRTUAL_CARD.
 */
#ifndef VIRTUAL_CARD_OPTIONS_H
#define VIRTUAL_CARD_OPTIONS_H

#include <map>
#include <string_view>

#include "clock.h"

namespace virtual_card {

struct Options {
  u32 lost = 0;    ///< bit n: camera n is unplugged
  u32 silent = 0;  ///< bit n: audio input n is silent
  u32 still = 0;   ///< bit n: nothing moves in front of camera n
  u32 black = 0;   ///< bit n: the lens of camera n is covered
  double speed = 1.0;
  std::map<unsigned, std::string> films;  ///< file in front of a camera
  bool nowait = false;                    ///< reads of an empty stream return at once
  bool absent = false;                    ///< there is no card
  u32 board_version = driver::kBoardVersionReplies[0];
  std::string log_file;
  /// Card time in which opens and reads fail as if the card had been pulled out; empty: never.
  nanoseconds vanish_from{0};
  nanoseconds vanish_to{0};
  std::string error;  ///< what is wrong with the text, empty when nothing is
};

/// Items "name=value" or "name" with ';' between them.
Options parse_options(std::string_view text);

}  // namespace virtual_card

#endif

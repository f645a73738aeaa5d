/**
 * @file options.h
 * The options of the environment variable ZARVO_VIRTUAL_CARD.
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
  u32 still = 0;   ///< bit n: camera n has the scene Scene::still
  u32 black = 0;   ///< bit n: camera n has the scene Scene::black
  double speed = 1.0;
  std::map<unsigned, std::string> films;  ///< by channel: the video file in front of the camera
  bool nowait = false;                    ///< reads of an empty stream return at once
  bool absent = false;                    ///< opening a node fails, as without a card
  u32 board_version = driver::kBoardVersionReplies[0];
  std::string log_file;
  /// Range of card time in which opens and reads fail as if the card were pulled out; never if empty.
  nanoseconds vanish_from{0};
  nanoseconds vanish_to{0};
  std::string error;  ///< what is wrong with the text; empty if it is correct
};

/// Reads items "name=value" or "name", separated by ';'.
Options parse_options(std::string_view text);

}  // namespace virtual_card

#endif

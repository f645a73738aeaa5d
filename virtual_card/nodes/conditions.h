/**
 * @file conditions.h
 * What is set up and what is broken on the card at a moment. The items change it; see items.h.
 */
#ifndef VIRTUAL_CARD_CONDITIONS_H
#define VIRTUAL_CARD_CONDITIONS_H

#include <map>
#include <set>
#include <string>

#include "call_faults.h"
#include "stream_faults.h"

namespace virtual_card {

struct Conditions {
  // Masks: bit n is channel or input n.
  u32 lost = 0;
  u32 black = 0;
  u32 still = 0;
  u32 silent = 0;
  u32 flicker = 0;                        ///< cameras whose signal comes and goes
  u32 flicker_fields = 1;                 ///< fields with a signal, and fields without
  std::map<unsigned, std::string> films;  ///< by channel: the video file in front of the camera

  std::array<FaultAmounts, kStreamKinds> streams{};
  u32 seed = 1;  ///< of the random stream faults and registers

  std::vector<std::shared_ptr<CallFault>> failing;
  std::chrono::milliseconds delay{0};  ///< of each call on a node
  bool nowait = false;                 ///< reads of an empty stream return at once
  bool absent = false;                 ///< opening a node fails, as without a card
  bool vanished = false;               ///< opens and reads fail, as if the card were pulled out
  std::set<u32> stuck;                 ///< registers that keep their value
  std::set<u32> garbage;               ///< registers that read as random values

  u32 board_version = driver::kBoardVersionReplies[0];
  bool board_mute = false;      ///< the board controller replies 0 and does nothing
  bool board_wrong = false;     ///< it replies something else and does nothing
  bool watchdog_bites = false;  ///< the watchdog runs out although it is fed
};

/// What counts at power-up only.
struct PowerUp {
  double speed = 1.0;
  std::string log_file;
  std::string state_file;
  std::string control_socket;
};

}  // namespace virtual_card

#endif

/**
 * @file board_controller.h
 * The board controller: version and watchdog.
 */
#ifndef VIRTUAL_CARD_BOARD_CONTROLLER_H
#define VIRTUAL_CARD_BOARD_CONTROLLER_H

#include <deque>
#include <map>

#include "clock.h"

namespace virtual_card {

/// The board controller: reports the board version and has a watchdog, which on a real board resets the
/// machine when it is not fed in time.
class BoardController {
 public:
  /// Card time from the last feed to the reset of the machine: twice the SDK's feeding interval.
  static constexpr nanoseconds kResetDelay = std::chrono::seconds{60};

  /// Carries out a command and returns the reply; an unknown command gets 0.
  u32 command(u32 command, nanoseconds now);
  void set_version(u32 reply) { version_ = reply; }
  /// Sets what is broken: it replies 0, or something else, and does nothing; its watchdog runs out
  /// although it is fed.
  void set_faults(bool mute, bool wrong, bool bites);
  /// Sets the replies to the next commands with this code. If a reply is not the confirming one, the command
  /// is not carried out.
  void script(u32 command, const std::vector<u32> &replies);

  /// Returns true once when the time of the watchdog has run out, and stops the watchdog.
  bool expired(nanoseconds now);
  bool watchdog_running() const { return running_; }
  std::uint64_t kicks() const { return kicks_; }
  std::uint64_t resets() const { return resets_; }

 private:
  using Action = void (BoardController::*)(nanoseconds now);
  void feed(nanoseconds now);
  void stop(nanoseconds now);

  u32 version_ = driver::kBoardVersionReplies[0];
  std::map<u32, std::deque<u32>> scripts_;
  bool mute_ = false;
  bool wrong_ = false;
  bool bites_ = false;
  bool running_ = false;
  nanoseconds deadline_{0};
  std::uint64_t kicks_ = 0;
  std::uint64_t resets_ = 0;
};

}  // namespace virtual_card

#endif

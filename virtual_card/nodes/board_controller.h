#ifndef VIRTUAL_CARD_BOARD_CONTROLLER_H
#define VIRTUAL_CARD_BOARD_CONTROLLER_H

#include <deque>
#include <map>

#include "clock.h"

namespace virtual_card {

/// The board's small controller: version, and a watchdog that would reset the machine when it is not
/// fed in time.
class BoardController {
 public:
  /// Card time from the last feed to the reset of the machine: twice the SDK's feeding interval.
  static constexpr nanoseconds kResetDelay = std::chrono::seconds{60};

  /// Carries a command out and answers it; commands it does not know answer 0.
  u32 command(u32 command, nanoseconds now);
  void set_version(u32 reply) { version_ = reply; }
  /// The next commands with this code are answered from the list, and carried out only when the reply
  /// is the one that confirms them.
  void script(u32 command, const std::vector<u32> &replies);

  /// True once, when the watchdog has run out.
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
  bool running_ = false;
  nanoseconds deadline_{0};
  std::uint64_t kicks_ = 0;
  std::uint64_t resets_ = 0;
};

}  // namespace virtual_card

#endif

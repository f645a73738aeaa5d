// The board controller: version and watchdog.
#include "board_controller.h"

#include <algorithm>

namespace virtual_card {
namespace {

constexpr u32 kWrongBits = 0x5A;

}  // namespace

u32 BoardController::command(u32 command, nanoseconds now) {
  const struct {
    u32 code;
    u32 reply;
    Action action;
  } commands[] = {{driver::kBoardWatchdogOn, driver::kBoardWatchdogOnReply, &BoardController::feed},
                  {driver::kBoardWatchdogOff, driver::kBoardWatchdogOffReply, &BoardController::stop},
                  {driver::kBoardVersion, version_, nullptr}};
  const auto *const known = std::find_if(std::begin(commands), std::end(commands),
                                         [&](const auto &entry) { return entry.code == command; });
  u32 reply = known == std::end(commands) ? 0 : known->reply;
  if (auto &script = scripts_[command]; !script.empty()) {
    reply = script.front();
    script.pop_front();
  }
  if (wrong_) reply ^= kWrongBits;
  if (mute_) reply = 0;
  if (known != std::end(commands) && known->action != nullptr && reply == known->reply)
    (this->*known->action)(now);
  return reply;
}

void BoardController::script(u32 command, const std::vector<u32> &replies) {
  scripts_[command].assign(replies.begin(), replies.end());
}

void BoardController::set_faults(bool mute, bool wrong, bool bites) {
  mute_ = mute;
  wrong_ = wrong;
  bites_ = bites;
}

bool BoardController::expired(nanoseconds now) {
  if (!running_ || (now < deadline_ && !bites_)) return false;
  running_ = false;
  ++resets_;
  return true;
}

void BoardController::feed(nanoseconds now) {
  running_ = true;
  deadline_ = now + kResetDelay;
  ++kicks_;
}

void BoardController::stop(nanoseconds) {
  running_ = false;
}

}  // namespace virtual_card

// Theme watchdog: the board confirms its commands. Only with --watchdog: a watchdog that is not stopped
// resets the machine.
#include "bench.h"
#include "check.h"

namespace contract {
namespace {

u32 reply_to(const Nodes &nodes, u32 command) {
  driver::BoardCommand record{command, 0};
  nodes.issue(kVideoInput, driver::VIN_IOC_BOARD_CMD, &record);
  return record.reply;
}

/// Stops the watchdog, whatever happens while it exists.
struct Watchdog {
  const Nodes &nodes;
  ~Watchdog() { reply_to(nodes, driver::kBoardWatchdogOff); }
};

Result starts(Bench &bench) {
  const Watchdog watchdog{bench.nodes()};
  const u32 reply = reply_to(bench.nodes(), driver::kBoardWatchdogOn);
  return expect(reply == driver::kBoardWatchdogOnReply, "reply 0xa3", "0x", std::hex, reply);
}

Result is_fed(Bench &bench) {
  const Watchdog watchdog{bench.nodes()};
  for (int time = 1; time <= 5; ++time) {
    const u32 reply = reply_to(bench.nodes(), driver::kBoardWatchdogOn);
    if (reply != driver::kBoardWatchdogOnReply)
      return broken("reply 0xa3 each time", words("0x", std::hex, reply, " at time ", time));
    pause_for(0.1);
  }
  return held();
}

Result stops(Bench &bench) {
  reply_to(bench.nodes(), driver::kBoardWatchdogOn);
  const u32 reply = reply_to(bench.nodes(), driver::kBoardWatchdogOff);
  return expect(reply == driver::kBoardWatchdogOffReply, "reply 0xa5", "0x", std::hex, reply);
}

Result sdk_stops(Bench &bench) {
  HANDLE card = bench.sdk();
  if (const int status = zv_EnableWatchDog(card); status != ZV_OK)
    return broken("zv_EnableWatchDog succeeds", words("status ", status));
  pause_for(0.5);
  const int status = zv_DisableWatchDog(card);
  return expect(status == ZV_OK, "zv_DisableWatchDog succeeds", "status ", status);
}

constexpr const char *kUseless = "The machine is not restarted when it hangs.";
constexpr const char *kReset = "The machine restarts although the program has ended in order.";
constexpr CheckRow kRows[] = {
    {"starts", "The board confirms the start of the watchdog.", kUseless, starts},
    {"fed", "The board confirms each feeding.", kReset, is_fed},
    {"stops", "The board confirms the stop of the watchdog.", kReset, stops},
    {"sdk", "The SDK starts and stops the watchdog.", kReset, sdk_stops},
};

}  // namespace

void add_watchdog(Checks &checks) {
  add_rows(checks, "watchdog", kRows);
}

}  // namespace contract

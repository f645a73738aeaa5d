/**
 * @file watchdog.cpp
 * Starts and stops the hardware watchdog and the thread that feeds it.
 */
#include <time.h>
#include <unistd.h>

#include <cstdint>

#include "command.h"
#include "internal.h"
#include "print.h"
#include "zv_bits.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

Shared<int> zv_watchdog_thread_enable;
Worker zv_watchdog_thread;
void *zv_watchdog_thread_result;

namespace {

constexpr std::int64_t kKickIntervalMs = 30000;  ///< time between two feeds of the board
constexpr useconds_t kFlagPollUs = 5000;         ///< time between two checks of flag and clock
constexpr int kAttempts = 10;

const RunFlag kRunning{zv_watchdog_thread_enable, mutex_watchdog};

/// Repeats a board command until the controller sends the expected reply, at most kAttempts times. `reply`
/// receives the last reply.
bool handshake(const ZV_CARD &card, u32 command, u32 expected, u32 &reply) {
  for (int attempt = 0; attempt < kAttempts; ++attempt) {
    reply = board_command(card, command, 0);
    if (reply == expected) return true;
  }
  return false;
}

bool kick(const ZV_CARD &card, u32 &reply) {
  return handshake(card, driver::kBoardWatchdogOn, driver::kBoardWatchdogOnReply, reply);
}

std::int64_t now_ms() {
  timespec now{};
  clock_gettime(CLOCK_MONOTONIC, &now);
  return std::int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000;
}

/// Feeds the watchdog until the run flag is cleared or the controller does not reply as expected.
void feed(const ZV_CARD &card) {
  std::int64_t next_kick = now_ms() + kKickIntervalMs;
  while (kRunning.is_set()) {
    const std::int64_t now = now_ms();
    if (now < next_kick) {
      usleep(kFlagPollUs);
      continue;
    }
    next_kick = now + kKickIntervalMs;
    write_codec(card, driver::kRegWatchdogTimer, driver::kWatchdogTimerOn);
    u32 reply = 0;
    if (!kick(card, reply)) {
      print("ERROR: Zarvo WatchDog reset failed. code = 0x%x.\n", reply);
      return;
    }
  }
}

void *watchdog_thread(void *argument) {
  const ZV_CARD &card = *static_cast<ZV_CARD *>(argument);
  write_codec(card, driver::kRegWatchdogTimer, driver::kWatchdogTimerOn);
  zv_delay(500);
  u32 reply = 0;
  if (kick(card, reply)) {
    if (void *failure = make_cancellable()) return failure;
    feed(card);
  } else {
    print("ERROR: Zarvo WatchDog init failed. code = 0x%x\n", reply);
  }
  kRunning.exchange(0);
  board_command(card, driver::kBoardWatchdogOff, 0);
  write_codec(card, driver::kRegWatchdogTimer, 0);
  return nullptr;
}

int enable_watchdog(ZV_CARD &card) {
  if (kRunning.exchange(1) != 0) return ZV_OK;
  if (zv_watchdog_thread.start(watchdog_thread, &card)) return ZV_OK;
  kRunning.exchange(0);
  return ZV_ERR_THREAD_CREATE;
}

int disable_watchdog(ZV_CARD &card) {
  if (kRunning.exchange(0) == 0) return ZV_OK;
  if (!zv_watchdog_thread.join(zv_watchdog_thread_result)) return ZV_ERR_THREAD_JOIN;
  write_codec(card, driver::kRegWatchdogTimer, 0);
  u32 reply = 0;
  return handshake(card, driver::kBoardWatchdogOff, driver::kBoardWatchdogOffReply, reply) ? ZV_OK
                                                                                           : ZV_ERR_DEVICE;
}

}  // namespace

bool join_watchdog() {
  kRunning.exchange(0);
  return zv_watchdog_thread.join(zv_watchdog_thread_result);
}

}  // namespace zarvo

using namespace zarvo;

int zv_EnableWatchDog(HANDLE handle) {
  return status_from(handle, enable_watchdog);
}

int zv_DisableWatchDog(HANDLE handle) {
  return status_from(handle, disable_watchdog);
}

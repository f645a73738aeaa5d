// zarvo_recorder: records channels of the card for months, without a window.
#include <signal.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <thread>
#include <utility>

#include "programs/common/command_line.h"
#include "programs/common/stop_signal.h"
#include "recorder.h"
#include "service.h"
#include "status.h"

namespace {

using recorder::Clock;

constexpr int kIncomplete = 3;

std::atomic<bool> table_wanted{false};

void catch_table_signal() {
  struct sigaction action {};
  action.sa_handler = [](int) { table_wanted = true; };
  action.sa_flags = SA_RESTART;
  sigaction(SIGUSR1, &action, nullptr);
}

/// The watchdog of the service gets nothing while no frame comes.
void tell_service(const std::string &line, bool frames_come) {
  recorder::notify("STATUS=" + line + (frames_come ? "\nWATCHDOG=1" : ""));
}

/// A reader that does not read costs lines, but never holds up what else this thread does.
void print(const std::string &text) {
  recorder::print_in_time(STDOUT_FILENO, text);
}

/// Watches the recording until a signal ends it.
void watch(recorder::Recorder &recording, recorder::Status &status) {
  constexpr auto kTick = std::chrono::milliseconds(100);
  constexpr auto kSecond = std::chrono::seconds(1);
  constexpr auto kMinute = std::chrono::minutes(1);
  Clock::time_point next_second = Clock::now() + kSecond;
  Clock::time_point next_minute = Clock::now() + kMinute;
  std::uint64_t frames = 0;
  while (!stopping) {
    std::this_thread::sleep_for(kTick);
    const Clock::time_point now = Clock::now();
    if (table_wanted.exchange(false)) print(status.table());
    if (now >= next_minute) {
      next_minute = now + kMinute;
      status.compare_with_expected(recording.messages());
      if (!recording.options().quiet) print(status.line() + "\n");
    }
    if (now >= next_second) {
      next_second = now + kSecond;
      status.look_for_silence(recording.messages());
      status.look_for_overrun(recording.messages());
      const std::uint64_t before = std::exchange(frames, recording.frames());
      tell_service(status.line(), frames != before);
    }
    recording.messages().print();
  }
}

int record(const recorder::Options &options) {
  recorder::Recorder recording(options);
  recorder::Status status(recording);
  catch_table_signal();
  catch_stop_signals();
  recording.start();
  recorder::notify("READY=1");
  watch(recording, status);
  recorder::notify("STOPPING=1");
  recording.stop();
  recording.messages().print();
  if (!options.quiet) print(status.line() + "\n");
  return recording.lost() > 0 ? kIncomplete : 0;
}

}  // namespace

int main(int argc, char **argv) {
  survive_write_errors();
  try {
    return record(recorder::parse_options(argc, argv));
  } catch (const UsageError &error) {
    std::fprintf(stderr, "zarvo_recorder: %s\n", error.what());
    return 2;
  } catch (const std::exception &error) {
    std::fprintf(stderr, "zarvo_recorder: %s\n", error.what());
    return 1;
  }
}

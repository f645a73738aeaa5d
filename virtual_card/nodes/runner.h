/**
 * @file runner.h
 * Runs the card: calls the engine for each field and audio block when it is due, composes the preview,
 * queues the frames of supplies with a rate, and checks the watchdog.
 */
#ifndef VIRTUAL_CARD_RUNNER_H
#define VIRTUAL_CARD_RUNNER_H

#include <atomic>
#include <condition_variable>
#include <thread>

#include "board.h"

namespace virtual_card {

class Runner {
 public:
  explicit Runner(Board &board) : board_(board) {}
  ~Runner() { stop(); }
  Runner(const Runner &) = delete;
  Runner &operator=(const Runner &) = delete;

  /// Starts the card's thread, unless it runs or the clock is manual. Skips everything that was due before
  /// now. Returns 0, or a negated error number when no thread can be created.
  long start();
  /// Ends and joins the card's thread and the engine's threads. May be called twice.
  void stop();
  /// Starts again at card time 0. Call it after Clock::power_up(), while the thread is stopped.
  void power_up();

  /// Draws what a camera shows in the last complete frame.
  Picture look(unsigned channel);

  /// Manual clock only: runs everything that becomes due in the time, on the caller's thread.
  void advance(nanoseconds time);
  void advance_frames(int frames);

 private:
  struct Pace {
    Stream *streams[2];
    std::int64_t count;  ///< frames that became due since `since`
    nanoseconds since;   ///< start of encoding or of the supply, the later one
  };
  enum class Event { change, field, audio, video_supply, audio_supply };
  struct Next {
    Event event;
    nanoseconds due;
  };

  void loop();
  /// Returns the event that is due first.
  Next next();
  /// Runs one event. On bad_alloc the rest of the event is skipped.
  void run(const Next &next);
  void run_event(const Next &next);
  void run_until(nanoseconds time);
  void run_field();
  void run_audio_block();
  void compose(const CardState &state);
  void watch(nanoseconds now);
  /// Returns a copy of the settings; `session` receives the encoding session they belong to.
  CardState snapshot(u32 *session = nullptr);
  nanoseconds pace_due(Pace &pace, const CardState &state);
  /// Skips everything that was due before `now` and counts the lost frames.
  void skip_to(nanoseconds now);

  Board &board_;
  std::thread thread_;
  std::mutex run_mutex_;  // guards the members below; the thread releases it only while it waits
  std::condition_variable signal_;
  std::atomic<bool> ending_{false};  // set without the mutex, which the thread may hold for many fields
  FieldSchedule schedule_;
  std::int64_t field_ = 0;        // number of the next field
  std::int64_t audio_block_ = 0;  // number of the next audio block
  Pace video_pace_{{&board_.mpeg4, &board_.mjpeg}, 0, {}};
  Pace audio_pace_{{&board_.audio, nullptr}, 0, {}};
};

}  // namespace virtual_card

#endif

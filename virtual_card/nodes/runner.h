/**
 * @file runner.h
 * Makes the card run: calls the picture side for each field and audio block when it is due, composes
 * the preview, hands out paced supplies and watches the watchdog.
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

  /// Starts the card's thread, unless it runs or the clock is manual. What was due before is left out.
  /// A negated error number when no thread can be created.
  long start();
  /// Ends and joins the card's thread and those of the engine. Calling it twice is harmless.
  void stop();
  /// After a power-up of the clock, while stopped: everything is due from card time 0 again.
  void power_up();

  /// Manual clock only: runs everything that is due in the time, on the caller's thread.
  void advance(nanoseconds time);
  void advance_frames(int frames);

 private:
  struct Pace {
    Stream *streams[2];
    std::int64_t count;  ///< frames that came due since `since`
    nanoseconds since;   ///< when encoding began
  };
  enum class Event { field, audio, video_supply, audio_supply };
  struct Next {
    Event event;
    nanoseconds due;
  };

  void loop();
  /// What is due first.
  Next next();
  /// Runs one event. On bad_alloc the event is skipped.
  void run(const Next &next);
  void run_event(Event event);
  void run_until(nanoseconds time);
  void run_field();
  void run_audio_block();
  void compose(const CardState &state);
  void watch(nanoseconds now);
  /// The settings now, and the encoding session they belong to.
  CardState snapshot(u32 *session = nullptr);
  nanoseconds pace_due(Pace &pace, const CardState &state);
  /// Skips what is long overdue, and counts the frames lost.
  void skip_to(nanoseconds now);

  Board &board_;
  std::thread thread_;
  std::mutex run_mutex_;  // guards what follows: the thread and a manual advance() may not mix
  std::condition_variable signal_;
  std::atomic<bool> ending_{false};  // set without the mutex, which the thread may hold for many fields
  FieldSchedule schedule_;
  std::int64_t field_ = 0;        // next one
  std::int64_t audio_block_ = 0;  // next one
  Pace video_pace_{{&board_.mpeg4, &board_.mjpeg}, 0, {}};
  Pace audio_pace_{{&board_.audio, nullptr}, 0, {}};
};

}  // namespace virtual_card

#endif

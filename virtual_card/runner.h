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

  /// Lets the card run, unless the clock is manual. What was due while it rested is not made up for.
  /// A negated error number when there is no thread to be had.
  long start();
  /// Nothing is made any more, and the engine's threads are joined. The card's own ends by itself when the
  /// rest lasts: a host may open and close the card many times in a row.
  void rest();
  /// Rests, and joins that thread as well. Calling it twice is harmless.
  void stop();
  /// After a power-up of the clock: everything is due from card time 0 again.
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
  enum class State { resting, running, ending };
  enum class Event { field, audio, video_supply, audio_supply };
  struct Next {
    Event event;
    nanoseconds due;
  };

  void loop();
  /// Where the thread spends a rest. False when that lasts: it is to end.
  bool wait_for_work(std::unique_lock<std::mutex> &lock);
  /// What is due first.
  Next next();
  /// What memory is short for is left out.
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
  /// Leaves out what is long overdue and counts what that loses.
  void skip_to(nanoseconds now);

  Board &board_;
  std::thread thread_;
  std::mutex run_mutex_;  // guards what follows: the thread and a manual advance() may not mix
  std::condition_variable signal_;
  // Resting is set without the mutex, which the thread may be holding field after field.
  std::atomic<State> state_ = State::resting;
  bool asleep_ = false;  // the thread must be signalled to take up its work at once
  bool ended_ = false;   // the thread has ended by itself
  FieldTimes fields_;
  std::int64_t field_ = 0;        // next one
  std::int64_t audio_block_ = 0;  // next one
  Pace video_pace_{{&board_.mpeg4, &board_.mjpeg}, 0, {}};
  Pace audio_pace_{{&board_.audio, nullptr}, 0, {}};
};

}  // namespace virtual_card

#endif

/**
 * @file recorder.h
 * The whole recorder: card, intake, writer.
 */
#ifndef RECORDER_RECORDER_H
#define RECORDER_RECORDER_H

#include "intake.h"
#include "messages.h"
#include "options.h"
#include "programs/common/card.h"
#include "service.h"
#include "writer.h"

namespace recorder {

/// One at a time, because the SDK's callbacks carry no argument.
class Recorder {
 public:
  /// Locks the root, opens and configures the card. Throws std::runtime_error.
  explicit Recorder(const Options &options);
  ~Recorder() { stop(); }
  Recorder(const Recorder &) = delete;
  Recorder &operator=(const Recorder &) = delete;

  void start();
  /// Ends the recording with complete files.
  void stop();

  const Options &options() const { return options_; }
  const Intake &intake() const { return intake_; }
  const Writer &writer() const { return writer_; }
  Messages &messages() { return messages_; }
  Clock::time_point start_time() const { return start_; }
  /// Returns how many video frames have come, or audio blocks if no channel is recorded.
  std::uint64_t frames() const;
  /// Returns how many frames and audio blocks have come but are in no file.
  std::uint64_t lost() const;

 private:
  const Options options_;
  RootLock lock_;
  Messages messages_;
  Intake intake_;
  Writer writer_;
  Card card_;
  Clock::time_point start_{};
};

}  // namespace recorder

#endif

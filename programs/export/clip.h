/**
 * @file clip.h
 * Makes a clip of recordings.
 */
#ifndef EXPORT_CLIP_H
#define EXPORT_CLIP_H

#include <memory>
#include <optional>
#include <vector>

#include "audio_reader.h"
#include "catalogue.h"
#include "frame_checker.h"
#include "muxer.h"
#include "options.h"
#include "output_file.h"
#include "report.h"
#include "stream_reader.h"
#include "timeline.h"

namespace clips {

class Clip {
 public:
  /// The clip holds the groups of frames that overlap `stretches`, which are in order, one behind the other.
  /// `audio` may be null.
  Clip(const Options &options, std::vector<Stretch> stretches, AudioReader *audio, Report &report);

  /// Adds what the stretches need of a recording. Recordings come in the order of their time.
  void add(const Recording &recording);
  /// Completes the clip. Throws std::runtime_error if there is nothing in it.
  void finish();

 private:
  bool accept(const Recording &recording, const StreamReader &reader);
  void add_group(const Recording &recording, Group &group);
  void report_stray(const Recording &recording);
  void place_frames(const Group &group);
  void write_frames(const Group &group, Milliseconds until, bool joined);
  void choose_stretch(Milliseconds time);
  void report_hole(const Timeline::Place &place);
  void shorten_hole(const Timeline::Place &place);
  void report_clock(const Group &group);
  void check_frames(const Recording &recording, Group &group);
  void begin_stretch(const Recording &recording, const Group &group);
  void write_audio(Milliseconds until);
  void show_progress();

  const Options &options_;
  std::vector<Stretch> stretches_;
  std::size_t stretch_ = 0;  ///< the stretch that is being written or is next
  AudioReader *audio_;
  Report &report_;

  std::optional<VideoFormat> format_;  ///< of the first recording; all others must have it
  std::string label_;                  ///< of the channel
  std::optional<Timeline> timeline_;
  std::optional<FrameChecker> checker_;
  std::vector<std::uint8_t> stream_header_;
  OutputFile output_;
  std::unique_ptr<Muxer> muxer_;

  std::vector<Timeline::Place> places_;  ///< of the frames of the current group
  std::string stray_;                    ///< says which bytes in front of the current group belong to none
  bool writing_ = false;                 ///< a part of the current stretch is written
  bool anew_ = false;                    ///< the next group does not follow it, as the clock was set back
  std::int64_t shift_ = 0;               ///< period of the recordings that is period 0 of the clip
  std::int64_t next_ = 0;                ///< where the clip ends, in its periods
  Milliseconds begin_ = 0;               ///< when the first frame of the clip was recorded
  Milliseconds end_ = 0;                 ///< when the last one ended
  Milliseconds audio_shift_ = 0;         ///< the same shift in time
  Milliseconds shown_ = -1;              ///< the progress on the terminal
};

}  // namespace clips

#endif

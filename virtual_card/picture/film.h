/**
 * @file film.h
 * A video file in front of a camera. It is looped and plays at its own speed.
 */
#ifndef VIRTUAL_CARD_FILM_H
#define VIRTUAL_CARD_FILM_H

#include <cstdint>
#include <memory>
#include <string>

#include "av_ptr.h"
#include "picture.h"

namespace virtual_card {

class Film {
 public:
  /// Opens a file. Returns null, with the reason in `error`, when it cannot be read as video.
  static std::shared_ptr<Film> open(const std::string &path, std::string *error);

  /// Moves to the frame that is shown at this card time and returns its serial number. The film begins at the
  /// card time of the first call. If the file can no longer be read, the film stays at its last frame.
  std::int64_t seek(double card_seconds);
  /// Scales the frame to the size of `picture` and writes it into all lines.
  void copy_to(Picture &picture);

 private:
  Film() = default;
  std::string open_stream(const std::string &path);
  bool decode_next();
  bool advance();
  bool rewind();
  void skip_to(double film_seconds);

  AvPtr<AVFormatContext> format_;
  AvPtr<AVCodecContext> decoder_;
  AvPtr<AVPacket> packet_;
  AvPtr<AVFrame> shown_;
  AvPtr<AVFrame> next_;
  AvPtr<SwsContext> scaler_;
  int stream_ = -1;
  double tick_ = 0;          ///< seconds in a unit of the file's timestamps
  double frame_time_ = 0;    ///< seconds of a frame, from the frame rate of the file
  double first_time_ = 0;    ///< file time of the first frame
  double loop_start_ = 0;    ///< film time at which the current round began
  double shown_time_ = 0;    ///< film time of the frame shown
  double next_time_ = 0;     ///< film time of the frame after the frame shown
  double round_length_ = 0;  ///< seconds of a whole round; 0 until the first round has ended
  double origin_ = 0;        ///< card time of film time 0
  bool started_ = false;
  bool draining_ = false;
  bool broken_ = false;
  std::int64_t serial_ = 0;
};

}  // namespace virtual_card

#endif

/**
 * @file film.h
 * A video file in front of a camera, looped, at its own speed.
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
  /// Null, with the reason in `error`, when the file cannot be read as video.
  static std::shared_ptr<Film> open(const std::string &path, std::string *error);

  /// Moves to the frame to be seen at this card time and returns its serial number. The film begins
  /// at the first time asked for. A film that can no longer be read stays at its last frame.
  std::int64_t seek(double card_seconds);
  /// The frame, scaled to the picture's size, into all its lines.
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
  double tick_ = 0;          ///< seconds of a timestamp unit
  double frame_time_ = 0;    ///< seconds of a frame by the file's own account
  double first_time_ = 0;    ///< file time of the first frame
  double loop_start_ = 0;    ///< film time at which the current round began
  double shown_time_ = 0;    ///< film time of the frame shown
  double next_time_ = 0;     ///< film time of the frame after it
  double round_length_ = 0;  ///< seconds of a whole round, once one has been seen
  double origin_ = 0;        ///< card time of film time 0
  bool started_ = false;
  bool draining_ = false;
  bool broken_ = false;
  std::int64_t serial_ = 0;
};

}  // namespace virtual_card

#endif

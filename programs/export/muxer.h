/**
 * @file muxer.h
 * Writes the clip: Matroska or mp4.
 */
#ifndef EXPORT_MUXER_H
#define EXPORT_MUXER_H

#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

extern "C" {
#include <libavformat/avformat.h>
}

#include "aac_encoder.h"
#include "programs/common/libav.h"
#include "video_format.h"
#include "wall_time.h"

namespace clips {

struct ClipFormat {
  VideoFormat video;
  std::vector<std::uint8_t> stream_header;  ///< of MPEG-4, without the picture
  bool mp4;
  bool audio;
  std::string title;
  std::optional<Milliseconds> created;  ///< when the first frame was recorded
};

class Muxer {
 public:
  /// Writes to a file that exists. Throws std::runtime_error, as all functions here do.
  Muxer(const std::string &path, const ClipFormat &format);
  ~Muxer();
  Muxer(const Muxer &) = delete;
  Muxer &operator=(const Muxer &) = delete;

  /// Writes a frame that is shown from a period of the frame rate on.
  void write_video(std::span<const std::uint8_t> frame, std::int64_t period, bool intra);
  /// Writes an audio block that is heard from a sample on.
  void write_audio(std::span<const std::uint8_t> block, std::int64_t sample);
  void finish();

 private:
  void add_video(const ClipFormat &format);
  void add_audio(bool mp4);
  void write(AVPacket &packet, AVStream *stream, AVRational time_base);

  std::string path_;
  AVFormatContext *file_ = nullptr;
  AVStream *video_ = nullptr, *audio_ = nullptr;
  AVRational period_{};
  libav::PacketOwner packet_;
  std::unique_ptr<AacEncoder> encoder_;
  std::int64_t heard_ = 0;  ///< where the last audio block ends, in samples
};

}  // namespace clips

#endif

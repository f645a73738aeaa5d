// Reads a video file and loops it.
#include "film.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <utility>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libswscale/swscale.h>
}

namespace virtual_card {

namespace {

constexpr double kDefaultFrameTime = 1.0 / 25.0;
/// If a film is further behind than this, it jumps to a key frame instead of decoding all frames between.
constexpr double kJumpSeconds = 2.0;

/// Pixel formats whose name alone says that they use the full range, and the formats that the scaler takes in
/// their place.
constexpr std::array<std::pair<AVPixelFormat, AVPixelFormat>, 4> kFullRange{
    {{AV_PIX_FMT_YUVJ420P, AV_PIX_FMT_YUV420P},
     {AV_PIX_FMT_YUVJ422P, AV_PIX_FMT_YUV422P},
     {AV_PIX_FMT_YUVJ444P, AV_PIX_FMT_YUV444P},
     {AV_PIX_FMT_YUVJ440P, AV_PIX_FMT_YUV440P}}};

std::string reason(int error) {
  std::array<char, AV_ERROR_MAX_STRING_SIZE> text{};
  av_strerror(error, text.data(), text.size());
  return text.data();
}

/// Opens a regular file, by libav's file protocol only: no name may lead to the network, and no pipe may keep
/// the host waiting.
std::string open_file(const std::string &path, AVFormatContext **format) {
  struct stat status {};
  if (::stat(path.c_str(), &status) != 0) return std::strerror(errno);
  if (!S_ISREG(status.st_mode)) return "not a regular file";
  AVDictionary *options = nullptr;
  av_dict_set(&options, "protocol_whitelist", "file", 0);
  const int result = avformat_open_input(format, ("file:" + path).c_str(), nullptr, &options);
  av_dict_free(&options);
  return result < 0 ? reason(result) : std::string();
}

}  // namespace

std::shared_ptr<Film> Film::open(const std::string &path, std::string *error) {
  std::shared_ptr<Film> film(new Film);
  std::string problem = film->open_stream(path);
  if (problem.empty() && !film->decode_next()) problem = "no picture in it can be decoded";
  if (problem.empty()) {
    film->first_time_ = film->next_time_;
    film->next_time_ = 0;
    film->advance();
    return film;
  }
  if (error != nullptr) *error = path + ": " + problem;
  return nullptr;
}

std::string Film::open_stream(const std::string &path) {
  AVFormatContext *format = nullptr;
  if (std::string problem = open_file(path, &format); !problem.empty()) return problem;
  format_.reset(format);
  if (const int result = avformat_find_stream_info(format, nullptr); result < 0) return reason(result);
  const AVCodec *codec = nullptr;
  stream_ = av_find_best_stream(format, AVMEDIA_TYPE_VIDEO, -1, -1, &codec, 0);
  if (stream_ < 0) return "no video in the file";

  const AVStream *stream = format->streams[stream_];
  decoder_.reset(avcodec_alloc_context3(codec));
  packet_.reset(av_packet_alloc());
  shown_.reset(av_frame_alloc());
  next_.reset(av_frame_alloc());
  if (!decoder_ || !packet_ || !shown_ || !next_) return "out of memory";
  avcodec_parameters_to_context(decoder_.get(), stream->codecpar);
  decoder_->thread_count = 1;
  if (const int result = avcodec_open2(decoder_.get(), codec, nullptr); result < 0) return reason(result);

  tick_ = av_q2d(stream->time_base);
  const AVRational rate = av_guess_frame_rate(format, format->streams[stream_], nullptr);
  frame_time_ = rate.num > 0 && rate.den > 0 ? av_q2d(av_inv_q(rate)) : kDefaultFrameTime;
  return {};
}

bool Film::decode_next() {
  while (true) {
    const int received = avcodec_receive_frame(decoder_.get(), next_.get());
    if (received == 0) break;
    if (received != AVERROR(EAGAIN) || draining_) return false;
    const int read = av_read_frame(format_.get(), packet_.get());
    if (read < 0) {
      draining_ = true;
      avcodec_send_packet(decoder_.get(), nullptr);
      continue;
    }
    // Ignore errors: a damaged packet loses its picture, and the film goes on.
    if (packet_->stream_index == stream_) avcodec_send_packet(decoder_.get(), packet_.get());
    av_packet_unref(packet_.get());
  }
  if (next_->best_effort_timestamp != AV_NOPTS_VALUE) {
    next_time_ = loop_start_ - first_time_ + static_cast<double>(next_->best_effort_timestamp) * tick_;
  } else {
    next_time_ = shown_time_ + frame_time_;
  }
  return true;
}

bool Film::rewind() {
  const AVStream *stream = format_->streams[stream_];
  const std::int64_t begin = stream->start_time == AV_NOPTS_VALUE ? 0 : stream->start_time;
  if (avformat_seek_file(format_.get(), stream_, INT64_MIN, begin, begin, 0) < 0 &&
      av_seek_frame(format_.get(), stream_, 0, AVSEEK_FLAG_BYTE) < 0) {
    return false;
  }
  avcodec_flush_buffers(decoder_.get());
  draining_ = false;
  return true;
}

/// Shows the next frame and decodes the one after it.
bool Film::advance() {
  std::swap(shown_, next_);
  shown_time_ = next_time_;
  ++serial_;
  if (decode_next()) {
    if (next_time_ <= shown_time_) next_time_ = shown_time_ + frame_time_;
    return true;
  }
  // The end of the file: the first frame follows after the last frame has been shown for its duration.
  const double end = shown_time_ + frame_time_;
  round_length_ = end - loop_start_;
  loop_start_ = end;
  if (!rewind() || !decode_next()) return false;
  next_time_ = std::max(next_time_, end);
  return true;
}

/// Jumps to the key frame at or before a time. The frames from there are decoded one by one.
void Film::skip_to(double film_seconds) {
  if (round_length_ > 0)
    loop_start_ += std::floor((film_seconds - loop_start_) / round_length_) * round_length_;
  const double file_seconds = film_seconds - loop_start_ + first_time_;
  const auto target = static_cast<std::int64_t>(file_seconds / tick_);
  if (av_seek_frame(format_.get(), stream_, target, AVSEEK_FLAG_BACKWARD) < 0 && !rewind()) return;
  avcodec_flush_buffers(decoder_.get());
  draining_ = false;
  broken_ = !decode_next();
}

std::int64_t Film::seek(double card_seconds) {
  if (!started_) {
    started_ = true;
    origin_ = card_seconds;
  }
  // Add half a microsecond, since times that should be equal may differ by rounding.
  const double film_seconds = card_seconds - origin_ + 5e-7;
  if (film_seconds - next_time_ > kJumpSeconds && !broken_) skip_to(film_seconds);
  while (!broken_ && next_time_ <= film_seconds) broken_ = !advance();
  return serial_;
}

void Film::copy_to(Picture &picture) {
  const auto width = static_cast<int>(picture.width);
  const auto lines = static_cast<int>(picture.lines);
  const auto format = static_cast<AVPixelFormat>(shown_->format);
  const auto *full_range = std::find_if(kFullRange.begin(), kFullRange.end(),
                                        [&](const auto &names) { return names.first == format; });
  const bool full = full_range != kFullRange.end() || shown_->color_range == AVCOL_RANGE_JPEG;
  scaler_.reset(sws_getCachedContext(scaler_.release(), shown_->width, shown_->height,
                                     full_range != kFullRange.end() ? full_range->second : format, width,
                                     lines, AV_PIX_FMT_YUV422P, SWS_BILINEAR, nullptr, nullptr, nullptr));
  if (!scaler_) return;
  const int *coefficients = sws_getCoefficients(SWS_CS_DEFAULT);
  sws_setColorspaceDetails(scaler_.get(), coefficients, full ? 1 : 0, coefficients, 0, 0, 1 << 16, 1 << 16);
  const std::array<u8 *, 4> planes{picture.y.data(), picture.cb.data(), picture.cr.data(), nullptr};
  const std::array<int, 4> strides{width, width / 2, width / 2, 0};
  sws_scale(scaler_.get(), shown_->data, shown_->linesize, 0, shown_->height, planes.data(), strides.data());
}

}  // namespace virtual_card

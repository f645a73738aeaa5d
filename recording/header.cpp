// Builds and reads the header of a video recording.
#include "recording/header.h"

#include <unistd.h>

#include <cstdlib>
#include <cstring>

namespace recording {
namespace {

constexpr std::size_t kTagSize = sizeof(RECORD_FILE_HEADER::codec_tag);
constexpr const char *kTags[] = {"MPG4", "MJPG"};  // by ZV_VIDEO_CODEC

}  // namespace

PictureSize picture_size(ZV_SCALE_VALUE scale, ZV_VIDEO_STANDARD standard, ZV_RESOLUTION resolution) {
  const int width = resolution == RESOLUTION_ZV_720 ? 720 : 704;
  const int lines = standard == VIDEO_STANDARD_ZV_NTSC ? 480 : 576;
  return {scale == SCALE_ZV_CIF ? 352 : width, scale == SCALE_ZV_D1 ? lines : lines / 2};
}

RECORD_FILE_HEADER make_header(ZV_VIDEO_CODEC codec, PictureSize size, const std::string &rate,
                               unsigned channel) {
  RECORD_FILE_HEADER header{};
  std::memcpy(header.codec_tag, kTags[codec == VIDEO_CODEC_ZV_MJPEG ? 1 : 0], kTagSize);
  header.record_width = size.width;
  header.record_height = size.height;
  header.frame_rate = std::atoi(rate.c_str());
  const std::string label = "Channel " + std::to_string(channel + 1);
  label.copy(header.channel_label, sizeof header.channel_label);
  return header;
}

std::optional<RECORD_FILE_HEADER> read_header(int file) {
  RECORD_FILE_HEADER header;
  if (read(file, &header, sizeof header) != sizeof header) return std::nullopt;
  return header;
}

std::optional<ZV_VIDEO_CODEC> codec_of(const RECORD_FILE_HEADER &header) {
  for (const ZV_VIDEO_CODEC codec : {VIDEO_CODEC_ZV_MPEG4, VIDEO_CODEC_ZV_MJPEG})
    if (std::memcmp(header.codec_tag, kTags[codec], kTagSize) == 0) return codec;
  return std::nullopt;
}

std::string_view intra_start(ZV_VIDEO_CODEC codec) {
  using namespace std::string_view_literals;
  // The MPEG-4 stream header begins with the start codes of an object and of a layer.
  return codec == VIDEO_CODEC_ZV_MJPEG ? "\xFF\xD8\xFF"sv : "\0\0\1\0\0\0\1\x20"sv;
}

ZV_VIDEO_STANDARD standard_of(const RECORD_FILE_HEADER &header) {
  return header.record_height % 240 == 0 ? VIDEO_STANDARD_ZV_NTSC : VIDEO_STANDARD_ZV_PAL;
}

std::string label_of(const RECORD_FILE_HEADER &header) {
  return {header.channel_label, strnlen(header.channel_label, sizeof header.channel_label)};
}

}  // namespace recording

/**
 * @file frame_checker.h
 * Decodes frames to find damaged ones: MPEG-4 frames have no length and no checksum.
 */
#ifndef EXPORT_FRAME_CHECKER_H
#define EXPORT_FRAME_CHECKER_H

#include "programs/common/libav.h"
#include "stream_reader.h"

namespace clips {

class FrameChecker {
 public:
  explicit FrameChecker(ZV_VIDEO_CODEC codec);

  /// Returns how many frames of a group decode, up to the first that does not.
  std::size_t whole_frames(const Group &group);

 private:
  bool decodes(std::span<const std::uint8_t> frame);

  libav::CodecContext decoder_;
  libav::FrameOwner picture_;
  libav::PacketOwner packet_;
};

}  // namespace clips

#endif

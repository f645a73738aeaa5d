/**
 * @file device_audio.h
 * The audio node.
 */
#ifndef VIRTUAL_CARD_DEVICE_AUDIO_H
#define VIRTUAL_CARD_DEVICE_AUDIO_H

#include "device.h"

namespace virtual_card {

/// /dev/zarvo_g723_0: reads of audio blocks. It has no commands.
class AudioDevice : public DeviceNode {
 public:
  explicit AudioDevice(Board &board) : DeviceNode(board, Device::audio, board.audio_region) {}

  long read(std::uintptr_t buffer, std::size_t count) override;
};

}  // namespace virtual_card

#endif

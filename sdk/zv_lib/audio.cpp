/**
 * @file audio.cpp
 * The audio data thread, which reads audio blocks and calls the audio callback.
 */
#include <unistd.h>

#include "internal.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

namespace {

void deliver_blocks(const ZV_CARD &card) {
  for (u32 n = 0; n < ZV_AUDIO_CHANNELS; ++n) {
    const ZV_STREAM_CALLBACK callback = card.audio_callback;
    if ((card.audio_mask >> n & 1) != 0 && callback != nullptr)
      callback(n, audio_buf + driver::kAudioBlockSize * n, driver::kAudioBlockSize, 0);
  }
}

int audio_stream(ZV_CARD &, u32 channel) {
  return channel < ZV_AUDIO_CHANNELS ? ZV_OK : ZV_ERR_CHANNEL;
}

}  // namespace

void *get_audio_data_thread(void *argument) {
  if (void *failure = make_cancellable()) return failure;
  const ZV_CARD &card = *static_cast<ZV_CARD *>(argument);
  const RunFlag running{zv_audio_thread_enable, mutex_zv_audio_enable};
  while (running.is_set()) {
    if (card.audio_mask != 0) {
      // The driver takes the count in blocks, not bytes: it fills one block for each input.
      if (read(card.g723_fd, audio_buf, driver::kAudioReadCount) <= 0) continue;
      deliver_blocks(card);
    }
    usleep(kPassPause);
  }
  return nullptr;
}

}  // namespace zarvo

using namespace zarvo;

int zv_GetAudioStream(HANDLE handle, u32 channel) {
  return status_from(handle, audio_stream, channel);
}

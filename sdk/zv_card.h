/**
 * @file zv_card.h
 * The record behind a HANDLE, the state of the one open card, and "the door": the functions that turn
 * every HANDLE into a ZV_CARD reference.
 */
#ifndef ZV_CARD_H
#define ZV_CARD_H

#include <pthread.h>

#include <array>
#include <atomic>
#include <type_traits>

#include "worker.h"
#include "zv_driver.h"
#include "zv_type.h"

namespace zarvo {

/// A word that two threads share. A thread that loads the word also sees what the other thread wrote before
/// it stored the word: a callback that is replaced while capturing finds its data ready.
template <typename T>
class Shared {
 public:
  Shared() = default;
  operator T() const { return word_.load(std::memory_order_acquire); }
  T operator=(T value) {
    word_.store(value, std::memory_order_release);
    return value;
  }
  T exchange(T value) { return word_.exchange(value); }

 private:
  std::atomic<T> word_{};
};

/// The record behind a HANDLE. zv_Open() sets some members; all others start as 0.
struct ZV_CARD {
  i32 dec_fd;   ///< never opened, always 0
  i32 enc_fd;   ///< encoder device; this and the next three descriptors are -1 once closed
  i32 vin_fd;   ///< video-input device
  i32 g723_fd;  ///< audio device
  i32 disp_fd;  ///< display device
  ZV_RECT shield[ZV_CHANNELS];
  ZV_VIDEO_PROPERTY property[ZV_CHANNELS];
  u32 motion_sensitivity[ZV_CHANNELS];
  u32 record_mask;         ///< channels enabled for encoding
  Shared<u32> audio_mask;  ///< audio inputs enabled; the audio data thread reads it on every pass
  Shared<u32> resolution;  ///< a ZV_RESOLUTION; the video data thread reads it for stream headers
  Shared<u32> standard;    ///< a ZV_VIDEO_STANDARD; the video data thread reads it for stream headers
  ZV_DISPLAY display;
  ZV_VIDEO_CONFIG config[ZV_CHANNELS];  ///< use word_of() and set_word() for the enumerations
  Shared<ZV_STREAM_CALLBACK> mpeg4_callback;
  Shared<ZV_STREAM_CALLBACK> mjpeg_callback;
  Shared<ZV_STREAM_CALLBACK> audio_callback;
  u16 *motion_map;                       ///< scratch buffer for a map of motion thresholds
  Shared<u32> motion_status;             ///< last motion bits; two threads write, the later store wins
  Shared<u32> video_status;              ///< last video-loss bits that the video data thread has read
  Shared<u32> frame_flags[ZV_CHANNELS];  ///< flag words passed to the video callbacks
};

// Read and write the enumerations of a configuration as words: a caller may have stored any number in them,
// and zv_Stop() can wipe a scale while the video data thread builds a header from it.
using EnumWord __attribute__((__may_alias__)) = u32;
template <typename Enum>
u32 word_of(const Enum &field) {
  static_assert(sizeof field == sizeof(u32));
  return __atomic_load_n(reinterpret_cast<const EnumWord *>(&field), __ATOMIC_RELAXED);
}
template <typename Enum>
void set_word(Enum &field, u32 word) {
  static_assert(sizeof field == sizeof(u32));
  __atomic_store_n(reinterpret_cast<EnumWord *>(&field), word, __ATOMIC_RELAXED);
}

// Paths of the device nodes. A program may write other paths into these arrays before zv_Open().
using DevicePath = std::array<char, 256>;
extern DevicePath enc_dev_path;
extern DevicePath vin_dev_path;
extern DevicePath g723_dev_path;
extern DevicePath disp_dev_path;
extern DevicePath dec_dev_path;

extern Shared<int> open_count;       ///< 1 while a card is open
extern Shared<ZV_CARD *> open_card;  ///< the record that zv_Open() returned; null while closed
extern u8 *mpeg4_buf;                ///< stream region of the encoder device
extern u8 *mjpeg_buf;                ///< second half of the stream region
extern u8 *audio_buf;                ///< destination of audio reads
extern u8 *preview_buf[driver::kPreviewBuffers];
extern u8 *preview_scratch;  ///< destination of preview reads, large enough for a whole picture

extern pthread_mutex_t mutex_zv_enable;        ///< guards writes of zv_thread_enable
extern pthread_mutex_t mutex_zv_audio_enable;  ///< guards zv_audio_thread_enable
extern pthread_mutex_t mutex_watchdog;         ///< guards zv_watchdog_thread_enable
extern pthread_mutex_t mutex_preview;          ///< guards preview_scratch during a read

extern Shared<int> start_flag;                 ///< 1 from zv_Start() to zv_Stop(); frames are delivered
extern Shared<int> zv_thread_enable;           ///< run flag of the video data thread
extern Shared<int> zv_audio_thread_enable;     ///< run flag of the audio data thread
extern Shared<int> zv_watchdog_thread_enable;  ///< run flag of the watchdog thread
extern Worker zv_capture_thread;
extern Worker zv_audio_capture_thread;
extern Worker zv_watchdog_thread;
extern void *zv_thread_result;
extern void *zv_audio_thread_result;
extern void *zv_watchdog_thread_result;
extern Shared<u32> mp4_header_flag[ZV_CHANNELS];  ///< type of the last MPEG-4 frame; 1 once it has a header

/// The run flag of a thread. Use it only while the card is open: its mutex does not exist otherwise.
struct RunFlag {
  Shared<int> &word;
  pthread_mutex_t &mutex;

  /// Sets the flag and returns the previous value.
  int exchange(int value) const {
    pthread_mutex_lock(&mutex);
    const int before = word.exchange(value);
    pthread_mutex_unlock(&mutex);
    return before;
  }
  bool is_set() const {
    pthread_mutex_lock(&mutex);
    const bool set = word != 0;
    pthread_mutex_unlock(&mutex);
    return set;
  }
};

/// Returns the card behind a handle, or null if the handle is not that of the open card.
inline ZV_CARD *card_of(HANDLE handle) {
  ZV_CARD *card = open_card;
  return handle != nullptr && handle == card ? card : nullptr;
}

/// The door: runs `function` on the card behind `handle`. Returns `refused` for a bad handle (null, closed,
/// or not from zv_Open()).
template <typename Function, typename... Arguments>
auto value_from(HANDLE handle, std::invoke_result_t<Function, ZV_CARD &, Arguments...> refused,
                Function function, Arguments... arguments) {
  ZV_CARD *card = card_of(handle);
  return card != nullptr ? function(*card, arguments...) : refused;
}

/// The door for functions that return a status.
template <typename Function, typename... Arguments>
int status_from(HANDLE handle, Function function, Arguments... arguments) {
  return value_from(handle, ZV_ERR_PARAM, function, arguments...);
}

}  // namespace zarvo

#endif

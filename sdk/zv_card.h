/**
 * @file zv_card.h
 * The record behind a HANDLE, the state the SDK keeps for its one open card, and the door through
 * which every handle comes in.
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

/// A word that two threads share. Whole-word loads and stores; what the writer did before its store
/// is seen by whoever loads the word, so a callback registered in flight finds its data.
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

/// The handle record. All zero after zv_Open() but for what zv_Open() sets.
struct ZV_CARD {
  i32 dec_fd;   ///< never opened, always 0
  i32 enc_fd;   ///< encoder device; this and the next three are -1 once closed
  i32 vin_fd;   ///< video-input device
  i32 g723_fd;  ///< audio device
  i32 disp_fd;  ///< display device
  ZV_RECT shield[ZV_CHANNELS];
  ZV_VIDEO_PROPERTY property[ZV_CHANNELS];
  u32 motion_sensitivity[ZV_CHANNELS];
  u32 record_mask;         ///< channels enabled for encoding
  Shared<u32> audio_mask;  ///< audio inputs enabled; read by the audio thread on every pass
  Shared<u32> resolution;  ///< a ZV_RESOLUTION; read by the video thread for the headers
  Shared<u32> standard;    ///< a ZV_VIDEO_STANDARD; read by the video thread for the headers
  ZV_DISPLAY display;
  ZV_VIDEO_CONFIG config[ZV_CHANNELS];  ///< enumerations: through word_of() and set_word()
  Shared<ZV_STREAM_CALLBACK> mpeg4_callback;
  Shared<ZV_STREAM_CALLBACK> mjpeg_callback;
  Shared<ZV_STREAM_CALLBACK> audio_callback;
  u16 *motion_map;                       ///< kMotionMapBytes of scratch for motion thresholds
  Shared<u32> motion_status;             ///< last motion bits; two writers, the later store wins
  Shared<u32> video_status;              ///< last video-loss bits the video thread has seen
  Shared<u32> frame_flags[ZV_CHANNELS];  ///< flag words handed to the video callbacks
};

// The enumerations of a configuration are read and written as words: a caller may have put any number
// into them, and zv_Stop() wipes a scale while the video thread makes a header from it.
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

// Device nodes. The arrays may be overwritten with other paths before zv_Open().
using DevicePath = std::array<char, 256>;
extern DevicePath enc_dev_path;
extern DevicePath vin_dev_path;
extern DevicePath g723_dev_path;
extern DevicePath disp_dev_path;
extern DevicePath dec_dev_path;

extern Shared<int> open_count;       ///< 1 while a card is open
extern Shared<ZV_CARD *> open_card;  ///< the record handed out by zv_Open(), null while closed
extern u8 *mpeg4_buf;                ///< stream region of the encoder device
extern u8 *mjpeg_buf;                ///< its second half
extern u8 *audio_buf;                ///< destination of the audio reads
extern u8 *preview_buf[driver::kPreviewBuffers];
extern u8 *preview_scratch;  ///< destination of the preview reads, a whole picture large

extern pthread_mutex_t mutex_zv_enable;        ///< guards writes of zv_thread_enable
extern pthread_mutex_t mutex_zv_audio_enable;  ///< guards zv_audio_thread_enable
extern pthread_mutex_t mutex_watchdog;         ///< guards zv_watchdog_thread_enable
extern pthread_mutex_t mutex_preview;          ///< guards preview_scratch during a read

extern Shared<int> start_flag;                 ///< 1 from zv_Start() to zv_Stop(): frames are delivered
extern Shared<int> zv_thread_enable;           ///< run flag of the video data thread
extern Shared<int> zv_audio_thread_enable;     ///< run flag of the audio data thread
extern Shared<int> zv_watchdog_thread_enable;  ///< run flag of the watchdog thread
extern Worker zv_capture_thread;
extern Worker zv_audio_capture_thread;
extern Worker zv_watchdog_thread;
extern void *zv_thread_result;
extern void *zv_audio_thread_result;
extern void *zv_watchdog_thread_result;
extern Shared<u32> mp4_header_flag[ZV_CHANNELS];  ///< type of the last MPEG-4 frame, 1 once it has a header

/// The run flag of a thread. Its mutex exists while the card is open.
struct RunFlag {
  Shared<int> &word;
  pthread_mutex_t &mutex;

  /// Writes the flag and returns what it was.
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

/// The card behind a handle; null for anything but the handle of the open card.
inline ZV_CARD *card_of(HANDLE handle) {
  ZV_CARD *card = open_card;
  return handle != nullptr && handle == card ? card : nullptr;
}

/// The door: runs `function` on the card behind `handle`, or answers `refused` for a handle that is
/// null, dead or foreign.
template <typename Function, typename... Arguments>
auto value_from(HANDLE handle, std::invoke_result_t<Function, ZV_CARD &, Arguments...> refused,
                Function function, Arguments... arguments) {
  ZV_CARD *card = card_of(handle);
  return card != nullptr ? function(*card, arguments...) : refused;
}

/// The door for functions that answer with a status.
template <typename Function, typename... Arguments>
int status_from(HANDLE handle, Function function, Arguments... arguments) {
  return value_from(handle, ZV_ERR_PARAM, function, arguments...);
}

}  // namespace zarvo

#endif

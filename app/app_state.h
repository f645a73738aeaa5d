/**
 * @file app_state.h
 * The state that the dialog, the preview thread and the recording callbacks share. It exists for the whole
 * program and belongs to no dialog object. Words that two threads use are read and written through
 * shared().
 */
#ifndef APP_STATE_H
#define APP_STATE_H

#include <pthread.h>

#include <QCheckBox>
#include <QStringList>
#include <QTimer>
#include <atomic>
#include <cstdio>
#include <ctime>
#include <mutex>

#include "global.h"
#include "recording/frame_rates.h"
#include "zv_type.h"

// The card, and the settings that the operator chose for it.
extern HANDLE zv_handle;
extern ZV_VIDEO_STANDARD zv_format;
extern ZV_RESOLUTION zv_resolution;
extern ZV_VIDEO_MODE zv_mode;
extern ZV_VIDEO_PROPERTY zv_property;
extern ZV_RECT zv_rect;
extern ZV_RECT zv_rect_motion;
extern ZV_VIDEO_CONFIG zv_config;
extern ZV_VIDEO_CONFIG zv_clean_config;
extern ZV_VIDEO_CODEC zv_record_mode;

// Preview. `video_enable` is written under thread_mutex; the preview thread reads it without the mutex.
extern pthread_mutex_t thread_mutex;
extern int video_enable;
extern int g_finish_preview;
extern int g_width;
extern int g_height;
/// The dialog holds this mutex during each change of split, standard, resolution, focus and preview channels,
/// including the SDK call. The preview thread holds it during its own display calls.
extern std::mutex layout_mutex;

// Channel sets: bit n is channel n + 1 as operators count.
extern unsigned int g_preview_ch;
extern unsigned int g_record_ch;
extern unsigned int g_audio_ch;
extern unsigned int g_video_ch;
extern unsigned int g_motion_ch;
extern int g_valid_record_ch;
extern CHANNEL_SETTING_MODE g_channel_mode;
extern QCheckBox *g_check_handle[16];

// Recording.
extern int g_finish_record;
extern int g_record_width;
extern int g_record_height;
extern char g_filepath[256];
extern char g_video_path[256];
extern char g_audio_path[256];
extern FILE *g_fp_mpg4[16];
extern FILE *g_fp_mjpg[16];
extern FILE *g_fp_audio[4];
extern int g_cur_hour;
extern int g_min_diskspace;
extern int g_time_interval;
extern QTimer timer;
extern time_t ttt;
extern int lenlen;

/// The status of the most recent SDK call that went through sdk_ok().
extern int g_res;

/// Returns the labels of a standard's frame rates, without the final null.
QStringList frame_rate_labels(ZV_VIDEO_STANDARD standard);

/// Return the width and the lines of the input picture, as the operator chose them.
inline int input_width() {
  return zv_resolution == RESOLUTION_ZV_720 ? 720 : 704;
}
inline int input_lines() {
  return zv_format == VIDEO_STANDARD_ZV_NTSC ? 480 : 576;
}

/// Gives atomic access to a word that two threads share.
template <typename T>
std::atomic_ref<T> shared(T &word) {
  return std::atomic_ref<T>(word);
}

/// Stores the status of an SDK call in g_res and prints `message` as a line when the call failed. Returns
/// true on success. Every SDK call of the dialog whose failure is reported uses this function.
bool sdk_ok(int status, const char *message);

// The recording callbacks. The SDK calls them on its capture threads.
void mpeg4_call_back(unsigned int ch, unsigned char *data, int length, int flags);
void mjpeg_call_back(unsigned int ch, unsigned char *data, int length, int flags);
void audio_call_back(unsigned int ch, unsigned char *data, int length, int flags);

#endif

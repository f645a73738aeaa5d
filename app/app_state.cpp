// The state that the dialog, the preview thread and the recording callbacks share.
#include "app_state.h"

HANDLE zv_handle = nullptr;
ZV_VIDEO_STANDARD zv_format = VIDEO_STANDARD_ZV_NTSC;
ZV_RESOLUTION zv_resolution = RESOLUTION_ZV_720;
ZV_VIDEO_MODE zv_mode = MUX_MODE_ZV_1CH;
ZV_VIDEO_PROPERTY zv_property = {};
ZV_RECT zv_rect = {};
ZV_RECT zv_rect_motion = {};
ZV_VIDEO_CONFIG zv_config = {};
ZV_VIDEO_CONFIG zv_clean_config = {};
ZV_VIDEO_CODEC zv_record_mode = VIDEO_CODEC_ZV_MPEG4;

pthread_mutex_t thread_mutex = PTHREAD_MUTEX_INITIALIZER;
int video_enable = 1;
int g_finish_preview = 1;
int g_width = 720;
int g_height = 480;
std::mutex layout_mutex;

unsigned int g_preview_ch = 0xFFFF;
unsigned int g_record_ch = 0;
unsigned int g_audio_ch = 0;
unsigned int g_video_ch = 0;
unsigned int g_motion_ch = 0;
int g_valid_record_ch = 0;
CHANNEL_SETTING_MODE g_channel_mode = ENABLE_PREVIEW;
QCheckBox *g_check_handle[16] = {};

int g_finish_record = 1;
int g_record_width = 720;
int g_record_height = 480;
char g_filepath[256] = "./Data";
char g_video_path[256] = "";
char g_audio_path[256] = "";
FILE *g_fp_mpg4[16] = {};
FILE *g_fp_mjpg[16] = {};
FILE *g_fp_audio[4] = {};
int g_cur_hour = 0;
int g_min_diskspace = 10;
int g_time_interval = 10000;
QTimer timer;
time_t ttt = 0;
int lenlen = 0;

int g_res = 0;

QStringList frame_rate_labels(ZV_VIDEO_STANDARD standard) {
  QStringList labels;
  for (auto label = recording::frame_rate_list(standard); *label != nullptr; ++label)
    labels << QString::fromLatin1(*label);
  return labels;
}

bool sdk_ok(int status, const char *message) {
  shared(g_res).store(status, std::memory_order_relaxed);
  if (status != ZV_OK) std::puts(message);
  return status == ZV_OK;
}

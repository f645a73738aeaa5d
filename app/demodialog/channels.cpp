// Channel selection: sixteen check boxes that show and edit three channel sets and show two kinds of status.
#include <unistd.h>

#include <cstdio>
#include <mutex>

#include "app_state.h"
#include "demodialog.h"
#include "panel_helpers.h"
#include "zv_lib.h"

namespace {

constexpr unsigned kAudioMask = (1u << ZV_AUDIO_CHANNELS) - 1u;
constexpr const char *kAudioChannelsError = "ERROR:zv_EnableAudioChannels Error!";

/// Sends the preview set, under the mutex, since the preview thread changes the same windows.
void send_preview_channels() {
  const std::lock_guard lock(layout_mutex);
  sdk_ok(zv_EnablePreviewChannels(zv_handle, g_preview_ch), "ERROR:zv_EnablePreviewChannels Error!");
}

/// Enables the first `count` boxes and disables the other boxes.
void enable_boxes(unsigned count) {
  for (unsigned n = 0; n < ZV_CHANNELS; ++n) g_check_handle[n]->setEnabled(n < count);
}

/// Shows a status on the boxes and leaves the editing mode.
void show_status(DemoDialog &dialog, unsigned status, const QString &title) {
  dialog.SetCheckBox(status);
  enable_boxes(0);
  dialog.ChecksGroup->setTitle(title);
  for (QAbstractButton *mode : {dialog.radioEnPreview, dialog.radioEnAudio, dialog.radioEnRecord})
    uncheck(mode);
}

}  // namespace

void DemoDialog::SetCheckBox(unsigned int mask) {
  for (unsigned n = 0; n < ZV_CHANNELS; ++n) g_check_handle[n]->setChecked(mask >> n & 1u);
}

unsigned int DemoDialog::CheckCheckBox() {
  unsigned mask = 0;
  for (unsigned n = 0; n < ZV_CHANNELS; ++n) {
    if (g_check_handle[n]->checkState() != Qt::Unchecked) mask |= 1u << n;
  }
  return mask;
}

void DemoDialog::ChSettingChange() {
  const unsigned mask = CheckCheckBox();
  switch (g_channel_mode) {
    case ENABLE_PREVIEW:
      g_preview_ch = mask;
      std::printf("ChSettingChange(): g_preview_ch = %4x\n", g_preview_ch);
      send_preview_channels();
      break;
    case ENABLE_AUDIO:
      g_audio_ch = mask & kAudioMask;
      std::printf("g_audio_ch = %d\n", g_audio_ch);
      break;
    case ENABLE_RECORD:
      g_record_ch = mask;
      std::printf("g_record_ch = %4x\n", g_record_ch);
      break;
    default:
      break;
  }
}

void DemoDialog::EnablePreview() {
  g_channel_mode = INITIAL_CASE;
  send_preview_channels();
  SetCheckBox(g_preview_ch);
  enable_boxes(ZV_CHANNELS);
  g_channel_mode = ENABLE_PREVIEW;
  ChecksGroup->setTitle(tr("Preview"));
}

void DemoDialog::EnableAudio() {
  g_channel_mode = INITIAL_CASE;
  sdk_ok(zv_EnableAudioChannels(zv_handle, g_audio_ch), kAudioChannelsError);
  std::printf("g_audio_ch = %x\n", g_audio_ch);
  SetCheckBox(g_audio_ch & kAudioMask);
  enable_boxes(ZV_AUDIO_CHANNELS);
  g_channel_mode = ENABLE_AUDIO;
  ChecksGroup->setTitle(tr("Audio"));
}

void DemoDialog::EnableRecord() {
  g_channel_mode = INITIAL_CASE;
  SetCheckBox(g_record_ch);
  enable_boxes(ZV_CHANNELS);
  g_channel_mode = ENABLE_RECORD;
  ChecksGroup->setTitle(tr("Record"));
}

void DemoDialog::GetVideoStatus() {
  g_channel_mode = VIDEO_STATUS;
  g_video_ch = zv_GetVideoStatus(zv_handle);
  std::printf("g_video_ch = %x\n", g_video_ch);
  show_status(*this, g_video_ch, tr("Video loss"));
}

void DemoDialog::GetMotionStatus() {
  g_channel_mode = MOTION_STATUS;
  g_motion_ch = zv_GetMotionStatus(zv_handle);
  std::printf("g_motion_ch = %x\n", g_motion_ch);
  show_status(*this, g_motion_ch, tr("Motion"));
}

void DemoDialog::WriteEnableCh() {
  if (g_record_ch) {
    std::printf("WriteEnableCh() : g_record_ch = %4x\n", g_record_ch);
    sdk_ok(zv_EnableVideoRecordChannels(zv_handle, g_record_ch), "ERROR:zv_EnableVideoRecordChannels Error!");
  }
  if (g_audio_ch) {
    std::printf("WriteEnableCh() : g_audio_ch= %4x\n", g_audio_ch);
    sdk_ok(zv_EnableAudioChannels(zv_handle, g_audio_ch), kAudioChannelsError);
  }
  usleep(300);
}

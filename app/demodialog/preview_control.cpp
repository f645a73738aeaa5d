// Starts and stops the preview; sets split, standard and resolution.
#include <cstdlib>

#include "app_state.h"
#include "demodialog.h"
#include "preview_thread.h"
#include "zv_lib.h"

namespace {

void show_split(ZV_VIDEO_MODE mode) {
  const std::lock_guard lock(layout_mutex);
  zv_mode = mode;
  sdk_ok(zv_SetPreviewMode(zv_handle, zv_mode), "ERROR:zv_SetPreviewMode Error!");
}

void show_standard(ZV_VIDEO_STANDARD standard) {
  const std::lock_guard lock(layout_mutex);
  zv_format = standard;
  g_height = input_lines();
  sdk_ok(zv_SetVideoStandard(zv_handle, zv_format), "ERROR:zv_SetVideoStandard Error!");
}

}  // namespace

void DemoDialog::StartPreview() {
  if (!start_preview_thread()) {
    std::puts("Create pthread error");
    std::exit(1);
  }
  g_finish_preview = 0;
  UpdateUI(PREVIEW_START);
}

void DemoDialog::StopPreview() {
  stop_preview_thread();
  g_finish_preview = 1;
  UpdateUI(PREVIEW_STOP);
}

void DemoDialog::PreviewSplit1() {
  show_split(MUX_MODE_ZV_1CH);
}
void DemoDialog::PreviewSplit4() {
  show_split(MUX_MODE_ZV_4CH);
}
void DemoDialog::PreviewSplit6() {
  show_split(MUX_MODE_ZV_6CH);
}
void DemoDialog::PreviewSplit8() {
  show_split(MUX_MODE_ZV_8CH);
}
void DemoDialog::PreviewSplit9() {
  show_split(MUX_MODE_ZV_9CH);
}
void DemoDialog::PreviewSplit16() {
  show_split(MUX_MODE_ZV_16CH);
}

void DemoDialog::CheckFormat() {
  const ZV_VIDEO_STANDARD standard = radioNTSC->isChecked() ? VIDEO_STANDARD_ZV_NTSC : VIDEO_STANDARD_ZV_PAL;
  comboFrameRate->clear();
  comboFrameRate->addItems(frame_rate_labels(standard));
  zv_config.interval = static_cast<ZV_INTERVAL_VALUE>(0);
  comboFrameRate->setCurrentIndex(0);
  show_standard(standard);
}

void DemoDialog::ChangeResolution() {
  const std::lock_guard lock(layout_mutex);
  zv_resolution = radio720->isChecked() ? RESOLUTION_ZV_720 : RESOLUTION_ZV_704;
  g_width = input_width();
  sdk_ok(zv_SetResolution(zv_handle, zv_resolution), "ERROR:zv_zv_SetResolution Error!");
}

/**
 * @file dialog_fixture.h
 * The dialog on the virtual card, offscreen. Each test starts with a card at power-up and with the module
 * state of a new program, and leaves no descriptor and no mapping behind.
 */
#ifndef DIALOG_FIXTURE_H
#define DIALOG_FIXTURE_H

#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <string>

#include "app_state.h"
#include "demodialog.h"
#include "support.h"
#include "virtual_card.h"

/// The dialog with its protected functions in reach.
class OpenDialog : public DemoDialog {
 public:
  using DemoDialog::CheckCheckBox, DemoDialog::CloseFile, DemoDialog::OpenFile, DemoDialog::UpdateUI,
      DemoDialog::WriteVideoRecordConfig;
};

inline void reset_module_state() {
  zv_format = VIDEO_STANDARD_ZV_NTSC;
  zv_resolution = RESOLUTION_ZV_720;
  zv_mode = MUX_MODE_ZV_1CH;
  zv_record_mode = VIDEO_CODEC_ZV_MPEG4;
  g_finish_preview = g_finish_record = 1;
  g_width = g_record_width = 720;
  g_height = g_record_height = 480;
  g_preview_ch = 0xFFFF;
  g_record_ch = g_audio_ch = 0;
  g_channel_mode = ENABLE_PREVIEW;
  zv_config = {};
  std::strcpy(g_filepath, "./Data");
  g_min_diskspace = 10;
  g_time_interval = 10000;
  ttt = lenlen = 0;
}

template <typename Dialog>
class DialogTestOf : public testing::Test {
 protected:
  void SetUp() override {
    virtual_card::reset();
    reset_module_state();
    dialog = std::make_unique<Dialog>();
    dialog->show();
  }
  void TearDown() override {
    dialog.reset();
    EXPECT_EQ(virtual_card::open_descriptors(), 0);
    EXPECT_EQ(virtual_card::open_mappings(), 0);
  }

  std::unique_ptr<Dialog> dialog;
};

using DialogTest = DialogTestOf<OpenDialog>;

/// Chooses an item as the operator does; setting the index by program sends no signal.
inline void choose(QComboBox *combo, int index) {
  combo->setCurrentIndex(index);
  emit combo->activated(index);
}

/// The function that one of this program passes its calls on to.
template <typename Function>
Function *real(const char *name, Function &) {
  return reinterpret_cast<Function *>(dlsym(RTLD_NEXT, name));
}

#endif

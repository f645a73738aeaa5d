#include "dialog_fixture.h"

namespace {

using Channels = DialogTest;

unsigned enabled_boxes() {
  unsigned mask = 0;
  for (unsigned n = 0; n < ZV_CHANNELS; ++n) mask |= (g_check_handle[n]->isEnabled() ? 1u : 0u) << n;
  return mask;
}

// At the start the boxes do not show the preview set: the first click replaces it.
TEST_F(Channels, PreviewSetReachesTheCardOnEveryClick) {
  EXPECT_EQ(printed_by([&] { g_check_handle[2]->click(); }), "ChSettingChange(): g_preview_ch =    4\n");
  g_preview_ch = 0xFFFF;
  dialog->radioEnPreview->click();
  virtual_card::record_log(true);
  EXPECT_EQ(printed_by([&] { g_check_handle[0]->click(); }), "ChSettingChange(): g_preview_ch = fffe\n");
  unsigned windows = 0;
  for (const auto &command : virtual_card::log()) {
    if (command.argument.size() == 32 && command.argument[28]) windows |= 1u << command.argument[0];
  }
  EXPECT_EQ(windows, 0xFFFEu);
}

TEST_F(Channels, EachModeKeepsItsOwnSet) {
  choose(dialog->comboQualityMode, 1);
  dialog->radioEnAudio->click();
  EXPECT_EQ(enabled_boxes(), 0x000Fu);
  g_check_handle[1]->click();
  g_check_handle[9]->click();  // disabled
  EXPECT_EQ(printed_by([&] { g_check_handle[2]->click(); }), "g_audio_ch = 6\n");
  dialog->radioEnRecord->click();
  EXPECT_EQ(printed_by([&] { g_check_handle[15]->click(); }), "g_record_ch = 7fff\n");
  dialog->radioEnPreview->click();
  EXPECT_EQ(dialog->CheckCheckBox(), 0xFFFFu);
  EXPECT_EQ(printed_by([&] { dialog->radioEnAudio->click(); }), "g_audio_ch = 6\n");
  EXPECT_EQ(dialog->CheckCheckBox(), 6u);
  EXPECT_EQ(dialog->ChecksGroup->title(), "Audio");
  dialog->radioEnRecord->click();
  EXPECT_EQ(dialog->CheckCheckBox(), 0x7FFFu);
  EXPECT_EQ(enabled_boxes(), 0xFFFFu);
}

// Fault: radio buttons that refuse to be unchecked would show a mode that is not edited.
TEST_F(Channels, StatusIsShownReadOnlyAndLeavesTheModes) {
  virtual_card::apply("lost=3");
  virtual_card::script_motion(0x8005);
  dialog->radioEnPreview->click();
  EXPECT_EQ(printed_by([&] { dialog->btnVideoStatus->click(); }), "g_video_ch = 4\n");
  EXPECT_EQ(dialog->CheckCheckBox(), 4u);
  EXPECT_FALSE(dialog->radioEnPreview->isChecked());
  EXPECT_EQ(printed_by([&] { dialog->btnMotionStatus->click(); }), "g_motion_ch = 8001\n");
  EXPECT_EQ(dialog->ChecksGroup->title(), "Motion");
  EXPECT_EQ(enabled_boxes(), 0u);
  dialog->radioEnPreview->click();
  EXPECT_EQ(enabled_boxes(), 0xFFFFu);
  EXPECT_EQ(dialog->CheckCheckBox(), 0xFFFFu);
  for (const bool on : {true, false}) {
    (on ? dialog->btnMotionStart : dialog->btnMotionStop)->click();
    EXPECT_EQ(dialog->btnMotionStop->isEnabled(), on);
  }
}

}  // namespace

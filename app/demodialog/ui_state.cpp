// Enables and disables widgets when an activity starts or stops.
#include <optional>
#include <vector>

#include "app_state.h"
#include "demodialog.h"
#include "manners.h"

namespace {

struct Row {
  std::vector<QWidget *> widgets;
  const char *effect;  // one character for each UI_STATUS
};

// Returns what a character of an effect means: true enables, false disables, no value changes nothing.
std::optional<bool> meaning_of(char sign) {
  switch (sign) {
    case '+':
      return true;
    case '-':
      return false;
    case 'r':
      return g_finish_record != 0;
    case 'p':
      return g_finish_preview != 0;
    case 'a':
      return g_channel_mode != ENABLE_AUDIO;
    default:
      return std::nullopt;
  }
}

}  // namespace

// Characters: + enables, - disables, blank changes nothing. r enables if no recording runs, p if no preview
// runs, a if the boxes do not show the audio inputs; otherwise they disable.
void DemoDialog::UpdateUI(UI_STATUS status) {
  const std::vector<QWidget *> first_four(g_check_handle, g_check_handle + 4);
  const std::vector<QWidget *> other_twelve(g_check_handle + 4, g_check_handle + 16);
  const Row table[] = {
      // Two columns each, start and stop: preview, recording, playback, motion.
      {{btnPreviewStart}, "-+      "},
      {{btnPreviewStop}, "+-      "},
      {{radioNTSC, radioPAL, radio720, radio704}, "-r-p    "},
      {{btnRecordStart}, "  -+-+  "},
      {{btnRecordStop}, "  +-    "},
      {{btnPlayback}, "  -+    "},
      {{comboQualityMode, comboFrameRate, comboCodec, comboJpegQuality}, "  -+    "},
      {{combowTwoField, comboCBRValue, comboGOPValue, comboQPvalue}, "  -+    "},
      {{radioEnPreview, radioEnRecord, radioEnAudio}, "  -+    "},
      {first_four, "  -+    "},
      {other_twelve, "  -a    "},
      {{btnMotionStart}, "      -+"},
      {{btnMotionStop}, "      +-"},
  };
  const auto column = static_cast<unsigned int>(status);
  if (column > MOTION_STOP) return;
  const std::vector<StartStop> partners = {
      {btnPreviewStart, btnPreviewStop}, {btnRecordStart, btnRecordStop}, {btnMotionStart, btnMotionStop}};
  for (const bool on : {true, false}) {  // enable first, so that a partner can take the focus
    for (const Row &row : table) {
      if (meaning_of(row.effect[column]) != on) continue;
      for (QWidget *widget : row.widgets) {
        if (!on) pass_focus(partners, widget);
        widget->setEnabled(on);
      }
    }
  }
}

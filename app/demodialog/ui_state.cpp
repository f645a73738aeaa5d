// Enables and disables widgets when an activity starts or stops.
#include <vector>

#include "app_state.h"
#include "demodialog.h"

namespace {

struct Row {
  std::vector<QWidget *> widgets;
  const char *effect;  // one character for each UI_STATUS
};

// Enables or disables the widgets of a row as a character of its effect says.
void apply(const Row &row, char sign) {
  bool on = false;
  switch (sign) {
    case '+':
      on = true;
      break;
    case '-':
      break;
    case 'r':
      on = g_finish_record != 0;
      break;
    case 'p':
      on = g_finish_preview != 0;
      break;
    case 'a':
      on = g_channel_mode != ENABLE_AUDIO;
      break;
    default:
      return;
  }
  for (QWidget *widget : row.widgets) widget->setEnabled(on);
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
  for (const Row &row : table) apply(row, row.effect[column]);
}

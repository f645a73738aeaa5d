#include <vector>

#include "app_state.h"
#include "demodialog.h"

namespace {

struct Row {
  std::vector<QWidget *> widgets;
  const char *effect;  // one sign for each UI_STATUS
};

// What a sign of the table does to the enabled state of the row's widgets.
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

// + on, - off, blank as it was; on only if: r no recording runs, p no preview runs, a the boxes do
// not show the audio inputs.
void DemoDialog::UpdateUI(UI_STATUS status) {
  const std::vector<QWidget *> first_four(g_check_handle, g_check_handle + 4);
  const std::vector<QWidget *> other_twelve(g_check_handle + 4, g_check_handle + 16);
  const Row table[] = {
      // preview, recording, playback, motion: start and stop of each
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

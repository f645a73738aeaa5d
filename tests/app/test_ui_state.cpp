// Which widgets an activity's start and stop switches, with the other activities running or not.
#include <QRegularExpression>
#include <QStringList>

#include "dialog_fixture.h"

namespace {

const std::string kFormat = "radioNTSC radioPAL radio720 radio704 ";
const std::string kFour = "checkCh1 checkCh2 checkCh3 checkCh4 ";
const std::string kTwelve =
    "checkCh5 checkCh6 checkCh7 checkCh8 checkCh9 checkCh10 checkCh11 checkCh12 checkCh13 checkCh14 "
    "checkCh15 "
    "checkCh16 ";
const std::string kRecording =
    "btnRecordStart btnPlayback comboQualityMode comboFrameRate comboCodec comboJpegQuality combowTwoField "
    "comboCBRValue comboGOPValue comboQPvalue radioEnPreview radioEnRecord radioEnAudio " +
    kFour;

struct Case {
  UI_STATUS status;
  bool preview_runs, recording_runs, audio_shown;
  std::string on, off;
};

class UiStateTest : public DialogTest {
 protected:
  // The widgets that `status` switches when all of them were switched the other way before.
  std::string switched(UI_STATUS status, bool to) {
    const auto widgets =
        dialog->findChildren<QWidget *>(QRegularExpression("^(btn|bti|radio|check|combo|edt|slider)"));
    for (QWidget *widget : widgets) widget->setEnabled(!to);
    dialog->UpdateUI(status);
    QStringList names;
    for (const QWidget *widget : widgets)
      if (widget->isEnabled() == to) names << widget->objectName();
    return sorted(names);
  }
  static std::string sorted(QStringList names) {
    names.sort();
    return names.join(' ').toStdString();
  }
  static std::string sorted(const std::string &names) {
    return sorted(QString::fromStdString(names).split(' ', Qt::SkipEmptyParts));
  }
};

TEST_F(UiStateTest, SwitchesTheWidgetsOfEachActivity) {
  const Case cases[] = {
      {PREVIEW_START, true, false, false, "btnPreviewStop", "btnPreviewStart " + kFormat},
      {PREVIEW_STOP, false, false, false, "btnPreviewStart " + kFormat, "btnPreviewStop"},
      {PREVIEW_STOP, false, true, false, "btnPreviewStart", "btnPreviewStop " + kFormat},
      {RECORD_START, false, true, false, "btnRecordStop", kRecording + kTwelve + kFormat},
      {RECORD_STOP, false, false, false, kRecording + kTwelve + kFormat, "btnRecordStop"},
      {RECORD_STOP, true, false, false, kRecording + kTwelve, "btnRecordStop " + kFormat},
      {RECORD_STOP, false, false, true, kRecording + kFormat, "btnRecordStop " + kTwelve},
      {PLAYBACK_START, false, false, false, "", "btnRecordStart"},
      {PLAYBACK_STOP, false, false, false, "btnRecordStart", ""},
      {MOTION_START, false, false, false, "btnMotionStop", "btnMotionStart"},
      {MOTION_STOP, false, false, false, "btnMotionStart", "btnMotionStop"},
  };
  for (const Case &expected : cases) {
    g_finish_preview = expected.preview_runs ? 0 : 1;
    g_finish_record = expected.recording_runs ? 0 : 1;
    g_channel_mode = expected.audio_shown ? ENABLE_AUDIO : ENABLE_RECORD;
    SCOPED_TRACE(testing::Message() << "status " << expected.status << " preview " << expected.preview_runs
                                    << " recording " << expected.recording_runs);
    EXPECT_EQ(switched(expected.status, true), sorted(expected.on));
    EXPECT_EQ(switched(expected.status, false), sorted(expected.off));
  }
  g_finish_preview = g_finish_record = 1;
}

}  // namespace

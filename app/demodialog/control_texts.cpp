// What a screen reader says about the controls of the dialog, and what Shift+F1 shows.
#include "control_texts.h"

#include <QCoreApplication>
#include <QGroupBox>
#include <QRegularExpression>

namespace {

/// A control: its object name, in which # stands for a number; its accessible name, in which %1 stands for
/// that number; unit and range, or what it does; when it counts.
struct ControlText {
  const char *control;
  const char *name;
  const char *range;
  const char *counts;
};

constexpr char kAtNextStart[] =
    QT_TRANSLATE_NOOP("DemoDialog", "Takes effect for the previews and recordings that start next.");
constexpr char kForAllStreams[] = QT_TRANSLATE_NOOP(
    "DemoDialog", "Takes effect for the previews and recordings that start next; Frame Rate starts anew.");
constexpr char kAtOnce[] = QT_TRANSLATE_NOOP("DemoDialog", "Takes effect at once.");
constexpr char kAtRecordStart[] =
    QT_TRANSLATE_NOOP("DemoDialog", "Takes effect at the next start of a recording.");
constexpr char kWithSet[] = QT_TRANSLATE_NOOP("DemoDialog", "Takes effect when Set is pressed.");
constexpr char kWithChange[] = QT_TRANSLATE_NOOP("DemoDialog", "Takes effect when Change is pressed.");
constexpr char kWithSetQp[] =
    QT_TRANSLATE_NOOP("DemoDialog", "Takes effect when Set QP is pressed, for the next recording.");
constexpr char kForSetAndGet[] = QT_TRANSLATE_NOOP("DemoDialog", "Set and Get use this channel.");
constexpr char kChannels[] = QT_TRANSLATE_NOOP("DemoDialog", "channel, 1 to 16");
constexpr char kPixelsAcross[] = QT_TRANSLATE_NOOP("DemoDialog", "pixels from the left, 0 to 720 or 704");
constexpr char kLinesDown[] =
    QT_TRANSLATE_NOOP("DemoDialog", "lines from the top, 0 to 480 (NTSC) or 576 (PAL)");
constexpr char kPercent[] = QT_TRANSLATE_NOOP("DemoDialog", "percent, 0 to 200");
constexpr char kReadBack[] = QT_TRANSLATE_NOOP("DemoDialog", "Shown when a recording starts.");

constexpr ControlText kTexts[] = {
#define T(text) QT_TRANSLATE_NOOP("DemoDialog", text)
    {"radioNTSC", T("NTSC"), T("30 pictures a second, 480 lines"), kForAllStreams},
    {"radioPAL", T("PAL"), T("25 pictures a second, 576 lines"), kForAllStreams},
    {"radio720", T("720"), T("pixels in a line"), kAtNextStart},
    {"radio704", T("704"), T("pixels in a line"), kAtNextStart},
    {"btnPreviewStart", T("Start preview"), T("opens the preview window"), kAtOnce},
    {"btnPreviewStop", T("Stop preview"), T("closes the preview window"), kAtOnce},
    {"btnSplit#", T("Split %1"), T("number of pictures in the preview window"), kAtOnce},
    {"radioEnPreview", T("Enable Preview"), T("the channel boxes show and change what the preview shows"),
     kAtOnce},
    {"radioEnAudio", T("Enable Audio"),
     T("channel boxes 1 to 4 show and change which audio inputs are recorded"), kAtRecordStart},
    {"radioEnRecord", T("Enable Record"), T("the channel boxes show and change which channels are recorded"),
     kAtRecordStart},
    {"btnVideoStatus", T("Video status"), T("the channel boxes show which channels have no video"), kAtOnce},
    {"btnMotionStatus", T("Motion status"), T("the channel boxes show which channels have motion"), kAtOnce},
    {"ChecksGroup", T("Channels"), T("the set that Channels Setting or Channels Status has chosen"), kAtOnce},
    {"checkCh#", T("Channel %1"), T("the set that Channels Setting or Channels Status has chosen"),
     T("The preview follows at once; record and audio sets take effect at the next start of a recording.")},
    {"comboMotion", T("Sensitivity: channel"), kChannels, kForSetAndGet},
    {"edtSensitivity", T("Sensitivity"),
     T("threshold, 0 to 65535; a small number reports more motion, 65535 reports none"), kWithSet},
    {"btnSetSensitivity", T("Set sensitivity"),
     T("sends the threshold and forgets the channel's motion areas"), kAtOnce},
    {"btnGetSensitivity", T("Get sensitivity"), T("reads the threshold from the card"), kAtOnce},
    {"comboMotionArea", T("Motion area: channel"), kChannels, T("Set uses this channel.")},
    {"checkMotionArea", T("Mark"),
     T("checked: motion in the area is ignored; unchecked: it is reported again"), kWithSet},
    {"btnSetMotionArea", T("Set motion area"), T("sends the area to the card"), kAtOnce},
    {"edtMLeft", T("Motion area: left"), kPixelsAcross, kWithSet},
    {"edtMRight", T("Motion area: right"), kPixelsAcross, kWithSet},
    {"edtMTop", T("Motion area: top"), kLinesDown, kWithSet},
    {"edtMBottom", T("Motion area: bottom"), kLinesDown, kWithSet},
    {"btnMotionStart", T("Start motion detection"), T("marks motion in the preview"), kAtOnce},
    {"btnMotionStop", T("Stop motion detection"), T("ends the marks in the preview"), kAtOnce},
    {"comboProperty", T("Video property: channel"), kChannels, kForSetAndGet},
    {"btnSetProperty", T("Set video property"), T("sends the four values to the card"), kAtOnce},
    {"btnGetProperty", T("Get video property"), T("reads the four values from the card"), kAtOnce},
    {"sliderHue", T("Hue"), T("degrees, -180 to 180"), kWithSet},
    {"edtHue", T("Hue"), T("degrees, -180 to 180"), kWithSet},
    {"sliderSaturation", T("Saturation"), kPercent, kWithSet},
    {"edtSaturation", T("Saturation"), kPercent, kWithSet},
    {"sliderContrast", T("Contrast"), kPercent, kWithSet},
    {"edtContrast", T("Contrast"), kPercent, kWithSet},
    {"sliderBrightness", T("Brightness"), T("percent, -25 to 25"), kWithSet},
    {"edtBrightness", T("Brightness"), T("percent, -25 to 25"), kWithSet},
    {"comboQualityMode", T("Quality"), T("picture size: CIF, half D1 or D1; None records nothing"),
     T("Selects at once the channels that fit. The size counts at the next start of a recording.")},
    {"comboFrameRate", T("Frame Rate"), T("pictures a second"), kAtRecordStart},
    {"comboCodec", T("Video Codec"), T("MPEG4 or Motion JPEG"), kAtRecordStart},
    {"comboJpegQuality", T("JPEG Quality"), T("low or high, for Motion JPEG"), kAtRecordStart},
    {"combowTwoField", T("Field"), T("one or two fields of each frame"), kAtRecordStart},
    {"comboCBRValue", T("bps: bit rate"), T("bits a second; VBR sets no rate"), kAtRecordStart},
    {"comboQPvalue", T("QP: quantiser"), T("1 (best picture) to 30; excludes a bit rate"), kAtRecordStart},
    {"comboGOPValue", T("GOP: group of pictures"), T("frames from one whole picture to the next"),
     kAtRecordStart},
    {"edtQPMax", T("MAX: highest quantiser"), T("1 to 29; with 30 or more no limits are sent"), kWithSetQp},
    {"edtQPMin", T("MIN: lowest quantiser"), T("1 or more, less than MAX"), kWithSetQp},
    {"btnSetQPMinMax", T("Set QP"),
     T("keeps the limits of the quantiser; without a valid pair there are none"), kAtRecordStart},
    {"edtScale", T("Scale in use"), T("picture size of the recording"), kReadBack},
    {"edtFrameRate", T("GOP in use"), T("frames from one whole picture to the next"), kReadBack},
    {"edtQuallity", T("QP in use"), T("quantiser of the recording"), kReadBack},
    {"edtBitRate", T("Interval in use"), T("number of the entry in the list of frame rates, from 0"),
     kReadBack},
    {"comboShield", T("Mask: channel"), kChannels, kForSetAndGet},
    {"btnSetShield", T("Set mask"), T("hides the rectangle; four times 0 removes the mask"), kAtOnce},
    {"btnGetShield", T("Get mask"), T("reads the rectangle from the card"), kAtOnce},
    {"edtLeft", T("Mask: left"), kPixelsAcross, kWithSet},
    {"edtRight", T("Mask: right"), kPixelsAcross, kWithSet},
    {"edtTop", T("Mask: top"), kLinesDown, kWithSet},
    {"edtBottom", T("Mask: bottom"), kLinesDown, kWithSet},
    {"edtFocus", T("Focus channel"), kChannels, kWithSet},
    {"btnSetFocus", T("Set focus channel"), T("shows this channel in the first picture of the split"),
     kAtOnce},
    {"btiGetFocus", T("Get focus channel"), T("reads the channel from the card"), kAtOnce},
    {"edtDiskLimit", T("Disk space limited"), T("percent, 10 to 100; with less free space recording stops"),
     kWithChange},
    {"edtTime", T("Check period"), T("seconds, 1 to 59, from check to check of disk space and hour"),
     T("Takes effect when Change is pressed, for the next recording.")},
    {"edtRecordPath", T("Path"), T("folder of the recordings; it must exist"), kWithChange},
    {"btnFolder", T("Change record settings"), T("takes path, disk space and check period"), kAtOnce},
    {"btnRecordStart", T("Start recording"),
     T("begins the files of this hour; what they hold from an earlier start is overwritten"), kAtOnce},
    {"btnRecordStop", T("Stop recording"), T("completes the files"), kAtOnce},
    {"btnPlayback", T("Open recording"), T("plays a file; the dialog waits for the end of the player"),
     kAtOnce},
#undef T
};

QString translated(const char *text) {
  return QCoreApplication::translate("DemoDialog", text);
}

}  // namespace

void set_control_texts(const QWidget &dialog) {
  static const QRegularExpression number(QStringLiteral("\\d+$"));
  for (QWidget *widget : dialog.findChildren<QWidget *>()) {
    QString pattern = widget->objectName();
    const QString digits = number.match(pattern).captured();
    pattern.replace(number, QStringLiteral("#"));
    for (const ControlText &text : kTexts) {
      const QLatin1String control(text.control);
      if (control != pattern && control != widget->objectName()) continue;
      const QString name = translated(text.name).replace(QLatin1String("%1"), digits);
      const QString range = translated(text.range);
      widget->setAccessibleName(name);
      widget->setAccessibleDescription(range);
      widget->setWhatsThis(QStringLiteral("<b>%1</b>: %2. %3").arg(name, range, translated(text.counts)));
    }
  }
}

// The form as the operator sees and uses it: compared with form.txt, which is written from the
// operator's view and not from the form's file.
#include <QApplication>
#include <QFile>
#include <QGridLayout>
#include <QMetaMethod>
#include <QTest>
#include <QTranslator>
#include <map>
#include <vector>

#include "dialog_fixture.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;

std::vector<std::string> lines_of_form(const std::string &kind) {
  QFile file(QStringLiteral(FORM_TABLE));
  if (!file.open(QIODevice::ReadOnly)) ADD_FAILURE() << "no " FORM_TABLE;
  std::vector<std::string> lines;
  for (const QByteArray &line : file.readAll().split('\n')) {
    const bool marked = line.startsWith("tab|") || line.startsWith("connect|") || line.startsWith('#');
    if (kind.empty() ? !marked && !line.isEmpty() : line.startsWith(kind.c_str()))
      lines.push_back(line.mid(static_cast<int>(kind.size())).toStdString());
  }
  return lines;
}

QString joined(std::initializer_list<int> numbers) {
  QStringList texts;
  for (const int number : numbers) texts << QString::number(number);
  return texts.join(',');
}

QString place_of(const QWidget *widget, const QGridLayout *grid) {
  if (qobject_cast<const QGroupBox *>(widget) == nullptr)
    return joined({widget->x(), widget->y(), widget->width(), widget->height()});
  int row, column, rows, columns;
  grid->getItemPosition(grid->indexOf(widget), &row, &column, &rows, &columns);
  return joined({row, column, rows, columns});
}

QString text_of(const QWidget *widget) {
  if (const auto *combo = qobject_cast<const QComboBox *>(widget)) {
    QStringList items;
    for (int n = 0; n < combo->count(); ++n) items << combo->itemText(n);
    return items.join(',');
  }
  const char *const name = qobject_cast<const QGroupBox *>(widget) != nullptr ? "title" : "text";
  return widget->property(name).toString();
}

QString special_of(const QWidget *widget) {
  QStringList words;
  if (!widget->isEnabled()) words << "disabled";
  // A colour nobody sees is no colour: the disabled palette counts for what is always disabled.
  const auto state = widget->isEnabled() ? QPalette::Active : QPalette::Disabled;
  if (widget->testAttribute(Qt::WA_SetPalette))
    words << widget->palette().color(state, QPalette::Text).name();
  const auto alignment = widget->property("alignment").toInt();
  if (qobject_cast<const QGroupBox *>(widget) == nullptr) {
    if ((alignment & Qt::AlignHCenter) != 0) words << "centred";
    if ((alignment & Qt::AlignRight) != 0) words << "right";
  }
  if (const auto *slider = qobject_cast<const QSlider *>(widget))
    words << QString("%1..%2 at %3").arg(slider->minimum()).arg(slider->maximum()).arg(slider->value())
          << (slider->orientation() == Qt::Horizontal ? "" : "upright");
  if (widget->property("checked").toBool()) words << "checked";
  if (!widget->toolTip().isEmpty()) words << "tip " + widget->toolTip();
  words.removeAll("");
  return words.join(' ');
}

template <typename Widget>
QList<Widget *> children_of(const QWidget *parent) {
  return parent->findChildren<Widget *>(QString(), Qt::FindDirectChildrenOnly);
}

TEST_F(DialogTest, ShowsTheFormOfTheTable) {
  std::vector<std::string> found;
  const auto describe = [&](const QWidget *widget) {
    const QStringList columns = {widget->objectName(), widget->metaObject()->className(),
                                 place_of(widget, dialog->DemoDialogLayout), text_of(widget),
                                 special_of(widget)};
    found.push_back(columns.join('|').toStdString());
  };
  for (const QGroupBox *group : children_of<QGroupBox>(dialog.get())) {
    describe(group);
    for (const QWidget *child : children_of<QWidget>(group)) describe(child);
  }
  EXPECT_THAT(found, ElementsAreArray(lines_of_form("")));
  EXPECT_EQ(dialog->windowTitle(), "Tarn Demo");
  EXPECT_EQ(dialog->objectName(), "DemoDialog");
  EXPECT_EQ(dialog->DemoDialogLayout->contentsMargins(), QMargins(11, 11, 11, 11));
  EXPECT_EQ(dialog->DemoDialogLayout->spacing(), 6);
  EXPECT_EQ(dialog->PlaybackGroup->maximumSize(), QSize(32767, 32767));
  EXPECT_GE(dialog->width(), 728);
  EXPECT_GE(dialog->height(), 780);
}

TEST_F(DialogTest, TabGoesThroughTheListedWidgetsInOrder) {
  const std::vector<std::string> listed = lines_of_form("tab|");
  std::vector<std::string> found;
  const QWidget *widget = dialog->radioNTSC;
  do {
    const std::string name = widget->objectName().toStdString();
    if (std::find(listed.begin(), listed.end(), name) != listed.end()) found.push_back(name);
    widget = widget->nextInFocusChain();
  } while (widget != dialog->radioNTSC);
  EXPECT_THAT(found, ElementsAreArray(listed));
}

TEST_F(DialogTest, SlotsKeepTheirNumbers) {
  const QMetaObject &meta = DemoDialog::staticMetaObject;
  std::vector<std::string> slots_found;
  for (int n = meta.methodOffset(); n < meta.methodCount(); ++n) {
    EXPECT_EQ(meta.method(n).methodType(), QMetaMethod::Slot);
    EXPECT_EQ(meta.method(n).access() == QMetaMethod::Public, n + 1 < meta.methodCount()) << n;
    slots_found.push_back(meta.method(n).methodSignature().toStdString());
  }
  EXPECT_THAT(
      slots_found,
      ElementsAre("ExitDialog()", "StartPreview()", "StopPreview()", "CheckFormat()", "ChangeResolution()",
                  "PreviewSplit1()", "PreviewSplit4()", "PreviewSplit6()", "PreviewSplit8()",
                  "PreviewSplit9()", "PreviewSplit16()", "EnablePreview()", "EnableAudio()", "EnableRecord()",
                  "ChSettingChange()", "SetCheckBox(uint)", "GetVideoStatus()", "GetMotionStatus()",
                  "StartMotion()", "StopMotion()", "GetSensitivity()", "SetSensitivity()", "SetProperty()",
                  "GetProperty()", "UpdatePropertyEdt()", "UpdatePropertySlider()", "UpdateEncodeInfo()",
                  "UpdateCodecInfo()", "UpdateFrameRate()", "SetShield()", "GetShield()", "SetFocus()",
                  "GetFocus()", "StartRecord()", "StopRecord()", "Playback()", "TimerTick()", "UpdatePath()",
                  "CheckFolder(char*)", "UpdateDiskLimit()", "UpdateTimeInterval()", "SetMotionArea()",
                  "SetTwoField()", "UpdateJpegQuality()", "SetQPMinMax()", "SetCBRbps()", "SetQP()",
                  "SetGOP()", "languageChange()"));
  EXPECT_EQ(meta.propertyCount(), meta.propertyOffset());
}

// Writes down which slots are reached instead of running them.
#define WRITTEN_DOWN(slot)  \
  void slot() override {    \
    calls.push_back(#slot); \
  }
class ListeningDialog : public DemoDialog {
 public:
  std::vector<std::string> calls;
  // clang-format off
  WRITTEN_DOWN(StartPreview) WRITTEN_DOWN(StopPreview) WRITTEN_DOWN(CheckFormat) WRITTEN_DOWN(ChangeResolution)
  WRITTEN_DOWN(PreviewSplit1) WRITTEN_DOWN(PreviewSplit4) WRITTEN_DOWN(PreviewSplit6) WRITTEN_DOWN(PreviewSplit8)
  WRITTEN_DOWN(PreviewSplit9) WRITTEN_DOWN(PreviewSplit16) WRITTEN_DOWN(EnablePreview) WRITTEN_DOWN(EnableAudio)
  WRITTEN_DOWN(EnableRecord) WRITTEN_DOWN(ChSettingChange) WRITTEN_DOWN(GetVideoStatus)
  WRITTEN_DOWN(GetMotionStatus) WRITTEN_DOWN(StartMotion) WRITTEN_DOWN(StopMotion) WRITTEN_DOWN(GetSensitivity)
  WRITTEN_DOWN(SetSensitivity) WRITTEN_DOWN(SetProperty) WRITTEN_DOWN(GetProperty) WRITTEN_DOWN(UpdatePropertyEdt)
  WRITTEN_DOWN(UpdatePropertySlider) WRITTEN_DOWN(UpdateEncodeInfo) WRITTEN_DOWN(UpdateCodecInfo)
  WRITTEN_DOWN(UpdateFrameRate) WRITTEN_DOWN(SetShield) WRITTEN_DOWN(GetShield) WRITTEN_DOWN(SetFocus)
  WRITTEN_DOWN(GetFocus) WRITTEN_DOWN(StartRecord) WRITTEN_DOWN(StopRecord) WRITTEN_DOWN(Playback)
  WRITTEN_DOWN(UpdatePath) WRITTEN_DOWN(SetMotionArea) WRITTEN_DOWN(SetTwoField) WRITTEN_DOWN(UpdateJpegQuality)
  WRITTEN_DOWN(SetQPMinMax) WRITTEN_DOWN(SetCBRbps) WRITTEN_DOWN(SetQP) WRITTEN_DOWN(SetGOP) WRITTEN_DOWN(TimerTick)
  WRITTEN_DOWN(UpdateDiskLimit) WRITTEN_DOWN(UpdateTimeInterval)
  // clang-format on
};
using ConnectionTest = DialogTestOf<ListeningDialog>;

void use(QWidget *widget) {
  widget->setEnabled(true);
  if (auto *combo = qobject_cast<QComboBox *>(widget))
    QTest::keyClick(combo, Qt::Key_End);
  else if (auto *button = qobject_cast<QAbstractButton *>(widget))
    button->click();
  else if (auto *slider = qobject_cast<QSlider *>(widget))
    QTest::keyClick(slider, Qt::Key_Left);
  else if (auto *edit = qobject_cast<QLineEdit *>(widget))
    QTest::keyClick(edit, Qt::Key_7);
}

// A connection made twice, by name and by the form, or one left out would show here.
TEST_F(ConnectionTest, EachSenderReachesItsSlotOnceAndTheOthersNone) {
  std::map<std::string, std::vector<std::string>> connections;
  for (const std::string &line : lines_of_form("connect|"))
    connections[line.substr(0, line.find('|'))] = {line.substr(line.find('|') + 1)};
  for (const QGroupBox *group : children_of<QGroupBox>(dialog.get()))
    for (QWidget *widget : children_of<QWidget>(group)) {
      dialog->calls.clear();
      use(widget);
      const std::string name = widget->objectName().toStdString();
      EXPECT_THAT(dialog->calls, ElementsAreArray(connections[name])) << name;
    }
  // What the program itself chooses and checks is no choice of the operator.
  dialog->calls.clear();
  for (QComboBox *combo : dialog->findChildren<QComboBox *>()) combo->setCurrentIndex(0);
  for (QCheckBox *box : dialog->findChildren<QCheckBox *>()) box->toggle();
  EXPECT_THAT(dialog->calls, ElementsAre());
  QMetaObject::invokeMethod(&timer, "timeout");
  EXPECT_THAT(dialog->calls, ElementsAre("TimerTick"));
}

// Puts a mark before each text of the dialog.
class Marker : public QTranslator {
 public:
  bool isEmpty() const override { return false; }
  QString translate(const char *context, const char *text, const char *, int) const override {
    return qstrcmp(context, "DemoDialog") == 0 ? QString("~") + text : QString();
  }
};

TEST_F(DialogTest, AnotherLanguageReplacesEachTextAndKeepsTheChoices) {
  dialog->comboCBRValue->setCurrentIndex(5);
  dialog->comboFrameRate->setCurrentIndex(3);
  Marker marker;
  QApplication::installTranslator(&marker);
  QApplication::sendPostedEvents();
  EXPECT_EQ(dialog->windowTitle(), "~Tarn Demo");
  EXPECT_EQ(dialog->btnVideoStatus->text(), "~Viedo");
  EXPECT_EQ(dialog->edtScale->toolTip(), "~\"1:Half-D1\"  \"2:CIF\"  \"9:D1\"");
  QApplication::removeTranslator(&marker);
  dialog->languageChange();
  EXPECT_EQ(text_of(dialog->comboQualityMode), "None,CIF,Half-D1,D1");
  EXPECT_EQ(dialog->comboCBRValue->count(), 15);
  EXPECT_EQ(dialog->comboCBRValue->currentText(), "1M");
  EXPECT_EQ(dialog->comboFrameRate->count(), 16);
  EXPECT_EQ(dialog->comboFrameRate->currentText(), "24");
}

QSize room_of_text(const QWidget *widget) {
  if (const auto *combo = qobject_cast<const QComboBox *>(widget))
    return combo->fontMetrics().size(0, combo->currentText()) + QSize(20, 0);
  if (qobject_cast<const QSlider *>(widget) != nullptr) return {};
  const QSize text = widget->fontMetrics().size(0, text_of(widget));
  return qobject_cast<const QPushButton *>(widget) != nullptr ? text + QSize(4, 0) : text;
}

// What of a label is seen is its text; the labels of the form reach under their neighbours.
QRect seen_of(const QWidget *widget) {
  const bool label = qobject_cast<const QLabel *>(widget) != nullptr;
  return label ? QRect(widget->pos(), room_of_text(widget)) : widget->geometry();
}

void expect_nothing_clipped(const DemoDialog &dialog) {
  const auto groups = children_of<QGroupBox>(&dialog);
  for (const QGroupBox *group : groups) {
    EXPECT_TRUE(dialog.rect().contains(group->geometry()));
    for (const QGroupBox *other : groups)
      EXPECT_TRUE(group == other || !group->geometry().intersects(other->geometry()));
    const auto children = children_of<QWidget>(group);
    for (const QWidget *child : children) {
      const std::string name = child->objectName().toStdString();
      EXPECT_TRUE(group->rect().contains(child->geometry())) << name;
      EXPECT_GE(child->y(), group->title().isEmpty() ? 0 : group->fontMetrics().ascent()) << name;
      EXPECT_EQ(child->size().expandedTo(room_of_text(child)), child->size()) << name;
      for (const QWidget *other : children)
        EXPECT_TRUE(child == other || !seen_of(child).intersects(seen_of(other)))
            << name << " over " << other->objectName().toStdString();
    }
  }
}

TEST_F(DialogTest, ClipsNothingAtAnyFontAndSize) {
  const QFont font = dialog->font();
  const QRect place = dialog->btnGetShield->geometry();
  for (const double factor : {1.0, 1.25, 1.6}) {
    QFont larger = font;
    larger.setPointSizeF(font.pointSizeF() * factor);
    dialog->setFont(larger);
    QApplication::processEvents();
    expect_nothing_clipped(*dialog);
    const QSize group = dialog->ChecksGroup->size();
    const QRect child = dialog->checkCh8->geometry();
    dialog->resize(dialog->size() + QSize(300, 200));
    QApplication::processEvents();
    expect_nothing_clipped(*dialog);
    EXPECT_EQ(dialog->checkCh8->geometry(), child);
    EXPECT_GT(dialog->ChecksGroup->width(), group.width());
    dialog->resize(1, 1);
    QApplication::processEvents();
    expect_nothing_clipped(*dialog);
  }
  EXPECT_NE(dialog->btnGetShield->geometry(), place);
  dialog->setFont(font);
  EXPECT_EQ(dialog->btnGetShield->geometry(), place);
}

}  // namespace

// The form as the operator sees and uses it, compared with form.txt, which is written from the
// operator's view and not from the form's file.
#include <QApplication>
#include <QFile>
#include <QGridLayout>
#include <QMetaMethod>
#include <QTest>
#include <QTranslator>
#include <algorithm>
#include <map>

#include "dialog_fixture.h"

namespace {

using testing::ElementsAreArray;
using Names = std::vector<std::string>;

// The lines of form.txt that begin with `kind`, without it.
Names lines_of_form(const QString &kind) {
  QFile file(QStringLiteral(FORM_TABLE));
  EXPECT_TRUE(file.open(QIODevice::ReadOnly));
  Names lines;
  for (const QString &line : QString::fromUtf8(file.readAll()).split('\n'))
    if (line.startsWith(kind + '|')) lines.push_back(line.mid(kind.size() + 1).toStdString());
  return lines;
}

bool is_group(const QWidget *widget) {
  return qobject_cast<const QGroupBox *>(widget) != nullptr;
}

template <typename Widget = QWidget>
QList<Widget *> children_of(const QWidget *parent) {
  return parent->findChildren<Widget *>(QString(), Qt::FindDirectChildrenOnly);
}

QString place_of(const QWidget *widget, const QGridLayout *grid) {
  int x = widget->x(), y = widget->y(), width = widget->width(), height = widget->height();
  if (is_group(widget)) grid->getItemPosition(grid->indexOf(widget), &x, &y, &width, &height);
  return QString("%1,%2,%3,%4").arg(x).arg(y).arg(width).arg(height);
}

QString text_of(const QWidget *widget) {
  QStringList items;
  if (const auto *combo = qobject_cast<const QComboBox *>(widget))
    for (int n = 0; n < combo->count(); ++n) items << combo->itemText(n);
  return items.empty() ? widget->property(is_group(widget) ? "title" : "text").toString() : items.join(',');
}

QString special_of(const QWidget *widget) {
  QStringList words;
  const auto add = [&](bool holds, const QString &word) {
    words += holds ? QStringList(word) : QStringList();
  };
  add(!widget->isEnabled(), "disabled");
  // A colour nobody sees is no colour: the disabled palette counts for what is always disabled.
  const auto state = widget->isEnabled() ? QPalette::Active : QPalette::Disabled;
  add(widget->testAttribute(Qt::WA_SetPalette), widget->palette().color(state, QPalette::Text).name());
  const int alignment = is_group(widget) ? 0 : widget->property("alignment").toInt();
  add((alignment & Qt::AlignHCenter) != 0, "centred");
  add((alignment & Qt::AlignRight) != 0, "right");
  if (const auto *slider = qobject_cast<const QSlider *>(widget))
    add(slider->orientation() == Qt::Horizontal,
        QString("%1..%2 at %3").arg(slider->minimum()).arg(slider->maximum()).arg(slider->value()));
  add(widget->property("checked").toBool(), "checked");
  add(!widget->toolTip().isEmpty(), "tip " + widget->toolTip());
  return words.join(' ');
}

TEST_F(DialogTest, ShowsTheFormOfTheTable) {
  Names found, stops;
  for (QWidget *group : children_of<QGroupBox>(dialog.get()))
    for (const QWidget *widget : QWidgetList{group} + children_of(group)) {
      const QStringList columns = {widget->objectName(), widget->metaObject()->className(),
                                   place_of(widget, dialog->DemoDialogLayout), text_of(widget),
                                   special_of(widget)};
      found.push_back(columns.join('|').toStdString());
    }
  EXPECT_THAT(found, ElementsAreArray(lines_of_form("widget")));
  EXPECT_EQ(dialog->windowTitle() + dialog->objectName(), "Tarn DemoDemoDialog");
  EXPECT_EQ(dialog->DemoDialogLayout->contentsMargins(), QMargins(11, 11, 11, 11));
  EXPECT_EQ(dialog->DemoDialogLayout->spacing(), 6);
  EXPECT_EQ(dialog->size().expandedTo(QSize(728, 780)), dialog->size());

  const Names listed = lines_of_form("tab");
  const QWidget *widget = dialog->radioNTSC;
  do {
    const std::string name = widget->objectName().toStdString();
    if (std::find(listed.begin(), listed.end(), name) != listed.end()) stops.push_back(name);
    widget = widget->nextInFocusChain();
  } while (widget != dialog->radioNTSC);
  EXPECT_THAT(stops, ElementsAreArray(listed));

  Names signatures;
  const QMetaObject &meta = DemoDialog::staticMetaObject;
  for (int n = meta.methodOffset(); n < meta.methodCount(); ++n)
    signatures.push_back(meta.method(n).methodSignature().toStdString());
  EXPECT_THAT(signatures, ElementsAreArray(lines_of_form("slot")));
}

// Writes down which slots are reached instead of running them.
struct ListeningDialog : DemoDialog {
  Names calls;
// clang-format off
#define W(slot) void slot() override { calls.push_back(#slot); }
  W(StartPreview) W(StopPreview) W(CheckFormat) W(ChangeResolution) W(PreviewSplit1) W(PreviewSplit4)
  W(PreviewSplit6) W(PreviewSplit8) W(PreviewSplit9) W(PreviewSplit16) W(EnablePreview) W(EnableAudio)
  W(EnableRecord) W(ChSettingChange) W(GetVideoStatus) W(GetMotionStatus) W(StartMotion) W(StopMotion) W(SetQP)
  W(GetSensitivity) W(SetSensitivity) W(SetProperty) W(GetProperty) W(UpdatePropertyEdt) W(UpdatePropertySlider)
  W(UpdateEncodeInfo) W(UpdateCodecInfo) W(UpdateFrameRate) W(SetShield) W(GetShield) W(SetFocus) W(GetFocus)
  W(StartRecord) W(StopRecord) W(Playback) W(TimerTick) W(UpdatePath) W(UpdateDiskLimit) W(UpdateTimeInterval)
  W(SetMotionArea) W(SetTwoField) W(UpdateJpegQuality) W(SetQPMinMax) W(SetCBRbps) W(SetGOP)
  // clang-format on
};
using ConnectionTest = DialogTestOf<ListeningDialog>;

void use(QWidget *widget) {
  widget->setEnabled(true);
  if (auto *button = qobject_cast<QAbstractButton *>(widget)) return button->click();
  if (qobject_cast<QLineEdit *>(widget) != nullptr) return QTest::keyClicks(widget, "7\r");
  QTest::keyClick(widget, qobject_cast<QSlider *>(widget) != nullptr ? Qt::Key_Left : Qt::Key_End);
}

// A connection made twice, by name and by the form, or one left out would show here; so would a button
// that Return presses out of an edit.
TEST_F(ConnectionTest, EachSenderReachesItsSlotOnceAndTheOthersNone) {
  std::map<std::string, Names> connections;
  for (const std::string &line : lines_of_form("connect"))
    connections[line.substr(0, line.find('|'))] = {line.substr(line.find('|') + 1)};
  for (const QGroupBox *group : children_of<QGroupBox>(dialog.get()))
    for (QWidget *widget : children_of(group)) {
      dialog->calls.clear();
      use(widget);
      const std::string name = widget->objectName().toStdString();
      EXPECT_EQ(dialog->calls, connections[name]) << name;
    }
  // What the program itself chooses and checks is no choice of the operator.
  dialog->calls.clear();
  for (QComboBox *combo : dialog->findChildren<QComboBox *>()) combo->setCurrentIndex(0);
  for (QCheckBox *box : dialog->findChildren<QCheckBox *>()) box->toggle();
  QMetaObject::invokeMethod(&timer, "timeout");
  EXPECT_EQ(dialog->calls, Names{"TimerTick"});
}

// Puts a mark before each text of the dialog.
struct Marker : QTranslator {
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
  EXPECT_EQ(dialog->windowTitle() + dialog->edtScale->toolTip(),
            "~Tarn Demo~\"1:Half-D1\"  \"2:CIF\"  \"9:D1\"");
  EXPECT_EQ(text_of(dialog->comboQualityMode), "~None,~CIF,~Half-D1,~D1");
  EXPECT_EQ(dialog->comboCBRValue->currentText(), "~1M");
  EXPECT_EQ(dialog->comboFrameRate->currentText(), "24");
}

// What of a label is seen is its text; the labels of the form reach under their neighbours.
QRect seen_of(const QWidget *widget) {
  const QRect text(widget->pos(), widget->fontMetrics().size(0, text_of(widget)));
  return qobject_cast<const QLabel *>(widget) != nullptr ? text : widget->geometry();
}

// No widget lies over another, leaves its parent or cuts its text.
void expect_nothing_clipped(const QWidget *parent) {
  const auto children = children_of(parent);
  for (const QWidget *child : children) {
    const std::string name = child->objectName().toStdString();
    EXPECT_TRUE(parent->rect().contains(child->geometry().united(seen_of(child)))) << name;
    for (const QWidget *other : children)
      EXPECT_TRUE(child == other || !seen_of(child).intersects(seen_of(other))) << name;
    const QSize text =
        is_group(child) ? QSize() : child->fontMetrics().size(0, child->property("text").toString());
    EXPECT_EQ(child->size().expandedTo(text), child->size()) << name;
    if (is_group(child)) expect_nothing_clipped(child);
  }
}

TEST_F(DialogTest, ClipsNothingAtAnyFontAndSize) {
  const QFont font = dialog->font();
  const QRect place = dialog->btnGetShield->geometry();
  for (const double factor : {1.0, 1.25, 1.6}) {
    QFont larger = font;
    larger.setPointSizeF(font.pointSizeF() * factor);
    dialog->setFont(larger);
    for (const QSize change : {QSize(-700, -700), QSize(300, 200)}) {
      dialog->resize(dialog->size() + change);
      QApplication::processEvents();
      expect_nothing_clipped(dialog.get());
    }
  }
  EXPECT_NE(dialog->btnGetShield->geometry(), place);
  dialog->setFont(font);
  EXPECT_EQ(dialog->btnGetShield->geometry(), place);
}

// The widgets that `status` switches when all of them were switched the other way before.
QString switched(OpenDialog &dialog, int status, bool to) {
  QStringList names;
  const auto widgets = dialog.findChildren<QWidget *>();
  for (QWidget *widget : widgets) widget->setEnabled(is_group(widget) || !to);
  dialog.UpdateUI(static_cast<UI_STATUS>(status));
  for (const QWidget *widget : widgets)
    if (!is_group(widget) && widget->isEnabled() == to) names << widget->objectName();
  names.sort();
  return names.join(' ');
}

TEST_F(DialogTest, SwitchesTheWidgetsOfEachActivityWhateverElseRuns) {
  for (const std::string &line : lines_of_form("state")) {
    const QStringList row = QString::fromStdString(line).split('|');
    g_finish_preview = row[1] != "preview";
    g_finish_record = row[1] != "recording";
    g_channel_mode = row[1] == "audio" ? ENABLE_AUDIO : ENABLE_RECORD;
    EXPECT_EQ(switched(*dialog, row[0].toInt(), true), row[2]) << line;
    EXPECT_EQ(switched(*dialog, row[0].toInt(), false), row[3]) << line;
  }
}

}  // namespace

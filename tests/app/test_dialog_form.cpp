// The form as the operator sees and uses it, compared with form.txt, which is written from the operator's
// view and not from the form's file.
#include <QApplication>
#include <QFile>
#include <QGridLayout>
#include <QTest>
#include <QTranslator>
#include <algorithm>
#include <cmath>

#include "dialog_fixture.h"
#include "light_palette.h"

namespace {

// The records of one kind in form.txt, each a list of columns. A line that begins with a blank continues a
// record.
QList<QStringList> form_records(const QString &kind) {
  QFile file(QStringLiteral(FORM_TABLE));
  EXPECT_TRUE(file.open(QIODevice::ReadOnly));
  QList<QStringList> records;
  for (const QString &line : QString::fromUtf8(file.readAll()).replace("\n  ", "").split('\n'))
    if (line.startsWith(kind + '|')) records << line.split('|').mid(1);
  return records;
}

bool is_group(const QWidget *widget) {
  return qobject_cast<const QGroupBox *>(widget) != nullptr;
}

template <typename Widget = QWidget>
QList<Widget *> children_of(const QWidget *parent) {
  return parent->findChildren<Widget *>(QString(), Qt::FindDirectChildrenOnly);
}

// The widgets of a group in the order in which one reads them, row by row.
QWidgetList reading_order(const QWidget *group) {
  QWidgetList widgets = children_of(group);
  const auto middle = [](const QWidget *widget) { return widget->geometry().center().y(); };
  std::sort(widgets.begin(), widgets.end(), [&](auto *a, auto *b) { return middle(a) < middle(b); });
  for (auto row = widgets.begin(), end = row; row != widgets.end(); row = end) {
    end = std::find_if(row, widgets.end(), [&](auto *next) { return middle(next) > middle(*row) + 8; });
    std::sort(row, end, [](auto *a, auto *b) { return a->x() < b->x(); });
  }
  return widgets;
}

QString text_of(const QWidget *widget) {
  QStringList items;
  if (const auto *combo = qobject_cast<const QComboBox *>(widget))
    for (int n = 0; n < combo->count(); ++n) items << combo->itemText(n);
  return items.empty() ? widget->property(is_group(widget) ? "title" : "text").toString() : items.join(',');
}

// A widget as form.txt has it.
QString row_of(const QWidget *widget) {
  const bool label = qobject_cast<const QLabel *>(widget) != nullptr;
  const auto *slider = qobject_cast<const QSlider *>(widget);
  const int alignment = label || is_group(widget) ? 0 : widget->property("alignment").toInt();
  // A colour nobody sees is no colour: the disabled palette counts for what is always disabled.
  const QPalette::ColorGroup state = widget->isEnabled() ? QPalette::Active : QPalette::Disabled;
  QStringList words = {
      label ? "" : widget->objectName(),
      text_of(widget),
      widget->isEnabled() ? "" : "disabled",
      widget->testAttribute(Qt::WA_SetPalette) ? widget->palette().color(state, QPalette::Text).name() : "",
      (alignment & Qt::AlignHCenter) != 0 ? "centred"
      : (alignment & Qt::AlignRight) != 0 ? "right"
                                          : "",
      slider ? QString("%1..%2 at %3").arg(slider->minimum()).arg(slider->maximum()).arg(slider->value())
             : "",
      widget->property("checked").toBool() ? "checked" : "",
      widget->toolTip().isEmpty() ? "" : "tip " + widget->toolTip()};
  words.removeAll("");
  return words.join(' ');
}

// Writes down which slots are reached instead of running them.
struct ListeningDialog : DemoDialog {
  QString calls;
// clang-format off
#define W(slot) void slot() override { calls += " > " #slot; }
  W(StartPreview) W(StopPreview) W(CheckFormat) W(ChangeResolution) W(PreviewSplit1) W(PreviewSplit4)
  W(PreviewSplit6) W(PreviewSplit8) W(PreviewSplit9) W(PreviewSplit16) W(EnablePreview) W(EnableAudio)
  W(EnableRecord) W(ChSettingChange) W(GetVideoStatus) W(GetMotionStatus) W(StartMotion) W(StopMotion) W(SetQP)
  W(GetSensitivity) W(SetSensitivity) W(SetProperty) W(GetProperty) W(UpdatePropertyEdt) W(UpdatePropertySlider)
  W(UpdateEncodeInfo) W(UpdateCodecInfo) W(UpdateFrameRate) W(SetShield) W(GetShield) W(SetFocus) W(GetFocus)
  W(StartRecord) W(StopRecord) W(Playback) W(TimerTick) W(UpdatePath) W(UpdateDiskLimit) W(UpdateTimeInterval)
  W(SetMotionArea) W(SetTwoField) W(UpdateJpegQuality) W(SetQPMinMax) W(SetCBRbps) W(SetGOP)
  // clang-format on
};
using FormTest = DialogTestOf<ListeningDialog>;

void use(QWidget *widget) {
  widget->setEnabled(true);
  if (qobject_cast<QPushButton *>(widget) != nullptr) return QTest::keyClick(widget, Qt::Key_Return);
  if (auto *button = qobject_cast<QAbstractButton *>(widget)) return button->click();
  if (qobject_cast<QLineEdit *>(widget) != nullptr) return QTest::keyClicks(widget, "7\r");
  QTest::keyClick(widget, qobject_cast<QSlider *>(widget) != nullptr ? Qt::Key_Left : Qt::Key_End);
}

// Catches: a connection that is left out or made twice; a button that Return presses from an edit.
TEST_F(FormTest, ShowsTheWidgetsOfTheTableAndConnectsThem) {
  QMap<QString, QStringList> rows;
  const auto groups = children_of<QGroupBox>(dialog.get());
  for (QWidget *group : groups)
    for (const QWidget *widget : QWidgetList{group} + reading_order(group))
      rows[group->objectName()] << row_of(widget);
  for (const QWidget *group : groups)
    for (int n = 0; QWidget * widget : reading_order(group)) {
      dialog->calls.clear();
      use(widget);
      rows[group->objectName()][++n] += dialog->calls;
    }
  for (const QStringList &record : form_records("group")) {
    const QStringList found = rows.take(record[0].section(' ', 0, 0));
    EXPECT_EQ(found.join('|').toStdString(), record.join('|').toStdString());
  }
  EXPECT_TRUE(rows.empty());

  // What the program itself chooses and checks is no choice of the operator.
  dialog->calls.clear();
  for (QComboBox *combo : dialog->findChildren<QComboBox *>()) combo->setCurrentIndex(0);
  for (QCheckBox *box : dialog->findChildren<QCheckBox *>()) box->toggle();
  QMetaObject::invokeMethod(&timer, "timeout");
  EXPECT_EQ(dialog->calls, " > TimerTick");
}

TEST_F(DialogTest, HasItsNamePlacesAndTabOrder) {
  EXPECT_EQ(dialog->windowTitle() + dialog->objectName(), "Tarn DemoDemoDialog");
  EXPECT_EQ(dialog->size().expandedTo(QSize(728, 780)), dialog->size());
  EXPECT_EQ(dialog->checkCh16->geometry(), QRect(353, 51, 44, 21));
  EXPECT_EQ(dialog->comboCBRValue->geometry(), QRect(130, 174, 130, 27));
  const auto group_at = [this](int row, int column) {
    return dialog->DemoDialogLayout->itemAtPosition(row, column)->widget();
  };
  EXPECT_EQ(group_at(0, 0), dialog->FormatGroup);
  for (const int column : {0, 3}) EXPECT_EQ(group_at(4, column), dialog->ChecksGroup);
  for (const int row : {3, 7}) EXPECT_EQ(group_at(row, 4), dialog->VideoConfigGroup);
  const QStringList listed = form_records("tab").front();
  QStringList stops;
  const QWidget *widget = dialog->radioNTSC;
  do {
    if (listed.contains(widget->objectName())) stops << widget->objectName();
    widget = widget->nextInFocusChain();
  } while (widget != dialog->radioNTSC);
  EXPECT_EQ(stops.join(' ').toStdString(), listed.join(' ').toStdString());
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
  EXPECT_EQ(dialog->comboCBRValue->currentText() + dialog->comboFrameRate->currentText(), "~1M24");
}

// How much two colours differ for the eye: 1 (not at all) to 21.
double contrast(const QColor &one, const QColor &other) {
  const auto light = [](const QColor &colour) {
    const auto part = [](double value) {
      return value <= 0.03928 ? value / 12.92 : std::pow((value + 0.055) / 1.055, 2.4);
    };
    return 0.2126 * part(colour.redF()) + 0.7152 * part(colour.greenF()) + 0.0722 * part(colour.blueF());
  };
  const auto [dark, bright] = std::minmax({light(one), light(other)});
  return (bright + 0.05) / (dark + 0.05);
}

TEST_F(DialogTest, EveryTextCanBeReadUnderADarkTheme) {
  const QPalette before = QApplication::palette();
  dialog.reset();
  QApplication::setPalette(light_palette(QPalette(Qt::black, Qt::black)));
  dialog = std::make_unique<OpenDialog>();
  for (const QWidget *widget : dialog->findChildren<QWidget *>()) {
    if (!widget->isEnabled()) continue;
    const std::string name = widget->objectName().toStdString();
    const QPalette &colours = widget->palette();
    const auto of = [&](auto text, auto ground) {
      return contrast(colours.color(text), colours.color(ground));
    };
    if (qobject_cast<const QPushButton *>(widget) != nullptr) {
      EXPECT_GE(of(QPalette::ButtonText, QPalette::Button), 4.5) << name;
      continue;
    }
    // Red and orange titles are as dark as their colours allow.
    const bool title = widget == dialog->RecordGroup || widget == dialog->MotionGroup;
    EXPECT_GE(of(QPalette::WindowText, QPalette::Window), title ? 3 : 4.5) << name;
    if (!is_group(widget)) {
      EXPECT_GE(of(QPalette::Text, QPalette::Base), 4.5) << name;
    }
    EXPECT_GE(of(QPalette::HighlightedText, QPalette::Highlight), 4.5) << name;
  }
  QApplication::setPalette(before);
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
    if (is_group(child)) {
      expect_nothing_clipped(child);
    } else {
      const char *const shown = qobject_cast<const QComboBox *>(child) != nullptr ? "currentText" : "text";
      const QSize text = child->fontMetrics().size(0, child->property(shown).toString());
      EXPECT_EQ(child->size().expandedTo(text), child->size()) << name;
      EXPECT_TRUE(!is_group(parent) || child->y() >= parent->fontMetrics().ascent()) << name;
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

TEST_F(DialogTest, ShrinksIntoALowScreenWithoutClipping) {
  for (const QSize room : {QSize(1366, 728), QSize(960, 500)}) {
    dialog.reset();
    dialog = std::make_unique<OpenDialog>();
    FormFit fit(*dialog);
    fit.shrink_into(room);
    EXPECT_EQ(fit.least_size().expandedTo(room), room);
    EXPECT_GT(fit.least_size().height(), room.height() - 20);  // no smaller than necessary
    dialog->resize(fit.least_size());
    dialog->show();
    expect_nothing_clipped(dialog.get());
  }
}

// Catches: a widget that keeps the state in which something else has left it.
TEST_F(DialogTest, SwitchesTheWidgetsOfEachActivityWhateverElseRuns) {
  for (QStringList row : form_records("state")) {
    g_finish_preview = row[1] != "preview";
    g_finish_record = row[1] != "recording";
    g_channel_mode = row[1] == "audio" ? ENABLE_AUDIO : ENABLE_RECORD;
    for (const bool to : {true, false}) {
      QString &names = row[to ? 2 : 3];
      for (const QStringList &set : form_records("set")) names.replace(set[0], set.mid(1).join(' '));
      QStringList expected = names.split(' ', Qt::SkipEmptyParts), found;
      const auto widgets = dialog->findChildren<QWidget *>();
      for (QWidget *widget : widgets) widget->setEnabled(is_group(widget) || !to);
      dialog->UpdateUI(static_cast<UI_STATUS>(row[0].toInt()));
      for (const QWidget *widget : widgets)
        if (!is_group(widget) && widget->isEnabled() == to) found << widget->objectName();
      expected.sort();
      found.sort();
      EXPECT_EQ(found.join(' ').toStdString(), expected.join(' ').toStdString()) << row[0].toInt();
    }
  }
}

}  // namespace

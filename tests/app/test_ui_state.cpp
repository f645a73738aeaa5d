#include "dialog_fixture.h"
#include "form_table.h"

namespace {

class UiStateTest : public DialogTest {
 protected:
  // The widgets that `status` switches when all of them were switched the other way before.
  QString switched(int status, bool to) {
    QStringList names;
    const auto widgets = dialog->findChildren<QWidget *>();
    for (QWidget *widget : widgets) widget->setEnabled(qobject_cast<QGroupBox *>(widget) != nullptr || !to);
    dialog->UpdateUI(static_cast<UI_STATUS>(status));
    for (const QWidget *widget : widgets)
      if (qobject_cast<const QGroupBox *>(widget) == nullptr && widget->isEnabled() == to)
        names << widget->objectName();
    names.sort();
    return names.join(' ');
  }
};

TEST_F(UiStateTest, SwitchesTheWidgetsOfEachActivityWhateverElseRuns) {
  for (const std::string &line : lines_of_form("state")) {
    const QStringList row = QString::fromStdString(line).split('|');
    g_finish_preview = row[1] != "preview";
    g_finish_record = row[1] != "recording";
    g_channel_mode = row[1] == "audio" ? ENABLE_AUDIO : ENABLE_RECORD;
    EXPECT_EQ(switched(row[0].toInt(), true), row[2]) << line;
    EXPECT_EQ(switched(row[0].toInt(), false), row[3]) << line;
  }
  g_finish_record = 1;
}

}  // namespace

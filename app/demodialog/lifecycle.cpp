// The life of the dialog: construction, language change, exit and destruction.
#include <unistd.h>

#include <QEvent>
#include <QFile>
#include <algorithm>
#include <cstdlib>
#include <string>
#include <utility>

#include "app_state.h"
#include "control_texts.h"
#include "demodialog.h"
#include "manners.h"
#include "preview_thread.h"
#include "zv_lib.h"

namespace {

constexpr int kTestPasses = 10;

// Opens and closes the card several times before it is used: a card that can be opened only once is of no
// use.
void test_open_close() {
  for (int pass = 0; pass < kTestPasses; ++pass) {
    const std::string tried = " Error!, try count = " + std::to_string(pass);
    if (!sdk_ok(zv_Open(&zv_handle), ("ERROR:zv_Open" + tried).c_str())) std::exit(1);
    sdk_ok(zv_Close(zv_handle), ("ERROR:zv_Close" + tried).c_str());
    zv_handle = nullptr;
  }
}

void open_card() {
  if (!sdk_ok(zv_Open(&zv_handle), "ERROR:zv_Open Error!")) std::exit(1);
  std::printf("Zarvo Demo AP: zv_Open Success, test count = %d\n", kTestPasses);
  sdk_ok(zv_RegisterCallBack(zv_handle, mpeg4_call_back, mjpeg_call_back, audio_call_back),
         "ERROR:zv_RegisterCallBack Error!");
  sdk_ok(zv_SetVideoStandard(zv_handle, zv_format), "ERROR:zv_SetVideoStandard Error!");
  sdk_ok(zv_SetResolution(zv_handle, zv_resolution), "ERROR:zv_zv_SetResolution Error!");
}

// Replaces the items of a combo box by the same number of empty items: retranslateUi() sets their texts by
// number.
void refill(QComboBox *combo) {
  const int items = combo->count();
  combo->clear();
  for (int n = 0; n < items; ++n) combo->addItem(QString());
}

}  // namespace

DemoDialog::DemoDialog(QWidget *parent, const char *name, bool modal, unsigned int flags)
    : QDialog(parent, Qt::WindowFlags(static_cast<int>(flags))) {
  setModal(modal);
  setupUi(this);
  form_fit.emplace(*this);
  new Manners(*this);
  if (name != nullptr) setObjectName(QString::fromUtf8(name));  // also an empty name
  languageChange();
  form_fit->shrink_into(FormFit::room_on(*screen()));
  resize(form_fit->least_size());
  init();
}

DemoDialog::~DemoDialog() {
  destroy();
}

void DemoDialog::languageChange() {
  // Keep the chosen items: their settings have not changed.
  QList<std::pair<QComboBox *, int>> chosen;
  for (QComboBox *combo : findChildren<QComboBox *>())
    if (combo != comboFrameRate) chosen.emplace_back(combo, combo->currentIndex());
  for (const auto &[combo, index] : chosen) refill(combo);
  retranslateUi(this);
  set_control_texts(*this);
  for (const auto &[combo, index] : chosen) combo->setCurrentIndex(index);
  form_fit->fit();
}

void DemoDialog::changeEvent(QEvent *event) {
  QDialog::changeEvent(event);
  if (event->type() == QEvent::LanguageChange) languageChange();
  const bool measures_changed = event->type() == QEvent::FontChange || event->type() == QEvent::StyleChange;
  if (measures_changed && form_fit) form_fit->fit();
}

void DemoDialog::init() {
  test_open_close();
  open_card();
  std::puts("initial");
  InitEncodeConfig();
  connect(&timer, SIGNAL(timeout()), this, SLOT(TimerTick()));
  std::fill(std::begin(g_fp_mpg4), std::end(g_fp_mpg4), nullptr);
  std::fill(std::begin(g_fp_mjpg), std::end(g_fp_mjpg), nullptr);
  std::fill(std::begin(g_fp_audio), std::end(g_fp_audio), nullptr);
  for (int n = 0; n < 16; ++n)
    g_check_handle[n] = findChild<QCheckBox *>(QStringLiteral("checkCh%1").arg(n + 1));
  radioNTSC->setChecked(true);
  radio720->setChecked(true);

  struct Range {
    QSlider *slider;
    int least, most;
    QLineEdit *edit;
    const char *neutral;
  };
  const Range ranges[] = {{sliderHue, -180, 180, edtHue, "0"},
                          {sliderSaturation, 0, 200, edtSaturation, "100"},
                          {sliderContrast, 0, 200, edtContrast, "100"},
                          {sliderBrightness, -25, 25, edtBrightness, "0"}};
  for (const Range &range : ranges) {
    range.slider->setRange(range.least, range.most);
    range.slider->setValue(0);
  }
  // Set the edits after the sliders: each edit moves its slider.
  for (const Range &range : ranges) range.edit->setText(QLatin1String(range.neutral));

  edtRecordPath->setText(QFile::decodeName(g_filepath));
  comboFrameRate->addItems(frame_rate_labels(VIDEO_STANDARD_ZV_NTSC));
  zv_config.CBREnable = 0;
  zv_config.QPMinMaxEnable = 0;
}

void DemoDialog::ExitDialog() {
  if (zv_handle == nullptr) return;
  timer.stop();
  stop_preview_thread();
  sleep(1);
  join_preview_thread();
  pthread_mutex_destroy(&thread_mutex);
  thread_mutex = PTHREAD_MUTEX_INITIALIZER;  // valid for a dialog that is closed or created later
  if (g_finish_record == 0) {
    zv_Stop(zv_handle);
    CloseFile();
  }
  if (sdk_ok(zv_Close(zv_handle), "ERROR:zv_Close Error!")) std::puts("destroy");
}

void DemoDialog::destroy() {
  // End everything that uses the card before it is closed, also when ExitDialog() was not called.
  timer.stop();
  stop_preview_thread();
  join_preview_thread();
  zv_Close(zv_handle);
  CloseFile();
  g_finish_preview = g_finish_record = 1;
  std::puts("destroy");
}

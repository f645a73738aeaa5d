/// Hands a recording to a player outside this program.
#include <unistd.h>

#include <QFileDialog>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "demodialog.h"

namespace {

/// Lets the operator choose a recording in the working directory; empty when the choice is cancelled.
QByteArray choose_recording(QWidget *parent) {
  char folder[256];
  if (!getcwd(folder, sizeof folder)) folder[0] = '\0';
  QFileDialog chooser(parent, DemoDialog::tr("Choose a file to playback"), QFile::decodeName(folder),
                      QStringLiteral("Video (*.rec);; Audio (*.aud)"));
  chooser.setObjectName("Playback");
  chooser.setFileMode(QFileDialog::ExistingFile);
  chooser.setOption(QFileDialog::DontUseNativeDialog);
  if (chooser.exec() != QDialog::Accepted) return {};
  return QFile::encodeName(chooser.selectedFiles().value(0));
}

/// The path as one word of the shell, whatever characters it has: single quotes keep everything but a
/// single quote, which is put between two quoted pieces.
std::string shell_word(const QByteArray &path) {
  std::string word = "'";
  for (const char c : path) {
    if (c == '\'') {
      word += "'\\''";
    } else {
      word += c;
    }
  }
  return word + "'";
}

}  // namespace

void DemoDialog::Playback() {
  UpdateUI(PLAYBACK_START);
  const QByteArray path = choose_recording(this);
  if (!path.isEmpty()) {
    const char *const player = path.contains(".rec") ? "./Videoplayer " : "./Audioplayer ";
    if (std::system((player + shell_word(path)).c_str()) == -1) std::puts("Playback error!");
  }
  UpdateUI(PLAYBACK_STOP);
}

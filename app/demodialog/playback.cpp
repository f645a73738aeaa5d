/// Hands a recording to a player outside this program.
#include <QDir>
#include <QFileDialog>
#include <QFileInfo>
#include <QLineEdit>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "demodialog.h"

namespace {

/// Qt takes a double quote in a typed name for the end of a name. Here what stands in the edit is the name
/// when there is such a file.
class RecordingChooser : public QFileDialog {
 public:
  using QFileDialog::QFileDialog;

  /// The chosen file, symbolic links resolved; empty before one was chosen.
  QString chosen() const {
    const QString file = typed_.isEmpty() ? selectedFiles().value(0) : typed_;
    const QString resolved = QFileInfo(file).canonicalFilePath();
    return resolved.isEmpty() ? file : resolved;
  }

 protected:
  void accept() override {
    const auto *edit = findChild<QLineEdit *>(QStringLiteral("fileNameEdit"));
    const QFileInfo file(directory(), edit ? edit->text() : QString());
    if (!file.isFile()) return QFileDialog::accept();
    typed_ = file.filePath();
    done(Accepted);
  }

 private:
  QString typed_;
};

/// Lets the operator choose a recording in the working directory; empty when the choice is cancelled.
QByteArray choose_recording(QWidget *parent) {
  RecordingChooser chooser(parent, DemoDialog::tr("Choose a file to playback"), QDir::currentPath(),
                           QStringLiteral("Video (*.rec);; Audio (*.aud)"));
  chooser.setObjectName("Playback");
  chooser.setFileMode(QFileDialog::ExistingFile);
  chooser.setOption(QFileDialog::DontUseNativeDialog);
  return chooser.exec() == QDialog::Accepted ? QFile::encodeName(chooser.chosen()) : QByteArray();
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

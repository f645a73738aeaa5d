// Starts a player program for a recording.
#include <QDir>
#include <QFileDialog>
#include <QFileInfo>
#include <QLineEdit>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "demodialog.h"
#include "manners.h"

namespace {

/// A file dialog that accepts names with a double quote. Qt takes a double quote in a typed name for the
/// end of the name; this dialog takes the whole text of the edit as the name if such a file exists.
class RecordingChooser : public QFileDialog {
 public:
  using QFileDialog::QFileDialog;

  /// Returns the chosen file with symbolic links resolved; empty when no file is chosen. A resolved path that
  /// is not UTF-8 names no file in Qt; the chosen path is then kept.
  QString chosen() const {
    const QString file = typed_.isEmpty() ? selectedFiles().value(0) : typed_;
    const QString resolved = QFileInfo(file).canonicalFilePath();
    return QFileInfo::exists(resolved) ? resolved : file;
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

/// Lets the operator choose a recording, starting in the working directory. Returns an empty path when the
/// operator cancels.
QByteArray choose_recording(QWidget *parent) {
  RecordingChooser chooser(parent, DemoDialog::tr("Choose a file to playback"), QDir::currentPath(),
                           QStringLiteral("Video (*.rec);; Audio (*.aud)"));
  chooser.setObjectName("Playback");
  chooser.setFileMode(QFileDialog::ExistingFile);
  chooser.setOption(QFileDialog::DontUseNativeDialog);
  return chooser.exec() == QDialog::Accepted ? QFile::encodeName(chooser.chosen()) : QByteArray();
}

/// Returns a path as one word of the shell, whatever characters it has. The word is in single quotes; a
/// single quote in the path ends the quoting, is escaped, and starts the quoting again.
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
    paint_all(*this);
    if (std::system((player + shell_word(path)).c_str()) == -1) std::puts("Playback error!");
    drop_queued_input();
  }
  UpdateUI(PLAYBACK_STOP);
}

// Entry point of the demo application.
#include <QApplication>
#include <QStyle>
#include <clocale>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "demodialog/demodialog.h"
#include "light_palette.h"
#include "sdl.h"

namespace {

constexpr char kHelp[] =
    "Usage: zarvo_demo [OPTION OF QT...]\n"
    "Watches, records and plays back the cameras of the capture card. The working directory should have\n"
    "the players Videoplayer and Audioplayer, and the folder Data for the recordings.\n\n"
    "  -h, --help   this text\n"
    "  --version    the version\n";

/// Returns whether an argument asks for a text, and prints it.
bool print_text(const std::string &argument) {
  if (argument == "--version") return std::printf("zarvo_demo %s\n", ZARVO_VERSION) > 0;
  return (argument == "-h" || argument == "--help") && std::fputs(kHelp, stdout) >= 0;
}

/// Handles Qt's messages while it looks for a display. If there is none, Qt prints several lines and aborts;
/// this prints one line and ends the program.
void on_display_message(QtMsgType type, const QMessageLogContext &context, const QString &text) {
  static QString reason;  // the first line is the most precise
  if (type == QtFatalMsg) {
    std::fprintf(stderr, "zarvo_demo: there is no usable display: %s\n", qPrintable(reason));
    std::_Exit(1);
  }
  if (!QByteArrayView(context.category).startsWith("qt.qpa")) {
    std::fprintf(stderr, "%s\n", qPrintable(qFormatLogMessage(type, context, text)));
  } else if (reason.isEmpty()) {
    reason = text;
  }
}

}  // namespace

int main(int argc, char **argv) {
  for (int n = 1; n < argc; ++n) {
    if (print_text(argv[n])) return 0;  // needs no display
  }
  // Write each line at once, also into a pipe: scripts read the lines while the program runs.
  std::setvbuf(stdout, nullptr, _IOLBF, 0);
  // Keep recording when the reader of the lines has gone, or when a file reaches its size limit.
  std::signal(SIGPIPE, SIG_IGN);
  std::signal(SIGXFSZ, SIG_IGN);
  set_overlay_environment();  // before Qt starts threads
  qInstallMessageHandler(on_display_message);
  const QApplication application(argc, argv);  // takes the options of Qt out of argv
  qInstallMessageHandler(nullptr);
  if (argc > 1) {
    std::fprintf(stderr,
                 "zarvo_demo: '%s' is not an option; possible are --help, --version and those of Qt\n",
                 argv[1]);
    return 2;
  }
  std::setlocale(LC_NUMERIC, "C");  // printed numbers must not depend on the locale
  QApplication::setPalette(light_palette(QApplication::style()->standardPalette()));
  DemoDialog *dialog = new DemoDialog;
  dialog->show();
  QApplication::exec();
  dialog->ExitDialog();
  delete dialog;
  return 0;
}

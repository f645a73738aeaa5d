// Makes the demo program leave when its dialog has been shown. Leaving by _Exit keeps the one-second pause of
// ExitDialog out of the figure.
#include <QCoreApplication>
#include <QTimer>
#include <cstdlib>

static void leave_when_idle() {
  QTimer::singleShot(0, [] { std::_Exit(0); });
}
Q_COREAPP_STARTUP_FUNCTION(leave_when_idle)

/**
 * @file bench.h
 * The card under test: opens it at the driver's level or with the SDK, records, and puts everything back in
 * the end.
 */
#ifndef CONTRACT_BENCH_H
#define CONTRACT_BENCH_H

#include <map>
#include <memory>

#include "driver_capture.h"
#include "driver_nodes.h"
#include "found_state.h"
#include "lazy.h"
#include "recording.h"
#include "zv_lib.h"

namespace contract {

/// Pauses for a time; throws Interrupted if a signal has asked the program to end.
void pause_for(double seconds);

class Bench {
 public:
  /// Opens the card and notes what it has. Throws CannotRun.
  Bench(bool quick, unsigned seconds);
  virtual ~Bench();
  Bench(const Bench &) = delete;
  Bench &operator=(const Bench &) = delete;

  /// A driver may let a node be open once only: the nodes and the SDK close each other.
  Nodes &nodes();
  HANDLE sdk();
  void close_all();

  /// The SDK with a standard and a width; throws if the SDK refuses them.
  HANDLE sdk(u32 standard, u32 resolution);

  // The evidence that many checks judge. A test prepares its own.
  /// Each of these is recorded when a check asks for it first.
  virtual const Recording &recording(const std::string &name);
  virtual const DriverCapture &capture();      ///< four channels
  virtual const DriverCapture &full_load();    ///< all channels, for the time of --seconds
  virtual const DriverCapture &after_pause();  ///< with a pause of the host
  virtual u32 cameras();                       ///< channels with a picture
  virtual u32 sounds();                        ///< audio inputs with a signal

  /// To be called before a check changes windows without the SDK, which always changes them.
  void touch_layout() { layout_touched_ = true; }

  /// Puts everything back. Returns what could not be put back, or an empty text.
  std::string restore();

 private:
  bool quick_;
  double seconds_;
  std::unique_ptr<Nodes> nodes_;
  HANDLE sdk_ = nullptr;
  std::unique_ptr<FoundState> found_;
  std::map<std::string, Lazy<Recording>> recordings_;
  Lazy<DriverCapture> capture_, full_load_, after_pause_;
  bool layout_touched_ = false;
};

}  // namespace contract

#endif

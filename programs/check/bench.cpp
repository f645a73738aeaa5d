// Opens the card, records, and puts everything back.
#include "bench.h"

#include <chrono>
#include <thread>

#include "check.h"
#include "programs/common/card.h"
#include "programs/common/stop_signal.h"

namespace contract {

void pause_for(double seconds) {
  using Clock = std::chrono::steady_clock;
  const auto end =
      Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(seconds));
  while (Clock::now() < end) {
    if (stopping) throw Interrupted{};
    std::this_thread::sleep_for(std::min<Clock::duration>(end - Clock::now(), std::chrono::milliseconds(20)));
  }
  if (stopping) throw Interrupted{};
}

Bench::Bench(bool quick, unsigned seconds) : quick_(quick), seconds_(seconds) {
  found_ = std::make_unique<FoundState>(nodes());
}

Bench::~Bench() {
  close_all();
}

void Bench::close_all() {
  nodes_.reset();
  if (sdk_ == nullptr) return;
  zv_Stop(sdk_);
  zv_Close(sdk_);
  sdk_ = nullptr;
}

Nodes &Bench::nodes() {
  if (!nodes_) {
    close_all();
    nodes_ = std::make_unique<Nodes>();
  }
  return *nodes_;
}

HANDLE Bench::sdk() {
  if (sdk_ != nullptr) return sdk_;
  close_all();
  touch_layout();
  check(zv_Open(&sdk_), "zv_Open");
  return sdk_;
}

HANDLE Bench::sdk(u32 standard, u32 resolution) {
  HANDLE handle = sdk();
  check(zv_SetVideoStandard(handle, standard), "zv_SetVideoStandard");
  check(zv_SetResolution(handle, resolution), "zv_SetResolution");
  return handle;
}

const Recording &Bench::recording(const std::string &name) {
  return recordings_[name].get([&] {
    const Setup setup = setup_named(name, quick_);
    return record(sdk(setup.standard, setup.resolution), setup);
  });
}

const DriverCapture &Bench::capture() {
  return capture_.get([&] { return capture_at_driver(nodes(), {0xF, 2.0, 0}); });
}

const DriverCapture &Bench::full_load() {
  return full_load_.get([&] { return capture_at_driver(nodes(), {0xFFFF, seconds_, 0}); });
}

const DriverCapture &Bench::after_pause() {
  return after_pause_.get([&] { return capture_at_driver(nodes(), {0xF, 1.5, 0.2}); });
}

u32 Bench::cameras() {
  return ~zv_GetVideoStatus(sdk()) & 0xFFFF;
}

u32 Bench::sounds() {
  return ~zv_GetAudioStatus(sdk()) & 0xF;
}

std::string Bench::restore() {
  std::string left;
  // A part that cannot be put back leaves no other part as the checks have it.
  const auto put_back = [&left](const auto &part) {
    try {
      part();
    } catch (const std::exception &error) {
      left.append(left.empty() ? "" : "; ").append(error.what());
    }
  };
  close_all();
  if (layout_touched_) put_back([&] { found_->restore_layout(sdk()); });
  put_back([&] { found_->restore(nodes()); });
  close_all();
  return left;
}

}  // namespace contract

// Chooses the checks and runs them.
#include "plan.h"

#include <fnmatch.h>

#include <algorithm>

#include "bench.h"
#include "programs/common/command_line.h"
#include "programs/common/stop_signal.h"

namespace contract {
namespace {

bool matches(const std::vector<std::string> &globs, const std::string &name) {
  return std::any_of(globs.begin(), globs.end(),
                     [&](const std::string &glob) { return fnmatch(glob.c_str(), name.c_str(), 0) == 0; });
}

Result result_of(const Check &check, Bench &bench) try {
  return check.run(bench);
} catch (const std::exception &error) {
  return broken("the check can be carried out", error.what());
}

}  // namespace

Checks all_checks() {
  Checks checks;
  for (auto *add : {add_nodes, add_boundary, add_limits, add_registers, add_mpeg4, add_mjpeg, add_audio,
                    add_preview, add_picture, add_motion, add_switches, add_load, add_watchdog})
    add(checks);
  return checks;
}

Checks selected(const Options &options) {
  Checks checks = all_checks();
  std::erase_if(checks, [&](const Check &check) {
    return (!options.only.empty() && !matches(options.only, check.name)) ||
           matches(options.skip, check.name) || (options.quick && !check.quick) ||
           (!options.watchdog && check.name.starts_with("watchdog."));
  });
  if (checks.empty()) throw UsageError("no check is left; zarvo_check --list shows them all");
  return checks;
}

std::string run_all(const Checks &checks, Bench &bench, Report &report) try {
  for (const Check &check : checks) {
    if (stopping) throw Interrupted{};
    report.begin(check);
    const double start = monotonic_seconds();
    const Result result = result_of(check, bench);
    report.add(check, result, monotonic_seconds() - start);
  }
  return {};
} catch (const Interrupted &) {
  return "a signal has ended the checks";
}

int exit_status(const std::string &bail_out, const Report &report, const std::string &left) {
  if (!bail_out.empty()) return kCannotRun;
  return report.all_hold() && left.empty() ? 0 : kNotAllHold;
}

}  // namespace contract

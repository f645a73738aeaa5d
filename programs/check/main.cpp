// zarvo_check: asks a card and its driver whether they keep the contract.
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <memory>

#include "bench.h"
#include "plan.h"
#include "programs/common/command_line.h"
#include "programs/common/stop_signal.h"

namespace {

using namespace contract;

/// Returns a stream to standard output for the report alone: what the SDK prints goes to standard error.
std::FILE *report_stream() {
  std::FILE *const out = fdopen(dup(STDOUT_FILENO), "w");
  if (out == nullptr) throw std::runtime_error("standard output is closed");
  dup2(STDERR_FILENO, STDOUT_FILENO);
  return out;
}

int run(const Options &options) {
  const Checks checks = selected(options);
  catch_stop_signals();
  Bench bench(options.quick, options.quick ? std::min(options.seconds, 3u) : options.seconds);
  const std::unique_ptr<std::FILE, int (*)(std::FILE *)> out(report_stream(), std::fclose);
  Report report(out.get(), options.json, checks.size());
  const std::string bail_out = run_all(checks, bench, report);
  const std::string left = bench.restore();
  report.end(bail_out);
  if (!left.empty())
    std::fprintf(stderr, "zarvo_check: some settings of the card could not be restored: %s\n", left.c_str());
  return exit_status(bail_out, report, left);
}

}  // namespace

int main(int argc, char **argv) {
  try {
    const Options options = parse_options(argc, argv);
    if (!options.list) return run(options);
    print_list(all_checks());
    return 0;
  } catch (const UsageError &error) {
    std::fprintf(stderr, "zarvo_check: %s; see zarvo_check --help\n", error.what());
  } catch (const std::exception &error) {
    std::fprintf(stderr, "zarvo_check: %s\n", error.what());
  }
  return kCannotRun;
}

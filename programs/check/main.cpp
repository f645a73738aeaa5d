// zarvo_check: asks a card and its driver whether they keep the contract.
#include <fnmatch.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <memory>

#include "bench.h"
#include "check.h"
#include "programs/common/command_line.h"
#include "programs/common/stop_signal.h"
#include "report.h"

namespace {

using namespace contract;

constexpr int kNotAllHold = 1;
constexpr int kCannotRun = 2;

constexpr const char *kUsage = R"(Usage: zarvo_check [OPTION...]

Tests whether the card of this machine and its driver behave as the SDK expects, and examines the pictures. Prints TAP 14. In the end the card has the settings that it had before.

  --list           lists the checks and what each proves
  --only GLOB      runs these checks only, e.g. 'mpeg4.*'; may be given more than once
  --skip GLOB      leaves these checks out; may be given more than once
  --quick          runs the quick checks only: less than a minute
  --seconds N      how long the load checks run: 1 to 3600 seconds (10)
  --watchdog       also runs the checks of the watchdog. A board that does not obey the command to
                   stop its watchdog resets the machine
  --json           prints one JSON document instead of TAP
  -h, --help       shows this text
  --version        shows the version

Exit status: 0 all checks hold or are skipped, 1 some do not hold, 2 wrong use or cannot run.
)";

struct Options {
  std::vector<std::string> only, skip;
  bool list = false, quick = false, json = false, watchdog = false;
  unsigned seconds = 10;
};

Options parse(int argc, char **argv) {
  static const option kOptions[] = {
      {"list", no_argument, nullptr, 'l'},          {"only", required_argument, nullptr, 'o'},
      {"skip", required_argument, nullptr, 's'},    {"quick", no_argument, nullptr, 'q'},
      {"seconds", required_argument, nullptr, 'n'}, {"watchdog", no_argument, nullptr, 'w'},
      {"json", no_argument, nullptr, 'j'},          COMMON_OPTIONS};
  Options options;
  std::vector<std::string> words;
  for (int letter; (letter = next_option(argc, argv, kOptions, kUsage, &words)) != -1;) {
    switch (letter) {
      case 'l':
        options.list = true;
        break;
      case 'o':
        options.only.emplace_back(optarg);
        break;
      case 's':
        options.skip.emplace_back(optarg);
        break;
      case 'q':
        options.quick = true;
        break;
      case 'n':
        options.seconds = parse_number("--seconds", optarg, 1, 3600);
        break;
      case 'w':
        options.watchdog = true;
        break;
      case 'j':
        options.json = true;
        break;
    }
  }
  if (!words.empty()) refuse_option(words.front(), kOptions);
  return options;
}

Checks all_checks() {
  Checks checks;
  for (auto *add : {add_nodes, add_boundary, add_limits, add_registers, add_mpeg4, add_mjpeg, add_audio,
                    add_preview, add_picture, add_motion, add_switches, add_load, add_watchdog})
    add(checks);
  return checks;
}

bool matches(const std::vector<std::string> &globs, const std::string &name) {
  return std::any_of(globs.begin(), globs.end(),
                     [&](const std::string &glob) { return fnmatch(glob.c_str(), name.c_str(), 0) == 0; });
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

Result result_of(const Check &check, Bench &bench) try {
  return check.run(bench);
} catch (const std::runtime_error &error) {
  return broken("the check can be carried out", error.what());
}

/// Returns why not all checks have run, or an empty text.
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
  return !bail_out.empty() ? kCannotRun : report.all_hold() && left.empty() ? 0 : kNotAllHold;
}

}  // namespace

int main(int argc, char **argv) {
  try {
    const Options options = parse(argc, argv);
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

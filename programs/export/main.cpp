// zarvo_export: makes clips of recordings, and lists what is recorded.
#include <cstdio>
#include <stdexcept>

#include "listing.h"
#include "make_clip.h"
#include "options.h"
#include "programs/common/command_line.h"
#include "programs/common/libav.h"
#include "programs/common/stop_signal.h"

namespace {

using namespace clips;

constexpr int kFailed = 1;
constexpr int kWrongUse = 2;
constexpr int kIncomplete = 3;

int list(const Options &options) {
  Report report;
  const auto rows = list_recordings(options, report);
  if (!options.svg.empty())
    draw(rows, options.svg, options.force);
  else if (options.json)
    print_json(rows);
  else
    print_table(rows);
  return 0;
}

}  // namespace

int main(int argc, char **argv) try {
  const Options options = parse_options(argc, argv);
  av_log_set_level(AV_LOG_QUIET);
  if (options.list) return list(options);
  catch_stop_signals();
  Report report;
  make_clip(options, report);
  return report.complete() ? 0 : kIncomplete;
} catch (const UsageError &error) {
  std::fprintf(stderr, "zarvo_export: %s; see zarvo_export --help\n", error.what());
  return kWrongUse;
} catch (const std::exception &error) {
  std::fprintf(stderr, "zarvo_export: %s\n", error.what());
  return kFailed;
}

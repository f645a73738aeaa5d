/// Ratios of the benchmarks: collected while they run, printed as one table at the end, with the limit
/// each has to keep.
#ifndef BENCH_REPORT_H
#define BENCH_REPORT_H

#include <functional>
#include <string>
#include <vector>

namespace bench {

/// Medians of what both sides of a comparison cost.
struct Costs {
  double ours;
  double theirs;
};

/// Runs `ours` and `theirs` in turn, `rounds` times, and reports the ratio of their results pair by pair.
/// Both return a cost, e.g. processor nanoseconds a frame. The first pair only warms up. A busy machine makes
/// the ratios spread: beyond a factor of 1.5 all rounds are measured again, up to three times in all, and the
/// measurement that spreads least counts.
Costs compare(const std::string &name, int rounds, double limit, const std::function<double()> &ours,
              const std::function<double()> &theirs);

/// Reports a figure that has to stay at or below a limit.
void figure(const std::string &name, double value, double limit, const std::string &unit);

/// Reports a figure that has no limit.
void note(const std::string &name, double value, const std::string &unit);

/// Prints the table. False when a limit is exceeded.
bool print_report();

double median(std::vector<double> values);

}  // namespace bench

#endif

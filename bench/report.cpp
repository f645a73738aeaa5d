#include "report.h"

#include <algorithm>
#include <cstdio>
#include <limits>

namespace bench {
namespace {

struct Line {
  std::string name;
  double value;
  double limit;
  std::string unit;
  std::string detail;
};

std::vector<Line> lines;
constexpr double kNoLimit = std::numeric_limits<double>::infinity();
constexpr double kSteadySpread = 1.5;
constexpr int kMaxMeasurements = 3;

std::string format(const char *pattern, double a, double b, double c, double d) {
  char text[160];
  std::snprintf(text, sizeof text, pattern, a, b, c, d);
  return text;
}

struct Comparison {
  std::vector<double> ours, theirs, ratios;

  double spread() const {
    const auto [low, high] = std::minmax_element(ratios.begin(), ratios.end());
    return *high / *low;
  }
};

Comparison measure(int rounds, const std::function<double()> &ours, const std::function<double()> &theirs) {
  Comparison result;
  ours();
  theirs();
  for (int round = 0; round < rounds; ++round) {
    result.ours.push_back(ours());
    result.theirs.push_back(theirs());
    result.ratios.push_back(result.ours.back() / result.theirs.back());
  }
  return result;
}

}  // namespace

double median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  const std::size_t middle = values.size() / 2;
  return values.size() % 2 != 0 ? values[middle] : (values[middle - 1] + values[middle]) / 2;
}

Costs compare(const std::string &name, int rounds, double limit, const std::function<double()> &ours,
              const std::function<double()> &theirs) {
  Comparison steadiest = measure(rounds, ours, theirs);
  for (int again = 1; again < kMaxMeasurements && steadiest.spread() > kSteadySpread; ++again) {
    Comparison next = measure(rounds, ours, theirs);
    if (next.spread() < steadiest.spread()) steadiest = std::move(next);
  }
  const Costs costs{median(steadiest.ours), median(steadiest.theirs)};
  const auto [low, high] = std::minmax_element(steadiest.ratios.begin(), steadiest.ratios.end());
  lines.push_back(
      {name, median(steadiest.ratios), limit, "x",
       format("%.0f ns against %.0f ns, ratios %.2f to %.2f", costs.ours, costs.theirs, *low, *high)});
  return costs;
}

void figure(const std::string &name, double value, double limit, const std::string &unit) {
  lines.push_back({name, value, limit, unit, ""});
}

void note(const std::string &name, double value, const std::string &unit) {
  lines.push_back({name, value, kNoLimit, unit, ""});
}

bool print_report() {
  bool all_hold = true;
  std::printf("\n%-66s %12s %12s\n", "what", "measured", "limit");
  for (const Line &line : lines) {
    const bool holds = line.value <= line.limit;
    all_hold = all_hold && holds;
    std::printf("%-66s %9.2f %-2s ", line.name.c_str(), line.value, line.unit.c_str());
    if (line.limit < kNoLimit)
      std::printf("%9.2f %-2s %s", line.limit, line.unit.c_str(), holds ? "holds" : "EXCEEDED");
    std::printf("  %s\n", line.detail.c_str());
  }
  return all_hold;
}

}  // namespace bench

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

std::string format(const char *pattern, double a, double b, double c, double d) {
  char text[160];
  std::snprintf(text, sizeof text, pattern, a, b, c, d);
  return text;
}

}  // namespace

double median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  const std::size_t middle = values.size() / 2;
  return values.size() % 2 != 0 ? values[middle] : (values[middle - 1] + values[middle]) / 2;
}

Costs compare(const std::string &name, int rounds, double limit, const std::function<double()> &ours,
              const std::function<double()> &theirs) {
  std::vector<double> our_costs;
  std::vector<double> their_costs;
  std::vector<double> ratios;
  ours();
  theirs();
  for (int round = 0; round < rounds; ++round) {
    our_costs.push_back(ours());
    their_costs.push_back(theirs());
    ratios.push_back(our_costs.back() / their_costs.back());
  }
  const auto [low, high] = std::minmax_element(ratios.begin(), ratios.end());
  const Costs costs{median(our_costs), median(their_costs)};
  lines.push_back(
      {name, median(ratios), limit, "x",
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

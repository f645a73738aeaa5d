/**
 * @file check_test.h
 * The world of the tests of zarvo_check: a bench whose evidence a test prepares, and what a check says of it.
 */
#ifndef CHECK_TEST_H
#define CHECK_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "programs/check/bench.h"
#include "programs/check/plan.h"
#include "virtual_card.h"

namespace contract {

inline constexpr auto kHeld = Outcome::held, kBroken = Outcome::broken, kSkipped = Outcome::skipped;

class PreparedBench : public Bench {
 public:
  PreparedBench() : Bench((virtual_card::reset(), true), 1) {}
  const DriverCapture &capture() override { return taken; }
  const DriverCapture &full_load() override { return taken; }
  const DriverCapture &after_pause() override { return taken; }
  const Recording &recording(const std::string &name) override { return recordings[name]; }
  u32 cameras() override { return camera_mask; }
  u32 sounds() override { return sound_mask; }

  DriverCapture taken;
  std::map<std::string, Recording> recordings;
  u32 camera_mask = 0xFFFF, sound_mask = 0xF;
};

/// Runs a check; an exception of the check fails the test.
inline Result result_of(const Checks &checks, const std::string &name, Bench &bench) {
  const auto found = std::ranges::find(checks, name, &Check::name);
  return found == checks.end() ? throw std::logic_error("no check " + name) : found->run(bench);
}

/// A check, and what it says when the evidence is changed. Of the good evidence it says "held".
template <typename Evidence>
struct Row {
  const char *check;
  Outcome outcome;
  std::function<void(Evidence &)> change;
};

inline void expect_outcome(const Checks &checks, const char *name, Bench &bench, Outcome expected,
                           std::size_t row) {
  const Result result = result_of(checks, name, bench);
  EXPECT_EQ(result.outcome, expected) << "row " << row << ", " << name << ": " << result.got;
}

/// `present` gives evidence to the bench and returns the checks that look at it.
template <typename Evidence, typename Present>
void expect_rows(const Evidence &good, Bench &bench, Present present,
                 const std::vector<Row<Evidence>> &rows) {
  for (std::size_t n = 0; n < rows.size(); ++n) {
    Evidence evidence = good;
    expect_outcome(present(evidence), rows[n].check, bench, kHeld, n);
    rows[n].change(evidence);
    expect_outcome(present(evidence), rows[n].check, bench, rows[n].outcome, n);
  }
}

}  // namespace contract

#endif

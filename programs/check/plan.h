/**
 * @file plan.h
 * Chooses the checks, runs them, and tells how they have ended.
 */
#ifndef CONTRACT_PLAN_H
#define CONTRACT_PLAN_H

#include <string>

#include "check.h"
#include "options.h"
#include "report.h"

namespace contract {

Checks all_checks();
/// Returns the checks that the options leave. Throws UsageError if there are none.
Checks selected(const Options &options);

/// Returns why not all checks have run, or an empty text.
std::string run_all(const Checks &checks, Bench &bench, Report &report);

inline constexpr int kNotAllHold = 1;
inline constexpr int kCannotRun = 2;
/// Returns the exit status. `left` says what the card does not have again.
int exit_status(const std::string &bail_out, const Report &report, const std::string &left);

}  // namespace contract

#endif

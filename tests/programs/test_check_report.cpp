// Which checks zarvo_check runs, what it prints of them, and its exit status.
#include <cstdlib>
#include <nlohmann/json.hpp>

#include "check_test.h"
#include "programs/common/command_line.h"
#include "programs/common/stop_signal.h"

namespace contract {
namespace {

using testing::HasSubstr;

/// The names of the checks that a command line chooses.
std::string chosen(std::vector<std::string> arguments) {
  std::vector<char *> argv{const_cast<char *>("zarvo_check")};
  for (std::string &argument : arguments) argv.push_back(argument.data());
  argv.push_back(nullptr);
  optind = 1;
  std::string names;
  for (const Check &check : selected(parse_options(static_cast<int>(argv.size()) - 1, argv.data())))
    names += check.name + " ";
  return names;
}

TEST(CheckPlan, OptionsChooseTheChecks) {
  EXPECT_EQ(chosen({"--only", "mjpeg.rate.*", "--only=motion.stat*", "--skip", "*.1?"}),
            "mjpeg.rate.30 mjpeg.rate.25 motion.status ");
  EXPECT_EQ(chosen({"--quick", "--only", "m*.size.*.cif"}),
            "mpeg4.size.ntsc.720.cif mpeg4.size.pal.704.cif mjpeg.size.ntsc.720.cif mjpeg.size.pal.704.cif ");
  EXPECT_THROW(chosen({"--only", "watchdog.*"}), UsageError);
  EXPECT_THROW(chosen({"--seconds", "3601"}), UsageError);
}

class CheckReport : public testing::Test {
 protected:
  ~CheckReport() override { stopping = false; }

  /// Runs checks and returns the report. A check named "signal" lets a signal come.
  std::string report_of(const Checks &checks, bool json, const std::string &left = {}) {
    char *text = nullptr;
    std::size_t size = 0;
    std::FILE *const out = open_memstream(&text, &size);
    Report report(out, json, checks.size());
    const std::string bail_out = run_all(checks, bench, report);
    report.end(bail_out);
    status = exit_status(bail_out, report, left);
    std::fclose(out);
    std::string printed(text, size);
    std::free(text);
    return printed;
  }

  static Check check_of(const char *name, Result (*run)(Bench &)) {
    return {name, "It \"works\".", "Nothing: nowhere", true, run};
  }

  PreparedBench bench;
  int status = -1;
  const Check holds = check_of("one.holds", [](Bench &) { return held(); });
  const Check breaks = check_of("two.breaks", [](Bench &) { return broken("a\tb", "c\xFF\ne"); });
  const Check skips = check_of("one.skips", [](Bench &) { return skipped("no camera"); });
  const Check throws =
      check_of("two.throws", [](Bench &) -> Result { throw std::out_of_range("the driver lies"); });
  const Check signal = check_of("one.signal", [](Bench &) {
    stopping = true;
    return held();
  });
};

// Catches: what a harness cannot read, a value under the wrong heading, a count of another theme.
TEST_F(CheckReport, TapTellsEachCheckAndCountsTheThemes) {
  unsetenv("HARNESS_ACTIVE");
  EXPECT_EQ(report_of({holds, breaks, skips, throws}, false),
            "TAP version 14\n1..4\n"
            "ok 1 - one.holds\n"
            "not ok 2 - two.breaks\n  ---\n  proves: \"It \\\"works\\\".\"\n  expected: \"a\\tb\"\n"
            "  got: \"c\uFFFD\\ne\"\n  meaning: \"Nothing: nowhere\"\n  ...\n"
            "ok 3 - one.skips # SKIP no camera\n"
            "not ok 4 - two.throws\n  ---\n  proves: \"It \\\"works\\\".\"\n"
            "  expected: \"the check can be carried out\"\n  got: \"the driver lies\"\n"
            "  meaning: \"Nothing: nowhere\"\n  ...\n"
            "# one            1 hold, 0 do not, 1 skipped\n"
            "# two            0 hold, 2 do not, 0 skipped\n");
  setenv("HARNESS_ACTIVE", "1", 1);
  EXPECT_THAT(report_of({holds}, false), testing::StartsWith("TAP version 13\n1..1\nok 1"));
  unsetenv("HARNESS_ACTIVE");
}

TEST_F(CheckReport, JsonTellsTheSame) {
  const auto document = nlohmann::json::parse(report_of({holds, breaks, skips, signal, holds}, true));
  const auto &checks = document["checks"];
  ASSERT_EQ(checks.size(), 4u);
  EXPECT_EQ(checks[1]["expected"], "a\tb");
  EXPECT_EQ(checks[1]["got"], "c\uFFFD\ne");
  EXPECT_EQ(checks[2]["outcome"], "skipped");
  EXPECT_EQ(checks[2]["reason"], "no camera");
  EXPECT_EQ(document["themes"].dump(),
            R"({"one":{"broken":0,"held":2,"skipped":1},"two":{"broken":1,"held":0,"skipped":0}})");
  EXPECT_EQ(document["bail_out"], "a signal has ended the checks");
}

TEST_F(CheckReport, ExitStatusTellsTheWorst) {
  const struct {
    Checks checks;
    const char *left, *printed;
    int status;
  } rows[] = {
      {{holds, skips}, "", "2 - one.skips", 0},  {{skips}, "", "0 hold", 0},
      {{breaks, holds}, "", "2 - one.holds", 1}, {{throws}, "", "1 do not", 1},
      {{holds}, "the layout", "1 hold", 1},      {{breaks, signal, holds}, "", "Bail out! a signal", 2},
      {{holds, signal}, "", "2 hold", 0},  // the signal comes when all is done
  };
  for (const auto &row : rows) {
    stopping = false;
    EXPECT_THAT(report_of(row.checks, false, row.left), HasSubstr(row.printed));
    EXPECT_EQ(status, row.status) << row.printed;
  }
}

}  // namespace
}  // namespace contract

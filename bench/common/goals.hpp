#pragma once
// Goals of the benchmarks: each compares a figure with a baseline measured
// in the same process run, and says whether the ratio holds. A benchmark
// program registers its goals, then runs through RunWithGoals, which prints
// the usual table followed by the goal rows. When BELVANE_BENCH_GOALS names
// a file, the rows are appended to it too, so that one table across every
// program can be printed at the end (scripts/bench-summary.sh).
//
// A benchmark's figure is its time per iteration (the manual time where it
// sets one, else processor time), the least over repetitions, or a named
// counter of its run.

#include <string>

namespace belvane::bench {

enum class Limit { AtMost, AtLeast };

struct Measure {
  std::string benchmark; // the run's name, e.g. "BM_ScheduleOpen/manual_time"
  std::string counter;   // empty: time per iteration; else this counter
  std::string label;     // how the table names it; the benchmark when empty
};

// figure / baseline must stay at most (or at least) `limit`. With a counter
// that is a rate, pass the baseline first to compare rates the right way
// round, or use Limit::AtLeast.
void AddRatioGoal(std::string what, Measure figure, Measure baseline, double limit,
                  Limit kind = Limit::AtMost);

// A figure on its own against a fixed bound (a memory ratio the benchmark
// computes itself, a rate the machine must reach).
void AddValueGoal(std::string what, Measure figure, double limit, Limit kind, std::string unit);

// Runs the benchmarks selected on the command line and reports the goals.
int RunWithGoals(int argc, char** argv);

} // namespace belvane::bench

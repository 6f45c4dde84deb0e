#include "goals.hpp"

#include <benchmark/benchmark.h>
#include <malloc.h>

#include <cstdio>
#include <cstdlib>
#include <limits>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::bench {

namespace {

struct Goal {
  std::string what;
  Measure figure;
  std::optional<Measure> baseline;
  double limit;
  Limit kind;
  std::string unit;
};

std::vector<Goal>& Goals() {
  static std::vector<Goal> goals;
  return goals;
}

// The least value of every measure seen, by benchmark name then counter
// ("" for the time per iteration, in seconds).
class GoalReporter : public benchmark::ConsoleReporter {
public:
  void ReportRuns(const std::vector<Run>& runs) override {
    ConsoleReporter::ReportRuns(runs);
    for (const Run& run : runs) {
      if (run.run_type != Run::RT_Iteration || run.error_occurred || run.iterations == 0) continue;
      auto& measures = seen_[NameWithoutIterations(run.benchmark_name())];
      const bool wall = !run.run_name.time_type.empty(); // manual or real time asked for
      const double perIteration = (wall ? run.real_accumulated_time : run.cpu_accumulated_time) /
                                  static_cast<double>(run.iterations);
      Keep(measures, "", perIteration, true);
      for (const auto& [name, counter] : run.counters) {
        // Rates are best high, everything else is kept as the least.
        const bool rate = (counter.flags & benchmark::Counter::kIsRate) != 0;
        Keep(measures, name, counter.value, !rate);
      }
    }
  }

  std::optional<double> Find(const Measure& m) const {
    auto it = seen_.find(m.benchmark);
    if (it == seen_.end()) return std::nullopt;
    auto c = it->second.find(m.counter);
    if (c == it->second.end()) return std::nullopt;
    return c->second;
  }

private:
  // A run's name without the "/iterations:N" a fixed iteration count adds,
  // so that a goal names its benchmark the same however many iterations it
  // is given.
  static std::string NameWithoutIterations(std::string name) {
    const std::size_t at = name.find("/iterations:");
    if (at == std::string::npos) return name;
    const std::size_t end = name.find('/', at + 1);
    name.erase(at, end == std::string::npos ? std::string::npos : end - at);
    return name;
  }
  static void Keep(std::map<std::string, double>& measures, const std::string& name, double v,
                   bool least) {
    auto [it, added] = measures.emplace(name, v);
    if (!added) it->second = least ? std::min(it->second, v) : std::max(it->second, v);
  }
  std::map<std::string, std::map<std::string, double>> seen_;
};

std::string Label(const Measure& m) { return m.label.empty() ? m.benchmark : m.label; }

// A time in the unit that reads best, or a counter as it is.
std::string Show(const Measure& m, double v, const std::string& unit) {
  char buf[64];
  if (!m.counter.empty()) {
    if (v >= 1e6)
      std::snprintf(buf, sizeof buf, "%.1f M%s", v / 1e6, unit.c_str());
    else
      std::snprintf(buf, sizeof buf, "%.3g%s%s", v, unit.empty() ? "" : " ", unit.c_str());
  } else if (v >= 1e-3) {
    std::snprintf(buf, sizeof buf, "%.2f ms", v * 1e3);
  } else if (v >= 1e-6) {
    std::snprintf(buf, sizeof buf, "%.2f us", v * 1e6);
  } else {
    std::snprintf(buf, sizeof buf, "%.1f ns", v * 1e9);
  }
  return buf;
}

// Table fields are separated by tabs (the summary script aligns them).
std::string Row(const Goal& g, const GoalReporter& r) {
  const std::optional<double> figure = r.Find(g.figure);
  std::optional<double> base;
  if (g.baseline) base = r.Find(*g.baseline);
  char limit[32];
  std::snprintf(limit, sizeof limit, "%s %.2f", g.kind == Limit::AtMost ? "<=" : ">=", g.limit);
  std::string row = g.what + '\t';
  if (!figure || (g.baseline && (!base || *base <= 0))) {
    row += "not measured\t";
    row += g.baseline ? Label(*g.baseline) : std::string("-");
    row += "\t-\t";
    row += limit;
    row += "\tNOT RUN";
    return row;
  }
  double ratio = *figure;
  std::string baseText = "-";
  if (g.baseline) {
    ratio = *figure / *base;
    baseText = Label(*g.baseline) + " " + Show(*g.baseline, *base, g.unit);
  }
  const bool holds = g.kind == Limit::AtMost ? ratio <= g.limit : ratio >= g.limit;
  char ratioText[32];
  std::snprintf(ratioText, sizeof ratioText, "%.2f", ratio);
  row += Show(g.figure, *figure, g.unit) + '\t' + baseText + '\t' + ratioText + '\t' + limit +
         '\t' + (holds ? "holds" : "FAILS");
  return row;
}

} // namespace

void AddRatioGoal(std::string what, Measure figure, Measure baseline, double limit, Limit kind) {
  Goals().push_back(Goal{std::move(what), std::move(figure), std::move(baseline), limit, kind, ""});
}

void AddValueGoal(std::string what, Measure figure, double limit, Limit kind, std::string unit) {
  Goals().push_back(
      Goal{std::move(what), std::move(figure), std::nullopt, limit, kind, std::move(unit)});
}

int RunWithGoals(int argc, char** argv) {
  // With a filter only some benchmarks run, and only their goals are
  // reported; without one every goal is, those not measured as NOT RUN.
  bool filtered = false;
  for (int i = 1; i < argc; ++i)
    filtered = filtered || std::string_view(argv[i]).starts_with("--benchmark_filter");
  // Freed memory stays with the process instead of going back to the
  // kernel whenever the top of the heap is free. Otherwise the first-touch
  // page faults of growing it again land on whichever benchmark or
  // iteration next passes the last peak: the same Finds and writes measured
  // four times slower alone than after other benchmarks, and a figure and
  // its baseline differed by the order they ran in. A desktop session,
  // working all day, keeps its grown heap likewise.
  mallopt(M_TRIM_THRESHOLD, 1 << 30);
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  GoalReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  benchmark::Shutdown();

  std::vector<std::string> rows;
  for (const Goal& g : Goals()) {
    if (filtered && !reporter.Find(g.figure)) continue; // not selected in this run
    rows.push_back(Row(g, reporter));
  }
  if (rows.empty()) return 0;
  std::printf("\nGoals (goal, figure, baseline, ratio, limit, result):\n");
  for (const std::string& row : rows)
    std::printf("  %s\n", row.c_str());
  if (const char* path = std::getenv("BELVANE_BENCH_GOALS"); path && *path) {
    if (std::FILE* f = std::fopen(path, "a")) {
      for (const std::string& row : rows)
        std::fprintf(f, "%s\n", row.c_str());
      std::fclose(f);
    } else {
      std::fprintf(stderr, "cannot append the goal rows to %s\n", path);
      return 1;
    }
  }
  return 0;
}

} // namespace belvane::bench

// The table of `./bench`: a row a benchmark, our time, how many times what it stands beside that is, and what
// else it counted.
//
// A counter "to_…" is a ratio to the machine's floor or to a peer, measured in the same run.
#include <benchmark/benchmark.h>
#include <fmt/format.h>

#include <string>
#include <string_view>
#include <vector>

namespace {

class Table final : public benchmark::BenchmarkReporter {
  public:
    bool ReportContext(const Context& context) override {
        nameWidth_ = context.name_field_width;
        fmt::print("{:<{}}  {:>12}  {}\n", "benchmark", nameWidth_, "ours", "times");
        return true;
    }
    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            fmt::print("{:<{}}  {}\n", run.benchmark_name(), nameWidth_, textOf(run));
            hasFailures_ = hasFailures_ || run.error_occurred;
        }
    }
    bool hasFailures() const { return hasFailures_; }

  private:
    static std::string textOf(const Run& run) {
        if (run.error_occurred)
            return "failed: " + run.error_message;
        std::string ratios, others;
        for (const auto& [name, counter] : run.counters) {
            if (name.starts_with(ratioPrefix))
                ratios += fmt::format("{:.3g} {}   ", counter.value, name.substr(ratioPrefix.size()));
            else
                others += fmt::format("{}={:.4g} ", name, counter.value);
        }
        return fmt::format("{:>9.4g} {:>2}  {}({})", run.GetAdjustedRealTime(),
                           benchmark::GetTimeUnitString(run.time_unit), ratios, others);
    }

    static constexpr std::string_view ratioPrefix = "to_";

    std::size_t nameWidth_ = 0;
    bool hasFailures_ = false;
};

}  // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    Table table;
    benchmark::RunSpecifiedBenchmarks(&table);
    benchmark::Shutdown();
    return table.hasFailures() ? 1 : 0;
}

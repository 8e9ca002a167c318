#include "bench/Beside.h"

#include <algorithm>
#include <cstdio>
#include <iterator>

namespace bench
{

namespace
{

/// Three significant digits and a unit: "1.23 us".
std::string timeText(double nanoseconds)
{
    constexpr const char* units[] = {"ns", "us", "ms", "s"};
    std::size_t unit = 0;
    for (; nanoseconds >= 1000 && unit < std::size(units) - 1; unit++)
        nanoseconds /= 1000;
    char text[32];
    std::snprintf(text, sizeof text, "%.*f %s",
                  nanoseconds < 10    ? 2
                  : nanoseconds < 100 ? 1
                                      : 0,
                  nanoseconds, units[unit]);
    return text;
}

/// Prints the rows as a table in Markdown.
class TableReporter : public benchmark::BenchmarkReporter
{
public:
    bool ReportContext(const Context&) override
    {
        std::puts("| operation | size | measured | floor | ratio | |\n|---|--:|--:|--:|--:|---|");
        return true;
    }

    void ReportRuns(const std::vector<Run>& runs) override
    {
        for (const Run& run : runs)
            print(run);
        std::fflush(stdout);
    }

private:
    static void print(const Run& run)
    {
        const benchmark::BenchmarkName& name = run.run_name;
        if (run.error_occurred)
        {
            std::printf("| %s | %s | failed: %s | | | |\n", name.function_name.c_str(), name.args.c_str(),
                        run.error_message.c_str());
            return;
        }
        const double operation = run.counters.at("operation_ns").value;
        const double floor = run.counters.at("floor_ns").value;
        std::printf("| %s | %s | %s | %s | %.2f | %s |\n", name.function_name.c_str(), name.args.c_str(),
                    timeText(operation).c_str(), timeText(floor).c_str(), operation / floor, run.report_label.c_str());
    }
};

} // namespace

Row::~Row()
{
    _state.counters["operation_ns"] = _operation;
    _state.counters["floor_ns"] = _floor;
}

void Row::add(double operation, double floor, int calls)
{
    _operation = std::min(_operation, operation / calls);
    _floor = std::min(_floor, floor / calls);
    _state.SetIterationTime(operation / 1e9);
}

} // namespace bench

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    bench::TableReporter table;
    return benchmark::RunSpecifiedBenchmarks(&table) > 0 ? 0 : 1;
}

// SPDX-License-Identifier: Apache-2.0

// What the module costs: classifying a tool's lines, storing them as records, reading the rows.
// Usage: module-bench E2FSCK-OUTPUT SCRATCH-DIRECTORY [benchmark options]

#include "bench/BenchHost.h"
#include "bench/RealOutput.h"
#include "bench/TimedProcess.h"
#include "contract/pellar/ResultPhrases.h"
#include "fixwell/messagelog/MessageRecord.h"

#include <benchmark/benchmark.h>
#include <malloc.h>

#include <chrono>
#include <cstdio>
#include <fstream>

namespace orvane::bench {
namespace {

std::filesystem::path outputFile;
std::filesystem::path scratch;

/// What the allocator has handed out.
std::size_t allocatedBytes()
{
    const struct mallinfo2 information = ::mallinfo2();
    return information.uordblks + information.hblkhd;
}

template <class Work>
double bestSeconds(int times, Work&& work)
{
    double best = 1e9;
    for (int i = 0; i < times; ++i) {
        const auto start = std::chrono::steady_clock::now();
        work();
        const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - start;
        best = std::min(best, taken.count());
    }
    return best;
}

/// Says every line to the module in a fresh host, and answers the seconds it took.
double secondsToStore(const std::vector<std::string_view>& lines, bool saves,
                      double* bytesPerRecord)
{
    std::filesystem::remove_all(scratch / "state");
    BenchHost host(scratch / "state");
    host.selectDisk();
    host.module().verifyDisk(nullptr);
    const std::size_t before = allocatedBytes();
    const auto start = std::chrono::steady_clock::now();
    for (std::size_t i = 0; i < lines.size(); ++i) {
        host.module().plAsyncMessageForDisk(host.reference(), lines[i], {});
        if (saves && i % 4096 == 0)
            host.host().histories().saveNew();
    }
    if (saves)
        host.host().histories().saveNew();
    const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - start;
    if (bytesPerRecord != nullptr) {
        std::size_t text = 0;
        for (const std::string_view line : lines)
            text += line.size();
        *bytesPerRecord = static_cast<double>(allocatedBytes() - before - text) /
                          static_cast<double>(lines.size());
    }
    return taken.count();
}

void compareWithGrep()
{
    const std::string text = readFile(outputFile);
    const std::vector<std::string_view> lines = linesOf(text);
    const auto phrases = scratch / "phrases.txt";
    std::ofstream stream(phrases);
    for (const contract::ResultPhrase& phrase : contract::resultPhrases)
        stream << phrase.key << '\n';
    stream.close();

    const auto millions = static_cast<double>(lines.size()) / 1e6;
    const double grep = bestSeconds(5, [&] {
        secondsOf({"grep", "-c", "-i", "-F", "-f", phrases.string(), outputFile.string()});
    });
    BenchHost host(scratch / "state");
    fixwell::LineClassifier classifier(host.host().hostBundle());
    long found = 0;
    const double classify = bestSeconds(5, [&] {
        for (const std::string_view line : lines)
            found += classifier.classOf(line);
    });
    benchmark::DoNotOptimize(found);
    double bytes = 0;
    double store = 1e9;
    double save = 1e9;
    for (int i = 0; i < 3; ++i) {
        store = std::min(store, secondsToStore(lines, false, i == 0 ? &bytes : nullptr));
        save = std::min(save, secondsToStore(lines, true, nullptr));
    }

    std::printf("%.2f million lines of e2fsck's output, %.1f MB\n", millions,
                static_cast<double>(text.size()) / 1e6);
    const auto row = [&](const char* what, double seconds) {
        std::printf("  %-44s %7.2f million lines/s   %5.3f of grep\n", what, millions / seconds,
                    grep / seconds);
    };
    row("grep -c -i -F -f PHRASES", grep);
    row("classification alone", classify);
    row("message callback to stored record", store);
    row("the same, with the history saved", save);
    std::printf("  %-44s %7.1f bytes\n\n", "a stored record, beyond its text", bytes);
}

/// A history as a long check leaves it: one row in eight is shown without details.
contract::Array makeHistory(std::size_t records)
{
    using namespace fixwell;
    const Array history = Array::make();
    for (std::size_t i = 0; i < records; ++i)
        history.append(Dictionary::of(
            {{kOV_typeOfOutputKey, kOV_typeOfOutput_string},
             {kFsckVerbosity, i % 8 == 0 ? verbosity::main : verbosity::fine},
             {kOV_finalAttributedString_type, StyledText::make("Inode, i_blocks is 8.\n")}}));
    return history;
}

void readAllRows(benchmark::State& state)
{
    std::filesystem::remove_all(scratch / "state");
    BenchHost host(scratch / "state");
    host.disk().setFsckHistory(makeHistory(static_cast<std::size_t>(state.range(0))));
    host.showDetails(state.range(1) != 0);
    std::size_t rows = 0;
    for (auto iteration : state) {
        host.selectDisk();
        rows = host.rows().outlineViewNumberOfChildrenOfItem({});
        for (std::size_t row = 0; row < rows; ++row)
            benchmark::DoNotOptimize(host.rows().outlineViewChildOfItem(row, {}));
    }
    state.counters["rows"] = static_cast<double>(rows);
    state.counters["per_row"] = benchmark::Counter(
        static_cast<double>(rows),
        benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

BENCHMARK(readAllRows)
    ->ArgNames({"records", "details"})
    ->ArgsProduct({{10'000, 100'000, 1'000'000, 10'000'000}, {0, 1}})
    ->Unit(benchmark::kMillisecond);

/// The first count of a history that has just been selected, as when its window opens.
void openHistory(benchmark::State& state)
{
    std::filesystem::remove_all(scratch / "state");
    BenchHost host(scratch / "state");
    host.disk().setFsckHistory(makeHistory(static_cast<std::size_t>(state.range(0))));
    host.selectDisk();
    for (auto iteration : state) {
        state.PauseTiming();
        host.showDetails(true);
        state.ResumeTiming();
        host.showDetails(false);
        benchmark::DoNotOptimize(host.rows().outlineViewNumberOfChildrenOfItem({}));
    }
}

BENCHMARK(openHistory)->ArgName("records")->Arg(1'000'000)->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace orvane::bench

int main(int argc, char** argv)
{
    if (argc < 3) {
        std::fprintf(stderr, "Usage: module-bench E2FSCK-OUTPUT SCRATCH-DIRECTORY\n");
        return 2;
    }
    orvane::bench::outputFile = argv[1];
    orvane::bench::scratch = argv[2];
    orvane::bench::compareWithGrep();
    int rest = argc - 2;
    argv[2] = argv[0];
    benchmark::Initialize(&rest, argv + 2);
    benchmark::RunSpecifiedBenchmarks();
    return 0;
}

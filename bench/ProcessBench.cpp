// SPDX-License-Identifier: Apache-2.0

// Whole processes in pairs: "fixwell verify IMAGE" and "e2fsck -f -n IMAGE", one after the other,
// so that a machine that grows slower does so for both.
// Usage: process-bench PAIRS IMAGE...

#include "bench/TimedProcess.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

using orvane::bench::secondsOf;

namespace {

double median(std::vector<double> values)
{
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

}  // namespace

int main(int argc, char** argv)
{
    if (argc < 3) {
        std::fprintf(stderr, "Usage: process-bench PAIRS IMAGE...\n");
        return 2;
    }
    const int pairs = std::max(1, std::atoi(argv[1]));
    for (int i = 2; i < argc; ++i) {
        const std::vector<std::string> ours{FIXWELL_PROGRAM, "verify", argv[i]};
        const std::vector<std::string> plain{"/usr/sbin/e2fsck", "-f", "-n", argv[i]};
        secondsOf(ours);
        secondsOf(plain);
        std::vector<double> a;
        std::vector<double> b;
        std::vector<double> ratios;
        std::vector<double> differences;
        for (int pair = 0; pair < pairs; ++pair) {
            a.push_back(secondsOf(ours));
            b.push_back(secondsOf(plain));
            ratios.push_back(a.back() / b.back());
            differences.push_back(a.back() - b.back());
        }
        std::printf(
            "%s, %d pairs: fixwell verify %.4f s, e2fsck -f -n %.4f s (medians); "
            "ratio %.3f, difference %.1f ms (medians of the pairs)\n",
            argv[i], pairs, median(a), median(b), median(ratios), median(differences) * 1000);
    }
    return 0;
}

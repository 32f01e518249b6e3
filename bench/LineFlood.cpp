// SPDX-License-Identifier: Apache-2.0

// A checking tool that prints 400,000 lines a second for five seconds, of the kind that some
// damaged volumes make e2fsck print, and then says that the volume is sound. Built as "e2fsck".

#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <string>
#include <thread>

namespace {

constexpr int milliseconds = 5000;
constexpr int linesPerMillisecond = 400;

bool writeAll(const std::string& text)
{
    for (std::size_t done = 0; done < text.size();) {
        const ssize_t count = ::write(STDOUT_FILENO, text.data() + done, text.size() - done);
        if (count <= 0)
            return false;
        done += static_cast<std::size_t>(count);
    }
    return true;
}

}  // namespace

int main()
{
    const auto start = std::chrono::steady_clock::now();
    writeAll("Pass 1: Checking inodes, blocks, and sizes\n");
    for (int i = 0; i < milliseconds; ++i) {
        std::string lines;
        for (int line = 0; line < linesPerMillisecond; ++line)
            lines +=
                "Inode " + std::to_string(i * linesPerMillisecond + line) + " ref count is 1\n";
        if (!writeAll(lines))
            return 8;
        std::this_thread::sleep_until(start + std::chrono::milliseconds(i + 1));
    }
    const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - start;
    std::fprintf(stderr, "wrote for %.2f s\n", taken.count());
    return 0;
}

// SPDX-License-Identifier: Apache-2.0
#include "tests/support/InterruptedRepair.h"

#include "pellar/undo/UndoStore.h"
#include "tests/support/TestDirectory.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <span>
#include <stdexcept>
#include <utility>

namespace orvane::test {
namespace {

/// Bytes that are written once, and then not any more.
class FailingRegion final : public pellar::Region {
public:
    explicit FailingRegion(std::string& bytes) : bytes_(bytes) {}
    std::uint64_t length() const override { return bytes_.size(); }
    int read(std::uint64_t place, std::span<std::uint8_t> bytes) override
    {
        bytes_.copy(reinterpret_cast<char*>(bytes.data()), bytes.size(), place);
        return 0;
    }
    int write(std::uint64_t place, pellar::ByteView bytes) override
    {
        if (!std::exchange(canWrite_, false))
            return EIO;
        std::ranges::copy(bytes, bytes_.begin() + static_cast<std::ptrdiff_t>(place));
        return 0;
    }
    int sync() override { return 0; }
    void forgetCached() override {}

private:
    std::string& bytes_;
    bool canWrite_ = true;
};

}  // namespace

std::string interruptRepair(const std::filesystem::path& image,
                            const std::filesystem::path& records)
{
    std::string bytes = contentsOf(image);
    std::string repaired = bytes;
    std::vector<pellar::ByteRange> ranges;
    for (const std::uint64_t place : {bytes.size() / 2, bytes.size() - 4096}) {
        repaired.replace(place, 512, 512, 'r');
        ranges.push_back({place, 512});
    }
    FailingRegion disk(bytes);
    FailingRegion after(repaired);
    const pellar::RecordedRepair repair{
        {std::filesystem::canonical(image), 0, bytes.size(), "", "ext4", "disk"},
        {pellar::Subject::Filesystem, pellar::Operation::Repair},
        ::geteuid(),
        std::chrono::system_clock::now()};
    const auto store = pellar::UndoStore::open(records);
    auto record = store->save(repair, ranges, disk, after);
    if (record->apply(disk))
        throw std::runtime_error("cannot prepare the test: the repair is not interrupted");
    write(image, bytes);
    return repaired;
}

}  // namespace orvane::test

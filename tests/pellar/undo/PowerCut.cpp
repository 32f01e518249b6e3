// SPDX-License-Identifier: Apache-2.0
#include "tests/pellar/undo/PowerCut.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>

namespace pellar::test {
namespace fs = std::filesystem;

int CachedDisk::read(std::uint64_t place, std::span<std::uint8_t> bytes)
{
    if (++reads >= failingReadsFrom)
        return EIO;
    if (place > cached.size() || bytes.size() > cached.size() - place)
        return EFBIG;
    cached.copy(reinterpret_cast<char*>(bytes.data()), bytes.size(), place);
    return 0;
}

int CachedDisk::write(std::uint64_t place, ByteView bytes)
{
    ++writes;
    if (failingWrites.contains(writes) || writes >= failingFrom || place == badPlace)
        return EIO;
    if (writes == lostWrite)
        return 0;
    pending.emplace_back(place, std::string(bytes.begin(), bytes.end()));
    cached.replace(place, bytes.size(), pending.back().second);
    happened();
    return 0;
}

int CachedDisk::sync()
{
    if (failingSyncs > 0) {
        --failingSyncs;
        return EIO;
    }
    medium = cached;
    pending.clear();
    happened();
    return 0;
}

PowerCuts::PowerCuts(const fs::path& store, CachedDisk& disk) : store_(store), disk_(disk)
{
    fs::create_directory(store);
    safe_ = look();
    disk_.happened = [this] {
        happened();
    };
}

SyncFunction PowerCuts::syncFunction()
{
    return [this](int descriptor) {
        happened();
        synced(descriptor);
        happened();
        return 0;
    };
}

PowerCuts::Files PowerCuts::look()
{
    Files files;
    for (const auto& entry : fs::recursive_directory_iterator(store_)) {
        FileDescriptor opened(::open(entry.path().c_str(), O_RDONLY | O_CLOEXEC));
        struct stat status = {};
        ::fstat(opened.get(), &status);
        kept_.try_emplace(status.st_ino, std::move(opened));
        files.names[entry.path()] = status.st_ino;
        if (entry.is_regular_file())
            files.bytes[status.st_ino] = orvane::test::contentsOf(entry.path());
    }
    return files;
}

void PowerCuts::synced(int descriptor)
{
    const fs::path path = fs::read_symlink("/proc/self/fd/" + std::to_string(descriptor));
    Files now = look();
    if (!fs::is_directory(path)) {
        const ino_t number = now.names.at(path);
        safe_.bytes[number] = now.bytes[number];
        return;
    }
    const auto isIn = [&path](const auto& name) {
        return name.first.parent_path() == path;
    };
    std::erase_if(safe_.names, isIn);
    std::erase_if(now.names, std::not_fn(isIn));
    safe_.names.merge(now.names);
}

void PowerCuts::happened()
{
    constexpr int byChance = 8;
    const Files now = look();
    remains.push_back(cut(now, [] { return false; }));
    remains.push_back(cut(now, [] { return true; }));
    for (int i = 0; i < byChance; ++i)
        remains.push_back(cut(now, [this] { return random_() % 2 == 0; }));
}

Remains PowerCuts::cut(const Files& now, const Chance& isThere)
{
    Remains left;
    auto all = safe_.names;
    all.insert(now.names.begin(), now.names.end());
    for (const auto& [path, ignored] : all) {
        const auto& names = isThere() ? now.names : safe_.names;
        const auto found = names.find(path);
        if (found == names.end())
            continue;
        const ino_t number = found->second;
        if (path.parent_path() == store_)
            left.store[path.filename()];
        else if (const auto record = left.store.find(path.parent_path().filename());
                 record != left.store.end())
            record->second[path.filename()] = now.bytes.contains(number) && isThere()
                                                  ? now.bytes.at(number)
                                                  : safe_.bytes[number];
    }
    left.disk = cutDisk(isThere);
    return left;
}

std::string PowerCuts::cutDisk(const Chance& isThere)
{
    std::string bytes = disk_.medium;
    for (const auto& [place, written] : disk_.pending) {
        const bool isThereInPart = isThere();
        const std::size_t count = !isThereInPart ? 0
                                  : isThere()    ? written.size()
                                                 : random_() % written.size();
        bytes.replace(place, count, written, 0, count);
    }
    return bytes;
}

void putStore(const Remains& remains, const fs::path& store)
{
    for (const auto& [directory, files] : remains.store) {
        fs::create_directories(store / directory);
        for (const auto& [name, bytes] : files)
            orvane::test::write(store / directory / name, bytes);
    }
}

}  // namespace pellar::test

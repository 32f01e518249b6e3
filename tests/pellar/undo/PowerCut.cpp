// SPDX-License-Identifier: Apache-2.0
#include "tests/pellar/undo/PowerCut.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>

namespace pellar::test {
namespace {

namespace fs = std::filesystem;

/// Of the names in either, each as it is in one of them.
template <class Names, class Chance>
Names mixed(const Names& safe, const Names& now, const Chance& isThere)
{
    Names all = safe;
    all.insert(now.begin(), now.end());
    Names names;
    for (const auto& [name, ignored] : all) {
        const bool isSame =
            safe.contains(name) && now.contains(name) && safe.at(name) == now.at(name);
        const Names& from = isSame || !isThere() ? safe : now;
        if (from.contains(name))
            names[name] = from.at(name);
    }
    return names;
}

}  // namespace

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
    const auto numberOf = [this](const fs::path& path) {
        FileDescriptor opened(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
        struct stat status = {};
        ::fstat(opened.get(), &status);
        kept_.try_emplace(status.st_ino, std::move(opened));
        return status.st_ino;
    };
    Files files;
    for (const auto& record : fs::directory_iterator(store_)) {
        const ino_t directory = numberOf(record.path());
        files.directories[record.path().filename()] = directory;
        for (const auto& file : fs::directory_iterator(record.path())) {
            const ino_t number = numberOf(file.path());
            files.names[directory][file.path().filename()] = number;
            files.bytes[number] = orvane::test::contentsOf(file.path());
        }
    }
    return files;
}

void PowerCuts::synced(int descriptor)
{
    struct stat status = {};
    struct stat store = {};
    ::fstat(descriptor, &status);
    ::stat(store_.c_str(), &store);
    Files now = look();
    if (status.st_ino == store.st_ino)
        safe_.directories = now.directories;
    else if (S_ISDIR(status.st_mode))
        safe_.names[status.st_ino] = now.names[status.st_ino];
    else
        safe_.bytes[status.st_ino] = now.bytes[status.st_ino];
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
    const auto in = [](const auto& map, ino_t number) {
        const auto found = map.find(number);
        return found == map.end() ? typename std::decay_t<decltype(map)>::mapped_type()
                                  : found->second;
    };
    Remains left;
    for (const auto& [name, directory] : mixed(safe_.directories, now.directories, isThere)) {
        auto& files = left.store[name];
        const Names names = mixed(in(safe_.names, directory), in(now.names, directory), isThere);
        for (const auto& [file, number] : names)
            files[file] =
                in(now.bytes.contains(number) && isThere() ? now.bytes : safe_.bytes, number);
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

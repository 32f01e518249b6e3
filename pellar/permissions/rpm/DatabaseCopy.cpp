// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/rpm/DatabaseCopy.h"

#include "pellar/process/ReducedRights.h"

#include <fcntl.h>
#include <unistd.h>

namespace pellar {
namespace {

// The largest known have 400 million bytes.
constexpr CopyBounds boundsOfDatabase{2ULL << 30U, 8ULL << 30U};

// SQLite makes its shared memory anew, and a lock is of no use in a copy.
bool isCopied(const std::string& name)
{
    return !name.starts_with('.') && !name.ends_with("-shm") && !name.starts_with("__db.");
}

Sentence sentenceFor(Copying copying)
{
    switch (copying) {
        case Copying::Stopped: return {};
        case Copying::BeyondBounds:
            return {"the package database is larger than any system's is; it was not read", {}, {}};
        case Copying::Failed:
        case Copying::Done: break;
    }
    return {"the package database cannot be copied to be read", {}, {}};
}

}  // namespace

std::variant<TemporaryDirectory, Sentence> copyDatabase(const RootFiles& root,
                                                        const std::string& database,
                                                        const StopSwitch& stop)
{
    auto made = TemporaryDirectory::make("rpmdb");
    if (!made)
        return sentenceFor(Copying::Failed);
    CopyBounds bounds = boundsOfDatabase;
    for (const std::string& file : root.names(database)) {
        const FileDescriptor from = root.openFile(database + '/' + file);
        if (!from || !isCopied(file))
            continue;
        const FileDescriptor to(
            ::open((made->path() / file).c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
        const Copying copying = to ? copyFile(from.get(), to.get(), bounds, stop) : Copying::Failed;
        if (copying != Copying::Done)
            return sentenceFor(copying);
    }
    if (::geteuid() == 0 && !made->giveTo(userOfReduced, groupOfReduced))
        return sentenceFor(Copying::Failed);
    return *std::move(made);
}

}  // namespace pellar

// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/rpm/DatabaseCopy.h"

#include <fcntl.h>
#include <sys/sendfile.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <utility>

namespace pellar {
namespace {

bool copy(const FileDescriptor& from, const std::filesystem::path& path)
{
    const FileDescriptor to(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (!from || !to)
        return false;
    constexpr std::size_t portion = 16U << 20U;
    ssize_t count = 0;
    while ((count = ::sendfile(to.get(), from.get(), nullptr, portion)) > 0) {
    }
    return count == 0;
}

// SQLite makes its shared memory anew, and a lock is of no use in a copy.
bool isCopied(const std::string& name)
{
    return !name.starts_with('.') && !name.ends_with("-shm") && !name.starts_with("__db.");
}

}  // namespace

std::optional<DatabaseCopy> DatabaseCopy::make(const RootDirectory& root,
                                               const std::string& database)
{
    std::error_code error;
    std::string name = std::filesystem::temp_directory_path(error).native() + "/rpmdb.XXXXXX";
    if (error || ::mkdtemp(name.data()) == nullptr)
        return std::nullopt;
    DatabaseCopy made{std::filesystem::path(name)};
    for (const std::string& file : root.names(database)) {
        const FileDescriptor from = root.openFile(database + '/' + file);
        if (from && isCopied(file) && !copy(from, made.path_ / file))
            return std::nullopt;
    }
    return made;
}

DatabaseCopy::DatabaseCopy(DatabaseCopy&& other) noexcept : path_(std::exchange(other.path_, {})) {}

DatabaseCopy::~DatabaseCopy()
{
    std::error_code error;
    if (!path_.empty())
        std::filesystem::remove_all(path_, error);
}

}  // namespace pellar

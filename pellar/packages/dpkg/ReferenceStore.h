// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <filesystem>
#include <string>
#include <string_view>

namespace pellar {

/// What archives have said about their packages' files, kept for when the archives are gone. Each
/// is named by the SHA-256 digest of the archive it was read from, so nothing but that archive
/// can have said it.
class KeptReferences {
public:
    virtual ~KeptReferences() = default;

    /// A mtree(5) for reading; none when nothing is kept of such an archive.
    [[nodiscard]] virtual FileDescriptor open(const std::string& digest) const = 0;
    /// Not being able to keep it loses time at the next run, nothing else.
    virtual void keep(const std::string& digest, std::string_view mtree) = 0;
};

/// They lie in one directory. What lies there decides about the rights to a system's files, so it
/// is only read when nobody but this user (or root) can write to it, and is only used for the
/// running system itself: what another one brings goes into no store.
class ReferenceStore final : public KeptReferences {
public:
    /// An empty path keeps nothing. The directory is made when it is first needed; what lies in
    /// it under other names than digests is taken away.
    explicit ReferenceStore(std::filesystem::path directory);

    [[nodiscard]] FileDescriptor open(const std::string& digest) const override;
    void keep(const std::string& digest, std::string_view mtree) override;

private:
    std::filesystem::path pathOf(const std::string& digest) const;
    void removeOthers() const;

    std::filesystem::path directory_;
    bool isTrusted_ = false;
};

}  // namespace pellar

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/undo/RecordDirectory.h"
#include "pellar/undo/UndoStore.h"

#include <filesystem>
#include <memory>
#include <string>

namespace pellar {

/// What everybody may know of the records in a store that only its owner can read: a file for each,
/// with the facts but for the name of the volume and the digests. Only devices are in it, as the
/// path of an image may be nobody else's business. Who has the record's lock writes its file. All
/// numbers answered are 0 or errno.
class PublicIndex {
public:
    /// Makes the directory when it is missing. Everybody may read it, and search the two above it.
    /// `records` is the store's. In English why not.
    [[nodiscard]] static Result<PublicIndex, std::string> open(
        const std::filesystem::path& path, std::shared_ptr<const StoreDirectory> records,
        SyncFunction sync);

    /// Null for an empty path.
    [[nodiscard]] static Result<std::shared_ptr<const PublicIndex>, std::string> openUnlessEmpty(
        const std::filesystem::path& path, std::shared_ptr<const StoreDirectory> records,
        SyncFunction sync);

    /// In place of what was there, on the medium. Unless it is Applied, the record is shown as in
    /// use for as long as what is answered is open; that is none for what is not in the index.
    [[nodiscard]] Result<FileDescriptor, int> publish(const std::string& id,
                                                      const RecordFacts& facts) const;
    /// Makes it as the record is, which nobody works on.
    void mend(const std::string& id, const RecordFacts& facts) const;
    /// 0 as well when it is not there.
    int remove(const std::string& id) const;
    /// Removes what has no record any more.
    void removeOrphans() const;

private:
    PublicIndex(StoreDirectory directory, std::shared_ptr<const StoreDirectory> records)
        : directory_(std::move(directory)), records_(std::move(records))
    {
    }

    [[nodiscard]] bool holds(const std::string& id, std::string_view text) const;

    StoreDirectory directory_;
    std::shared_ptr<const StoreDirectory> records_;
};

/// What the index says; nothing where there is none. A record that nobody works on may have been
/// undone since its writer was killed, until the owner next reads the store. An errno where there
/// is one that cannot be read, or that others than root and this user could change. Any thread.
[[nodiscard]] Result<RecordList, int> readPublicIndex(const std::filesystem::path& path);

}  // namespace pellar

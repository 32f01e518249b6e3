// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/Permissions.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

namespace pellar {

/// Why it is not known what a file's permissions should be, although its package says something.
enum class Doubt {
    None,
    Script,          ///< a script of a package may have set them
    TemporaryFiles,  ///< a line of tmpfiles.d(5) may have
    PackagesDiffer,  ///< two packages have the file and say different things
    UnknownAccount,  ///< the owner's name is not in the system's own etc/passwd or etc/group
    State,           ///< a program may look after it itself: below var, and root's by default only
    NotVerified,     ///< the package itself says that they may differ
};

/// What a package says about one of its files.
struct Reference {
    std::string path;              ///< from the root on, without a leading "/"
    std::optional<FileKind> kind;  ///< none where the source does not tell
    mode_t mode = 0;               ///< the lower twelve bits
    uid_t user = 0;
    gid_t group = 0;
    /// None where the source does not tell.
    std::optional<std::string> capabilities;
    Doubt doubt = Doubt::None;
    /// Of the contents, see kindOfDigest; empty where it is not known.
    std::string digest;
};

/// Whether a file that is so lends rights to those who run it.
bool lendsRights(const Reference& reference);

struct References {
    std::vector<Reference> files;  ///< by path, a directory before what it holds
    std::uint64_t packages = 0;
    std::uint64_t packagesWithoutSource = 0;
    std::uint64_t packagesBeyondBounds = 0;       ///< of those: larger than a package may be
    std::vector<std::string> filesWithoutSource;  ///< installed, but nobody says how
};

/// How far the reading of a database is, in per cent; NO as soon as it is to be stopped.
using ReadingProgress = std::function<bool(double percent)>;

/// Puts together what all packages say: a directory belongs to many of them.
class ReferenceCollector {
public:
    /// A package's word. Where two differ, the file is in doubt; a doubt stays.
    void add(Reference reference);
    /// A package has the file and does not say more.
    void addWithoutSource(const std::string& path);
    /// The administrator's word, which settles every doubt. The packages say of what kind the
    /// file is.
    void override(Reference reference);

    void countPackage(bool hasSource);
    /// Of a package that was counted as one without a source.
    void countBeyondBounds() { ++result_.packagesBeyondBounds; }
    /// More files than an installed system may have: what comes now is not taken.
    bool isFull() const;
    [[nodiscard]] References take() &&;

private:
    std::unordered_map<std::string, Reference> files_;
    std::unordered_map<std::string, Reference> overrides_;
    std::vector<std::string> withoutSource_;
    References result_;
};

}  // namespace pellar

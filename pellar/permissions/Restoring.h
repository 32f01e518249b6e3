// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Inspection.h"

#include <variant>

namespace pellar {

struct Restored {};

/// The file was no longer what had been looked at, or somebody has it open for writing.
struct ChangedMeanwhile {
    bool wasTouched = false;  ///< it has its owner, and lends no rights; else nothing was done
};

/// The file has further names, and its directory is open to somebody who is not root: it may be
/// somebody else's file that was linked there. Nothing was done.
struct SuspiciousLink {};

/// The file lends rights, and what it holds is not known to be what its package brought. Rights
/// are not given to it.
struct ForeignContents {
    bool wasTouched = false;  ///< as above
};

struct NotPermitted {
    int error;  ///< errno
};

using Restoring =
    std::variant<Restored, ChangedMeanwhile, SuspiciousLink, ForeignContents, NotPermitted>;

/// Gives the file what its reference says: the owner first, because chown(2) clears setuid and
/// the capabilities, then the mode, then the capabilities, and looks whether it has them. All of
/// it on the object that `seen` holds, under whatever name it may be by then. The kind must be
/// right and the reference without doubt. A file that lends rights gets them when its contents are
/// the package's, it is its owner's again and nobody has it open for writing. Needs root.
[[nodiscard]] Restoring restore(const RootDirectory& root, const Reference& reference,
                                const FoundFile& seen);

/// The same for a file that is known to be the right one: it is looked up by no name.
[[nodiscard]] Restoring give(const Reference& reference, const FoundFile& seen);

}  // namespace pellar

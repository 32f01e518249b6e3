// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace pellar {

/// What of a disk a job is about.
enum class Subject { Filesystem, PartitionMap, Permissions };

/// What the user asked for. A repair reads as well: it verifies what it has done.
enum class Operation { Verify, Repair };

/// One of the six things that a job does.
struct Task {
    Subject subject = Subject::Filesystem;
    Operation operation = Operation::Verify;

    bool isRepair() const { return operation == Operation::Repair; }

    friend bool operator==(const Task&, const Task&) = default;
};

}  // namespace pellar

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <string_view>

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

struct TaskName {
    std::string_view name;
    Task task;
};

/// The words by which programs of the product ask each other for a task.
inline constexpr std::array taskNames{
    TaskName{"verify", {Subject::Filesystem, Operation::Verify}},
    TaskName{"repair", {Subject::Filesystem, Operation::Repair}},
    TaskName{"verify-map", {Subject::PartitionMap, Operation::Verify}},
    TaskName{"repair-map", {Subject::PartitionMap, Operation::Repair}},
    TaskName{"verify-permissions", {Subject::Permissions, Operation::Verify}},
    TaskName{"repair-permissions", {Subject::Permissions, Operation::Repair}}};

}  // namespace pellar

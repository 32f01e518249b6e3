// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <array>
#include <optional>
#include <string_view>

namespace pellar {

/// What of a disk a job is about.
enum class Subject { Filesystem, PartitionMap, Permissions };

/// What the user asked for. A repair reads as well: it verifies what it has done. Undo takes back
/// the last repair, Finish completes one that was interrupted.
enum class Operation { Verify, Repair, Undo, Finish };

/// Whether a tool writes to the disk itself, or its repair is tried first and, once it is proven,
/// applied.
enum class RepairWay { Direct, TriedFirst };

/// One of the things that a job does.
struct Task {
    Subject subject = Subject::Filesystem;
    Operation operation = Operation::Verify;

    bool isRepair() const { return operation == Operation::Repair; }
    bool isUndo() const { return operation == Operation::Undo || operation == Operation::Finish; }

    friend bool operator==(const Task&, const Task&) = default;
};

struct TaskName {
    Task task;
    std::string_view name;
};

/// Stable names, for files and other programs.
inline constexpr std::array taskNames{
    TaskName{{Subject::Filesystem, Operation::Verify}, "verify"},
    TaskName{{Subject::Filesystem, Operation::Repair}, "repair"},
    TaskName{{Subject::PartitionMap, Operation::Verify}, "verify-partition-map"},
    TaskName{{Subject::PartitionMap, Operation::Repair}, "repair-partition-map"},
    TaskName{{Subject::Permissions, Operation::Verify}, "verify-permissions"},
    TaskName{{Subject::Permissions, Operation::Repair}, "repair-permissions"},
    TaskName{{Subject::Filesystem, Operation::Undo}, "undo"},
    TaskName{{Subject::PartitionMap, Operation::Undo}, "undo-partition-map"},
    TaskName{{Subject::Permissions, Operation::Undo}, "undo-permissions"},
    TaskName{{Subject::Filesystem, Operation::Finish}, "finish"},
    TaskName{{Subject::PartitionMap, Operation::Finish}, "finish-partition-map"}};

inline std::string_view nameOf(Task task)
{
    return std::ranges::find(taskNames, task, &TaskName::task)->name;
}

inline std::optional<Task> taskNamed(std::string_view name)
{
    const auto* const found = std::ranges::find(taskNames, name, &TaskName::name);
    return found == taskNames.end() ? std::nullopt : std::optional(found->task);
}

}  // namespace pellar

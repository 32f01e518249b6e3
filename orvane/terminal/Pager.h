// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace orvane {

/// The words of the pager's command line: of PAGER, at its blanks, without a shell; of "less" where
/// it is not set. None where it is empty, or "cat".
[[nodiscard]] std::vector<std::string> pagerCommand(const std::optional<std::string>& variable);

/// A program that shows what goes to standard output page by page, for as long as this lives. Then
/// the user is waited for. What goes to standard error is shown there, too, if it is a terminal.
///
/// A pager that is left early is no error. A signal that would end the program ends it when the
/// pager has been left: the two would read the terminal side by side. One at a time.
class Pager {
public:
    /// Nothing is started, and the output stays where it was, when there is no such program. Before
    /// any thread.
    [[nodiscard]] static std::unique_ptr<Pager> start(std::vector<std::string> command);
    Pager(const Pager&) = delete;
    Pager& operator=(const Pager&) = delete;
    ~Pager();

private:
    Pager(pid_t id, int input);
};

}  // namespace orvane

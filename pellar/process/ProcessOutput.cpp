// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ProcessOutput.h"

#include <algorithm>

namespace pellar {

void LineSplitter::take(std::string_view bytes)
{
    if (endedByReturn_ && !bytes.empty()) {
        endedByReturn_ = false;
        if (bytes.front() == '\n')
            bytes.remove_prefix(1);
    }
    while (!bytes.empty()) {
        const std::size_t length = std::min(bytes.find_first_of("\r\n"), bytes.size());
        append(bytes.substr(0, length));
        if (length == bytes.size())
            return;
        endLine();
        const bool isReturn = bytes[length] == '\r';
        bytes.remove_prefix(length + 1);
        endedByReturn_ = isReturn && bytes.empty();
        if (isReturn && !bytes.empty() && bytes.front() == '\n')
            bytes.remove_prefix(1);
    }
}

void LineSplitter::finish()
{
    if (!line_.empty() || isDropping_)
        endLine();
}

void LineSplitter::append(std::string_view part)
{
    if (isDropping_)
        return;
    const std::size_t room = longestLine_ - line_.size();
    line_.append(part.substr(0, room));
    if (part.size() <= room)
        return;
    receiver_(line_, true);
    line_.clear();
    isDropping_ = true;
}

void LineSplitter::endLine()
{
    if (!isDropping_)
        receiver_(line_, false);
    line_.clear();
    isDropping_ = false;
}

}  // namespace pellar

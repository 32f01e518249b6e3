// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// What the reading process asks of the one that has rights. Every question but the last two has
/// one answer.
enum class Question : char {
    OpenFile,  ///< a path; answered with a descriptor or none
    Names,     ///< a directory; answered with a memory file of names, each ended by a NUL
    OpenKept,  ///< a digest; answered with a descriptor or none
    Keep,      ///< a digest and a memory file
    Fetch,     ///< packages, each "name version architecture\n"; see answerOfFetch
    Progress,  ///< a double
    Result,    ///< a memory file, see bytesOf(References)
    Stopped,   ///< progress was answered with no
};

/// A packet between the two: a few bytes, and descriptors.
struct ReaderMessage {
    std::string bytes;  ///< of a question, the first is which
    std::vector<FileDescriptor> descriptors;
};

inline constexpr std::size_t largestReaderMessage = 65536;
inline constexpr std::size_t mostDescriptorsOfMessage = 64;

/// Over a connected SOCK_SEQPACKET. NO when the other end is gone, or does not take what it is
/// sent: there is room for more than one answer, so nothing waits here.
bool sendMessage(int socket, std::string_view bytes, const std::vector<int>& descriptors = {});
/// Waits for one. None at the end, and for one that is larger than it may be.
std::optional<ReaderMessage> receiveMessage(int socket);

/// A file in memory that holds these bytes; none when there is no room.
FileDescriptor memoryFileOf(std::string_view bytes);

}  // namespace pellar

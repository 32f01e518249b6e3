// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/dpkg/DpkgReferences.h"
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

/// The services of ReaderServices in the process that has no rights: each call asks the other one
/// and waits for its answer. When that is gone, this process ends.
class BrokeredServices final : public RootFiles, public KeptReferences {
public:
    BrokeredServices(int socket, const PathAliases& aliases) : socket_(socket), aliases_(aliases) {}

    FileDescriptor openFile(const std::string& path) const override;
    std::vector<std::string> names(const std::string& directory) const override;
    const PathAliases& aliases() const override { return aliases_; }
    FileDescriptor open(const std::string& digest) const override;
    void keep(const std::string& digest, std::string_view mtree) override;
    std::vector<FileDescriptor> fetch(std::span<const DpkgPackage> packages) const;
    bool progress(double percent) const;

private:
    ReaderMessage ask(Question question, std::string_view bytes, int descriptor = -1) const;
    FileDescriptor askForFile(Question question, std::string_view bytes) const;

    int socket_;
    const PathAliases& aliases_;
};

}  // namespace pellar

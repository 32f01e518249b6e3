// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/systemd/Journal.h"

#include "pellar/process/FileDescriptor.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <cerrno>
#include <cstdint>
#include <cstring>

namespace orvane {
namespace {

// A datagram may have about 200 KiB (net.core.wmem_default); longer records would need a file.
constexpr std::size_t longestValue = 16U << 10U;
constexpr int longestWait = 2000;  // milliseconds

void appendLength(std::string& text, std::uint64_t length)
{
    for (int byte = 0; byte < 8; ++byte)
        text += static_cast<char>(length >> (8U * static_cast<unsigned>(byte)) & 0xFFU);
}

}  // namespace

std::string encodeForJournal(const std::vector<JournalField>& fields)
{
    std::string text;
    for (const JournalField& field : fields) {
        const std::string_view value = std::string_view(field.value).substr(0, longestValue);
        text += field.name;
        if (value.find('\n') == std::string_view::npos) {
            text += '=';
        } else {
            text += '\n';
            appendLength(text, value.size());
        }
        text += value;
        text += '\n';
    }
    return text;
}

bool writeToJournal(const std::vector<JournalField>& fields, const std::filesystem::path& socket)
{
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (socket.native().size() >= sizeof address.sun_path)
        return false;
    std::memcpy(address.sun_path, socket.c_str(), socket.native().size());
    const pellar::FileDescriptor sender(
        ::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
    const std::string text = encodeForJournal(fields);
    if (!sender ||
        ::connect(sender.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
        return false;
    pollfd writable{sender.get(), POLLOUT, 0};
    for (int attempt = 0; attempt < 2; ++attempt) {
        if (::send(sender.get(), text.data(), text.size(), MSG_NOSIGNAL) >= 0)
            return true;
        if (errno != EAGAIN || ::poll(&writable, 1, longestWait) != 1)
            return false;
    }
    return false;
}

}  // namespace orvane

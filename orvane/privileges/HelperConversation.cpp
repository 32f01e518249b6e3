// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HelperConversation.h"

#include "orvane/privileges/EventWire.h"

#include <poll.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

namespace orvane {
namespace {

bool write(const std::string& line)
{
    const std::string text = line + "\n";
    for (std::size_t done = 0; done < text.size();) {
        const ssize_t count = ::write(STDOUT_FILENO, text.data() + done, text.size() - done);
        if (count <= 0 && errno != EINTR)
            return false;
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    return true;
}

}  // namespace

void Teller::plAsyncStartedForDisk(const contract::DiskReferencePointer&)
{
    tell(pellar::Started{});
}

void Teller::plAsyncMessageForDisk(const contract::DiskReferencePointer&, std::string_view string,
                                   const contract::Dictionary& dictionary)
{
    tell(pellar::Message{std::string(string), dictionary});
}

void Teller::plAsyncFinishedForDisk(const contract::DiskReferencePointer&,
                                    contract::ErrorCode mainError, contract::ErrorCode detailError,
                                    const contract::Dictionary& result)
{
    isOver_ = true;
    tell(pellar::Finished{mainError, detailError, result});
}

void Teller::trace(std::string_view line)
{
    tell(pellar::Trace{std::string(line)});
}

void Teller::tell(const pellar::Event& event)
{
    isHeard_ = isHeard_ && write(lineFromEvent(event));
}

StopLine::StopLine(MainLoop& loop, std::function<void()> pressed)
    : loop_(loop), pressed_(std::move(pressed))
{
    loop_.watch(STDIN_FILENO, POLLIN, [this](short) { read(); });
}

StopLine::~StopLine()
{
    loop_.unwatch(STDIN_FILENO);
}

void StopLine::read()
{
    char buffer[64];
    const ssize_t count = ::read(STDIN_FILENO, buffer, sizeof buffer);
    if (count <= 0)
        loop_.unwatch(STDIN_FILENO);
    if (count == 0)
        pressed_();
    for (ssize_t i = 0; i < count; ++i)
        if (buffer[i] == '\n')
            pressed_();
}

}  // namespace orvane

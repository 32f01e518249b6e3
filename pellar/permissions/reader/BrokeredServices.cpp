// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/reader/BrokeredServices.h"

#include "pellar/permissions/Lines.h"

#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace pellar {

ReaderMessage BrokeredServices::ask(Question question, std::string_view bytes, int descriptor) const
{
    const std::string packet = static_cast<char>(question) + std::string(bytes);
    std::optional<ReaderMessage> answer;
    if (sendMessage(socket_, packet,
                    descriptor < 0 ? std::vector<int>() : std::vector<int>{descriptor}))
        answer = receiveMessage(socket_);
    if (!answer)
        ::_exit(1);
    return *std::move(answer);
}

FileDescriptor BrokeredServices::askForFile(Question question, std::string_view bytes) const
{
    if (bytes.size() >= largestReaderMessage)
        return {};
    ReaderMessage answer = ask(question, bytes);
    return answer.descriptors.empty() ? FileDescriptor() : std::move(answer.descriptors.front());
}

FileDescriptor BrokeredServices::openFile(const std::string& path) const
{
    return askForFile(Question::OpenFile, path);
}

std::vector<std::string> BrokeredServices::names(const std::string& directory) const
{
    const FileDescriptor list = askForFile(Question::Names, directory);
    const auto text = list ? contentsOf(list.get(), SIZE_MAX / 2) : std::nullopt;
    std::vector<std::string> names;
    for (std::string_view rest = text ? std::string_view(*text) : ""; !rest.empty();)
        names.emplace_back(takeField(rest, '\0'));
    return names;
}

FileDescriptor BrokeredServices::open(const std::string& digest) const
{
    return askForFile(Question::OpenKept, digest);
}

void BrokeredServices::keep(const std::string& digest, std::string_view mtree)
{
    if (const FileDescriptor file = memoryFileOf(mtree))
        static_cast<void>(ask(Question::Keep, digest, file.get()));
}

std::vector<FileDescriptor> BrokeredServices::fetch(std::span<const DpkgPackage> packages) const
{
    std::string list;
    for (const DpkgPackage& package : packages)
        list += package.name + ' ' + package.version + ' ' + package.architecture + '\n';
    ReaderMessage answer = ask(Question::Fetch, list);
    std::vector<FileDescriptor> archives;
    auto next = answer.descriptors.begin();
    for (const char isThere : answer.bytes)
        archives.push_back(isThere == '1' && next != answer.descriptors.end() ? std::move(*next++)
                                                                              : FileDescriptor());
    return archives;
}

bool BrokeredServices::progress(double percent) const
{
    std::string bytes(sizeof percent, '\0');
    std::memcpy(bytes.data(), &percent, sizeof percent);
    return ask(Question::Progress, bytes).bytes == "1";
}

}  // namespace pellar

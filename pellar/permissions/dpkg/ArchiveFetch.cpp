// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/dpkg/ArchiveFetch.h"

#include "pellar/permissions/Lines.h"
#include "pellar/process/ProcessRunner.h"

#include <utility>

namespace pellar {
namespace {

/// apt-helper(8) is no command for users and lies in no search path.
constexpr const char* aptHelper = "/usr/lib/apt/apt-helper";

/// Keeps the address among what apt-get says.
class AddressReader final : public RunListener {
public:
    void line(std::string_view line, bool isCut) override
    {
        if (auto found = isCut ? std::nullopt : parseArchiveAddress(line))
            address = std::move(found);
    }
    void progressLine(std::string_view) override {}
    void lineLimitReached() override {}
    void pause() override {}
    void tick() override {}

    std::optional<ArchiveAddress> address;
};

}  // namespace

// 'http://deb.debian.org/debian/pool/main/h/hello/hello_2.10-3_amd64.deb' hello_2.10-3_amd64.deb
// 53080 SHA256:2e6e2f1a0007dc43bc91c273fd36e91e40a4f1c2765a03eca68b70a42103878a
// (apt 2.6.1, on one line)
std::optional<ArchiveAddress> parseArchiveAddress(std::string_view line)
{
    if (!line.starts_with('\''))
        return std::nullopt;
    line.remove_prefix(1);
    const std::string_view address = takeField(line, '\'');
    takeWord(line);
    takeWord(line);
    const std::string_view hash = takeWord(line);
    const bool isWeb = address.starts_with("http://") || address.starts_with("https://");
    if (!isWeb || !hash.starts_with("SHA256:"))
        return std::nullopt;
    return ArchiveAddress{std::string(address), std::string(hash)};
}

ArchiveFetch::ArchiveFetch(const std::string& toolPath, StopSwitch& stop,
                           std::function<void(std::string)> trace)
    : aptGet_(findProgram("apt-get", toolPath)), stop_(stop), trace_(std::move(trace))
{
}

bool ArchiveFetch::fetch(const DpkgPackage& package, const std::filesystem::path& target)
{
    if (aptGet_.empty())
        return false;
    AddressReader reader;
    const auto run = [&](Command command) {
        RunRequest request;
        request.command = std::move(command);
        request.graceTimes = graceTimesFor(Access::ReadOnly);
        if (trace_)
            trace_(shown(request.command));
        return runTool(request, stop_, reader).ending == Ending(Exited{0});
    };
    const std::string wanted = package.name + ':' + package.architecture + '=' + package.version;
    return run({aptGet_, {"--print-uris", "download", wanted}}) && reader.address &&
           run({aptHelper,
                {"download-file", reader.address->address, target.native(), reader.address->hash}});
}

}  // namespace pellar

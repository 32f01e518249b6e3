// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DirectDisks.h"
#include "orvane/support/udisks/DiskOperations.h"
#include "orvane/terminal/Commands.h"
#include "pellar/disks/LoopDevice.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>

namespace orvane {
namespace {

struct ActionText {
    Command command;
    DiskAction action;
    const char* done;  ///< with the disk's name and, when it was mounted, the place
};

constexpr std::array actionTexts{
    ActionText{Command::Mount, DiskAction::Mount, "“%@” is mounted at %@."},
    ActionText{Command::Unmount, DiskAction::Unmount, "“%@” is not mounted any more."},
    ActionText{Command::Eject, DiskAction::Eject, "“%@” was ejected."},
    ActionText{Command::Detach, DiskAction::Detach, "“%@” was detached."}};

const ActionText& textsOf(Command command)
{
    return *std::find_if(actionTexts.begin(), actionTexts.end(),
                         [command](const ActionText& text) { return text.command == command; });
}

/// The device on which an image file is attached; any other name as it is.
std::string deviceBehind(const std::string& name)
{
    struct stat status = {};
    if (::stat(name.c_str(), &status) != 0 || !S_ISREG(status.st_mode))
        return name;
    const auto device = pellar::loopDeviceOn(status.st_dev, status.st_ino, pellar::SystemPaths());
    return device.empty() ? name : device;
}

std::string placeOf(const Disk& disk)
{
    const auto places = placesOf(disk.facts().path);
    return places.empty() ? std::string() : places.front().target;
}

/// Runs what may need a password, with a password agent present.
template <class Function>
auto askingFor(const Function& function, Session& session)
{
    session.expectPassword();
    auto answer = function();
    session.asked();
    return answer;
}

bool isAsWanted(const Result<void, Refusal>& answer)
{
    return answer || answer.error().kind == Refusal::Kind::AlreadySo;
}

int doTo(const NamedDisk& named, const ActionText& texts, Session& session, Reporter& reporter)
{
    const Translator& translator = session.texts();
    const DiskRequest request = requestFor(texts.action, *named.disk);
    const auto objection = objectionTo(texts.action, *named.disk);
    const auto answer = objection ? Result<void, Refusal>(*objection)
                                  : askingFor([&] { return carryOut(request); }, session);
    if (!isAsWanted(answer)) {
        reporter.failure(named.name, failureText(request, answer.error(), translator));
        return exitUnchecked;
    }
    const std::string place =
        texts.action == DiskAction::Mount ? placeOf(*named.disk) : std::string();
    reporter.done(named.name, nameOf(texts.command), place,
                  translator.sentence(texts.done, {request.name, place}));
    return exitSound;
}

}  // namespace

int runDiskAction(const Request& request, Session& session, Reporter& reporter)
{
    int status = exitSound;
    const auto meant = request.command == Command::Detach ? deviceBehind : nullptr;
    for (const NamedDisk& named : session.findDisks(request.disks, status, meant))
        status |= doTo(named, textsOf(request.command), session, reporter);
    return status;
}

int runAttach(const Request& request, Session& session, Reporter& reporter)
{
    const auto access =
        request.attachesReadOnly ? pellar::Access::ReadOnly : pellar::Access::ReadWrite;
    int status = exitSound;
    for (const std::string& name : request.disks) {
        const auto answer = askingFor([&] { return attachImage(name, access); }, session);
        if (!answer) {
            reporter.failure(name,
                             failureText(requestToAttach(name), answer.error(), session.texts()));
            status |= exitUnchecked;
            continue;
        }
        // The device alone, for scripts.
        reporter.done(name, "attach", *answer, *answer);
    }
    return status;
}

}  // namespace orvane

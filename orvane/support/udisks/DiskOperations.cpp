// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskOperations.h"

#include "orvane/support/udisks/DirectDisks.h"
#include "orvane/support/udisks/ImageDevices.h"
#include "orvane/support/udisks/MountedAt.h"
#include "orvane/support/udisks/UDisks.h"

#include <algorithm>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

Answer<> throughUDisks(UDisks& udisks, const DiskStep& step)
{
    switch (step.kind) {
        case DiskStep::Kind::Mount: return udisks.mount(step.node);
        case DiskStep::Kind::Unmount: return udisks.unmount(step.node);
        case DiskStep::Kind::Eject: return udisks.eject(step.node);
        case DiskStep::Kind::DetachLoop: return udisks.detachLoop(step.node);
        case DiskStep::Kind::Attach: break;
    }
    return Refusal{};
}

Answer<> directly(const DiskStep& step)
{
    switch (step.kind) {
        case DiskStep::Kind::Mount: return direct::mount(step.node);
        case DiskStep::Kind::Unmount: return direct::unmount(step.node);
        case DiskStep::Kind::Eject: return direct::eject(step.node);
        case DiskStep::Kind::DetachLoop: return direct::detachLoop(step.node);
        case DiskStep::Kind::Attach: break;
    }
    return Refusal{};
}

// UDisks2 may be there and not know the device; then that is the reason, and not the missing table.
Answer<> throughAny(UDisks& udisks, const DiskStep& step)
{
    const Answer<> answer = throughUDisks(udisks, step);
    const auto* const refusal = std::get_if<Refusal>(&answer);
    if (refusal == nullptr || !isLeftToOthers(*refusal) || !direct::isAllowed())
        return answer;
    const Answer<> other = directly(step);
    const bool saysNothing = refusal->kind == Refusal::Kind::UnknownDevice && other.index() == 1 &&
                             std::get<Refusal>(other).kind == Refusal::Kind::NoTable;
    return saysNothing ? answer : other;
}

// Asked of the mounts as they are now: the list of disks may be out of date. Root's own attempt
// would take away what else of the device is mounted before it came to "/".
bool holdsSystem(const std::vector<pellar::Mount>& places)
{
    return std::any_of(places.begin(), places.end(),
                       [](const auto& place) { return place.target == "/"; });
}

// The kernel takes an image off when nobody has its device open any more (loop(4), LOOP_CLR_FD);
// the device manager may have, for a moment.
bool hasComeOff(const std::string& node)
{
    const auto image =
        std::filesystem::path("/sys/block") / std::filesystem::path(node).filename() / "loop";
    std::error_code error;
    for (int i = 0; i < 100 && std::filesystem::exists(image, error); ++i)
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    return !std::filesystem::exists(image, error);
}

Answer<> attach(const std::filesystem::path& image, const std::stop_token& stop)
{
    const auto answer = attachImage(image, accessTo(image), stop);
    if (const auto* const refusal = std::get_if<Refusal>(&answer))
        return *refusal;
    return Done{};
}

Answer<> carryOut(UDisks& udisks, const DiskStep& step)
{
    if (step.kind != DiskStep::Kind::Mount && holdsSystem(placesOf(step.node)))
        return Refusal{Refusal::Kind::HoldsSystem, {}};
    Answer<> answer = throughAny(udisks, step);
    if (step.kind == DiskStep::Kind::DetachLoop && answer.index() == 0 && !hasComeOff(step.node))
        return Refusal{Refusal::Kind::Lingers, {}};
    const auto* const refusal = std::get_if<Refusal>(&answer);
    if (refusal != nullptr && refusal->kind == Refusal::Kind::Busy)
        return Refusal{Refusal::Kind::Busy, holdersText(placesOf(step.node))};
    return answer;
}

}  // namespace

Answer<> carryOut(const DiskRequest& request, const std::stop_token& stop)
{
    UDisks udisks(stop);
    for (const DiskStep& step : request.steps) {
        const Answer<> answer =
            step.kind == DiskStep::Kind::Attach ? attach(step.node, stop) : carryOut(udisks, step);
        const auto* const refusal = std::get_if<Refusal>(&answer);
        if (refusal != nullptr && refusal->kind != Refusal::Kind::AlreadySo)
            return answer;
    }
    return Done{};
}

DiskOperations::~DiskOperations()
{
    *liveness_ = nullptr;
}

bool DiskOperations::isUnderWay(const std::string& identifier) const
{
    return std::any_of(running_.begin(), running_.end(), [&](const auto& running) {
        const auto& identifiers = running.second.identifiers;
        return std::find(identifiers.begin(), identifiers.end(), identifier) != identifiers.end();
    });
}

std::vector<DiskOperations::Result> DiskOperations::carryOutAll(
    const std::vector<DiskRequest>& requests, const std::stop_token& stop)
{
    std::vector<Result> results;
    for (const DiskRequest& request : requests)
        results.push_back({request, carryOut(request, stop)});
    return results;
}

void DiskOperations::start(std::vector<DiskRequest> requests, Finished finished)
{
    const Number number = ++latest_;
    Running& running = running_[number];
    running.finished = std::move(finished);
    std::erase_if(requests, [&](const auto& request) {
        const bool isKnown = isUnderWay(request.identifier);
        running.identifiers.push_back(request.identifier);
        return isKnown;
    });
    try {
        running.thread = std::jthread(
            [&loop = loop_, alive = liveness_, number, requests](const std::stop_token& stop) {
                loop.post([alive, number, results = carryOutAll(requests, stop)] {
                    if (*alive != nullptr)
                        (*alive)->finish(number, results);
                });
            });
    } catch (const std::system_error& error) {
        const Refusal refusal{Refusal::Kind::Other, errorText(error.code().value())};
        std::vector<Result> results;
        for (const DiskRequest& request : requests)
            results.push_back({request, refusal});
        finish(number, results);
    }
}

// Taken off first: whoever is told may start the next.
void DiskOperations::finish(Number number, const std::vector<Result>& results)
{
    const auto ended = running_.extract(number);
    std::vector<std::string> failures;
    for (const auto& [request, answer] : results)
        if (const auto* const refusal = std::get_if<Refusal>(&answer);
            refusal != nullptr && !isSilent(*refusal))
            failures.push_back(failureText(request, *refusal, texts_));
    if (ended.mapped().finished)
        ended.mapped().finished(failures);
}

}  // namespace orvane

// SPDX-License-Identifier: Apache-2.0
#include "tests/module/FakeHost.h"

#include "contract/foundation/Format.h"

namespace fixwell::testing {

Array FakeDisk::fsckHistory() const
{
    if (volumes.empty())
        return history;
    const Array all = Array::make();
    all.append(history);
    for (const OVDiskPointer& volume : volumes)
        all.append(volume->fsckHistory());
    return all;
}

void FakeEstimator::setStartTimeWithPercentComplete(Threads::Date start, double percent)
{
    const auto seconds =
        std::chrono::duration_cast<std::chrono::seconds>(start.time_since_epoch()).count();
    journal_.push_back(format("estimate from %ld at %.1f", {seconds, percent}));
}

ErrorCode FakeRepairDisk::begin(const char* what, const DiskReferencePointer& disk)
{
    host.journal.push_back(std::string(what) + " " + disk->identifier);
    if (host.whenBegun)
        host.whenBegun();
    const auto refusal = host.refusals.find(disk->identifier);
    return refusal == host.refusals.end() ? kPLNoError : refusal->second;
}

bool FakeRepairDisk::canRepairPartitionMapForDisk(const DiskReferencePointer&, ErrorCode* error)
{
    if (error != nullptr)
        *error = kPLNoError;
    return host.canTreatPartitionMap;
}
bool FakeRepairDisk::canRepairStoragesystemFilesystemForDisk(Disk, ErrorCode*)
{
    return host.canTreatFilesystem;
}
bool FakeRepairDisk::canVerifyStoragesystemFilesystemForDisk(Disk, ErrorCode*)
{
    return host.canTreatFilesystem;
}
void FakeRepairDisk::cancelCurrentOperation()
{
    host.journal.emplace_back("cancel");
}

std::string FakeHost::decimalString(const Value& number)
{
    std::string digits = std::to_string(number.integer());
    for (std::size_t at = digits.size(); at > 3;)
        digits.insert(at -= 3, ",");
    return digits;
}

OVDiskPointer FakeHost::diskWithIdentifier(std::string_view identifier)
{
    const auto found = std::find_if(disks.begin(), disks.end(), [identifier](const auto& disk) {
        return disk->diskIdentifier() == identifier;
    });
    return found == disks.end() ? nullptr : *found;
}

void FakeHost::mountDisk(const OVDiskPointer& disk, bool includeChildren, bool synchronous)
{
    journal.push_back("mount " + (disk ? disk->diskIdentifier() : "none") +
                      (includeChildren ? " with children" : "") +
                      (synchronous ? " synchronously" : ""));
}

void FakeHost::ejectDisk(const OVDiskPointer& disk, bool synchronous)
{
    journal.push_back("eject " + disk->diskIdentifier() + (synchronous ? " synchronously" : ""));
}

void FakeHost::notifyFrontmostModulesOnly(Name name, const Notification& notification)
{
    const auto disk = std::dynamic_pointer_cast<OVDisk>(notification.object);
    journal.push_back("notify " + std::string(name.text()) + " " + disk->diskIdentifier());
}

void FakeHost::post(const Notification& notification)
{
    const auto current = registrations;
    for (const Registration& registration : current)
        if (registration.name == notification.name)
            registration.handler(notification);
}

void FakeHost::scheduleTimer(std::chrono::duration<double> delay, Task task)
{
    journal.push_back(format("timer %.1f", {delay.count()}));
    timers.push_back(std::move(task));
}

void FakeHost::runTasks()
{
    while (!tasks.empty()) {
        const Task task = std::move(tasks.front());
        tasks.erase(tasks.begin());
        task();
    }
}

void FakeHost::sleepUntil(Date date)
{
    journal.push_back(format("sleep %.1f", {std::chrono::duration<double>(date - clock).count()}));
}

std::string FakeHost::localizedString(std::string_view key, std::string_view fallback,
                                      std::string_view table) const
{
    const auto found = translations.find(std::string(table) + "/" + std::string(key));
    if (found != translations.end())
        return found->second;
    return std::string(fallback.empty() ? key : fallback);
}

ErrorCode FakeHost::AttachImageWithURL(const std::filesystem::path& image, Dictionary& result)
{
    if (!images.contains(image.string()))
        return kPLErrorCannotOpen;
    result = Dictionary::of({{Name("path"), image.string()}});
    return kPLNoError;
}

void FakeHost::simpleModuleAlert(const std::string& title, const std::string& message,
                                 std::int32_t code)
{
    journal.push_back("alert [" + title + "] [" + message + "] " + std::to_string(code));
}

bool FakeHost::loadInterface(std::string_view /*name*/, InterfaceOwner& interfaceOwner)
{
    owner = &interfaceOwner;
    if (hasInterfaceFile) {
        outlinePeer.delegate = owner->outlineViewDelegate();
        outlineView = owner->makeOutlineView("OVFXWMessageOutlineView", outlinePeer);
        if (outlineView)
            outlineView->setDataSource(outlinePeer.delegate);
        const auto connect = [this](const Outlet& outlet) {
            if (auto* const button = std::get_if<Button**>(&outlet.place))
                **button = &buttons[std::string(outlet.name)];
            else if (auto* const field = std::get_if<TextField**>(&outlet.place))
                **field = &instructions;
            else if (auto* const view = std::get_if<TextView**>(&outlet.place))
                **view = &messageText;
            else
                *std::get<OutlineView**>(outlet.place) = outlineView.get();
        };
        for (const Outlet& outlet : owner->outlets())
            connect(outlet);
    }
    interfaceOwner.awakeFromNib();
    return hasInterfaceFile;
}

}  // namespace fixwell::testing

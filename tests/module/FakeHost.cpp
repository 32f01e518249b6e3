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

bool FakeDisk::clearFsckHistory()
{
    const bool hadSome = !history.isEmpty();
    if (hadSome)
        history.removeAll();
    return hadSome;
}

void FakeOutlinePeer::reloadData()
{
    ++reloads;
    rows = delegate != nullptr ? delegate->outlineViewNumberOfChildrenOfItem({}) : 0;
}

Rect FakeOutlinePeer::rectOfRow(std::size_t row) const
{
    return row < rows ? Rect{0, 17.0 * static_cast<double>(row), 400, 17} : Rect{};
}

Rect FakeOutlinePeer::frameOfCellAtColumnRow(std::size_t, std::size_t row) const
{
    return {35, 17.0 * static_cast<double>(row), 300, 17};
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

ErrorCode FakeRepairDisk::beginStoragesystemFilesystemVerifyForDisk(const DiskReferencePointer& d)
{
    return begin("verify", d);
}
ErrorCode FakeRepairDisk::beginStoragesystemFilesystemRepairForDisk(const DiskReferencePointer& d)
{
    return begin("repair", d);
}
ErrorCode FakeRepairDisk::beginPermissionsVerifyForDisk(const DiskReferencePointer& d)
{
    return begin("verify permissions", d);
}
ErrorCode FakeRepairDisk::beginPermissionsRepairForDisk(const DiskReferencePointer& d)
{
    return begin("repair permissions", d);
}
ErrorCode FakeRepairDisk::beginPartitionMapVerifyForDisk(const DiskReferencePointer& d)
{
    return begin("verify map", d);
}
ErrorCode FakeRepairDisk::beginPartitionMapRepairForDisk(const DiskReferencePointer& d)
{
    return begin("repair map", d);
}
bool FakeRepairDisk::canRepairPartitionMapForDisk(const DiskReferencePointer&, ErrorCode* error)
{
    host.journal.emplace_back("can treat map?");
    if (error != nullptr)
        *error = kPLNoError;
    return host.canTreatPartitionMap;
}
bool FakeRepairDisk::canRepairStoragesystemFilesystemForDisk(const DiskReferencePointer&,
                                                             ErrorCode*)
{
    return host.toolAnswersYes;
}
bool FakeRepairDisk::canVerifyStoragesystemFilesystemForDisk(const DiskReferencePointer&,
                                                             ErrorCode*)
{
    return host.toolAnswersYes;
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

OVDiskPointer FakeHost::diskWithKRDisk(const DiskReferencePointer& disk)
{
    return disk ? diskWithIdentifier(disk->identifier) : nullptr;
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

void FakeHost::ov_log(int level, int /*flags*/, std::string_view line)
{
    developerLog.push_back(std::to_string(level) + " " + std::string(line));
}

void FakeHost::removeObserver(const void* observer, Name name)
{
    std::erase_if(registrations, [&](const Registration& registration) {
        return registration.observer == observer && registration.name == name;
    });
}

void FakeHost::post(const Notification& notification)
{
    const auto current = registrations;
    for (const Registration& registration : current)
        if (registration.name == notification.name)
            registration.handler(notification);
}

void FakeHost::performOnMainThread(Task task, Wait wait)
{
    if (wait == Wait::UntilDone)
        task();
    else
        tasks.push_back(std::move(task));
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

Value FakeHost::objectForKey(std::string_view key) const
{
    const auto found = defaults.find(key);
    return found == defaults.end() ? Value() : found->second;
}

void FakeHost::setObjectForKey(const Value& value, std::string_view key)
{
    defaults[std::string(key)] = value;
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

OVDiskPointer FakeHost::TopLevelPLDiskForImageDict(const Dictionary& result)
{
    return images.at(std::string(result.string(Name("path"))));
}

std::shared_ptr<Alert> FakeHost::makeAlert(const Alert::Text& text)
{
    sheet = std::make_shared<FakeAlert>();
    sheet->text = text;
    return sheet;
}

void FakeHost::simpleModuleAlert(const std::string& title, const std::string& message,
                                 std::int32_t code)
{
    journal.push_back("alert [" + title + "] [" + message + "] " + std::to_string(code));
}

void FakeHost::openHelpAnchor(std::string_view anchor)
{
    journal.push_back("help " + std::string(anchor));
}

bool FakeHost::loadInterface(std::string_view name, InterfaceOwner& interfaceOwner)
{
    journal.push_back("load interface " + std::string(name));
    owner = &interfaceOwner;
    if (hasInterfaceFile) {
        outlinePeer.delegate = owner->outlineViewDelegate();
        outlineView = owner->makeOutlineView("OVFXWMessageOutlineView", outlinePeer);
        outlineView->setDataSource(outlinePeer.delegate);
        const auto connect = [this](const Outlet& outlet) {
            if (auto* const button = std::get_if<Button**>(&outlet.place))
                **button = &buttons[std::string(outlet.name)];
            else if (auto* const field = std::get_if<TextField**>(&outlet.place))
                **field = &instructionalTextField;
            else if (auto* const view = std::get_if<TextView**>(&outlet.place))
                **view = &repairMessageTextView;
            else
                *std::get<OutlineView**>(outlet.place) = outlineView.get();
        };
        for (const Outlet& outlet : owner->outlets())
            connect(outlet);
    }
    interfaceOwner.awakeFromNib();
    return hasInterfaceFile;
}

void FakeHost::declareTypes(const std::vector<PasteboardType>& types, const void*)
{
    declared = types;
    pasted.clear();
}

void FakeHost::runPrintOperation(OutlineView&, const PrintInfo& info, bool showsPanel, Window*)
{
    journal.push_back(format("print pagination %ld%s", {static_cast<int>(info.horizontalPagination),
                                                        showsPanel ? " with panel" : ""}));
}

void FakeHost::activateGlobalProgressBar(bool isActiveNow)
{
    journal.emplace_back(isActiveNow ? "bar on" : "bar off");
}

void FakeHost::activateGlobalProgressText(bool isActiveNow)
{
    journal.emplace_back(isActiveNow ? "text on" : "text off");
}

void FakeHost::setGlobalProgressBarIndeterminate(bool isNow)
{
    isIndeterminate = isNow;
}

void FakeHost::setGlobalProgressBarValue(double percent)
{
    progress = percent;
}

void FakeHost::notifyWindowOfCompletion(const Dictionary& completion)
{
    journal.emplace_back("report");
    report = completion;
}

std::unique_ptr<PLRepairDisk> FakeHost::makeRepairDisk()
{
    journal.emplace_back("make repair tool");
    return std::make_unique<FakeRepairDisk>(*this);
}

}  // namespace fixwell::testing

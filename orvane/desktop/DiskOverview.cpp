// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DiskOverview.h"

#include "contract/foundation/UTF8.h"
#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/window/DiskHeader.h"
#include "orvane/desktop/window/Question.h"
#include "orvane/desktop/window/ResultBanner.h"
#include "orvane/desktop/window/SelectionSummary.h"

#include <QApplication>
#include <QClipboard>

#include <chrono>
#include <utility>

namespace orvane::desktop {

namespace outlet = contract::outlet;

namespace {

/// As a shell reads it back (POSIX.1-2017, Shell Command Language, 2.2.2).
std::string quoted(const std::string& path)
{
    std::string text = "'";
    for (const char c : path)
        text += c == '\'' ? std::string("'\\''") : std::string(1, c);
    return text + "'";
}

}  // namespace

DiskOverview::DiskOverview(const SessionParts& parts, DiskPane& disks, const KeptRepairs& kept,
                           RepairChoices& choices, RepairUndoing& undoing)
    : at_(parts), disks_(disks), kept_(kept), choices_(choices), undoing_(undoing)
{
    at_.window.header().setChosen([this](const std::string& identifier) { select(identifier); });
    at_.window.banner().setEvents({[this](NextStep step) { take(step); },
                                   [this](const std::string& identifier) {
                                       select(identifier);
                                   }});
    QObject::connect(&clock_, &QTimer::timeout, &clock_, [this] { showSelection(); });
    clock_.start(std::chrono::minutes(1));
}

// Posted: the modules decide first what their buttons allow.
void DiskOverview::refresh()
{
    if (std::exchange(isAwaited_, true))
        return;
    at_.host.mainRunLoop().post([this] {
        isAwaited_ = false;
        showSelection();
    });
}

void DiskOverview::showSelection()
{
    const std::vector<DiskRow> rows = disks_.list().selectedRows();
    const std::vector<DiskRow> parts =
        rows.size() == 1 ? disks_.list().rowsBelow(rows.front()) : std::vector<DiskRow>();
    at_.window.header().show(
        summaryOf(rows, parts, QDateTime::currentDateTime(), at_.host.translator()),
        rows.size() == 1 ? diskIcon(rows.front().facts) : QIcon());
    at_.window.banner().show(result(rows));
    at_.window.commands().refresh();
}

// While a job runs, the status line tells how it goes.
ResultSummary DiskOverview::result(const std::vector<DiskRow>& rows)
{
    if (at_.controller.interfaceLock())
        return {};
    if (rows.empty())
        return resultOfClosing(disks_.closedImages(), at_.host.translator());
    if (rows.size() > 1)
        return resultOfSeveral(rows, at_.host.translator());
    // Of a whole disk whose volumes were checked, they are the result.
    const std::optional<LastCheck>& check = rows.front().lastCheck;
    if (check && (check->isPartial || !check->part.empty()))
        return resultOfSeveral(disks_.list().rowsBelow(rows.front()), at_.host.translator());
    const QtButton* const repair = at_.tabs.button(outlet::repairDisk);
    const auto kept = [this](pellar::Subject subject) {
        return kept_.stateOf(subject, *disks_.selected().front());
    };
    const auto isKept = [](KeptRepair state) {
        return state == KeptRepair::Applied || state == KeptRepair::Unknown;
    };
    const KeptRepair ofDisk = kept(pellar::Subject::Filesystem);
    return resultOf(rows.front(),
                    {repair != nullptr && repair->isEnabled(), isKept(ofDisk),
                     isKept(kept(pellar::Subject::Permissions)), ofDisk == KeptRepair::Interrupted},
                    at_.host.translator());
}

void DiskOverview::take(NextStep step)
{
    switch (step) {
        case NextStep::Repair: at_.tabs.button(outlet::repairDisk)->press(); break;
        case NextStep::Preview: choices_.preview(); break;
        case NextStep::Undo: undoing_.ask(pellar::Operation::Undo); break;
        case NextStep::UndoPermissions:
            undoing_.ask(pellar::Operation::Undo, RepairUndoing::Scope::Permissions);
            break;
        case NextStep::Finish: undoing_.ask(pellar::Operation::Finish); break;
        case NextStep::ApplyUnproven: choices_.confirmUnproven(); break;
        case NextStep::RepairDirectly: choices_.confirmDirect(); break;
        case NextStep::ShowProblems: showProblems(); break;
        case NextStep::CopyDisk: explainCopying(); break;
        case NextStep::Reopen: disks_.open(disks_.closedImages()); break;
    }
}

void DiskOverview::select(const std::string& identifier)
{
    if (const auto disk = at_.host.sharedDiskController().diskNamed(identifier))
        disks_.selectOnly(*disk);
}

void DiskOverview::showProblems()
{
    const QtButton* const details = at_.tabs.button(outlet::showDetails);
    if (details != nullptr && details->isEnabled() && !details->isChecked())
        at_.tabs.button(outlet::showDetails)->press();
    if (LoadedInterface* const controls = at_.tabs.interface())
        controls->outlinePeer()->table().setFocus();
}

// ddrescue(1): "-d" reads past the kernel's cache, which a failing drive needs; a file has none.
void DiskOverview::explainCopying()
{
    const auto disks = disks_.selected();
    if (disks.size() != 1)
        return;
    const auto& facts = disks.front()->facts();
    const bool isDevice = facts.storage == contract::DiskReference::Storage::BlockDevice;
    const std::string command = std::string(isDevice ? "ddrescue -d " : "ddrescue ") +
                                quoted(contract::printable(facts.path.native())) +
                                " copy.img copy.map";
    ask(at_.window,
        {"copyAdvice",
         at_.host.translator().sentence("Copy “%@” before anything else",
                                        {disks.front()->displayName()}),
         at_.host.translator().sentence(
             "A repair does not bring back what cannot be read, and every further attempt may "
             "cost more of it. In a terminal, on another disk with enough room:\n\n%@\n\nThen "
             "open the copy here, and check and repair that.",
             {command}),
         {{text("Copy the Command"),
           [command] {
               QApplication::clipboard()->setText(QString::fromStdString(command));
           }},
          {text("Help"),
           [this] {
               at_.host.sharedHelpManager().openHelpAnchor("copying");
           }}},
         text("Close")});
}

}  // namespace orvane::desktop

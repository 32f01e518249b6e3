// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/module/OVFXW.h"
#include "tests/module/FakeHost.h"

#include <gtest/gtest.h>

namespace fixwell {

/// A module in a fake host, with the private operations that the tests drive step by step.
class OVFXWTest : public ::testing::Test {
protected:
    using FakeDisk = fixwell::testing::FakeDisk;

    void SetUp() override
    {
        OVFXW::lastReloadDate.reset();
        OVFXW::lastReloadCount = 0;
        makeModule();
    }

    void makeModule()
    {
        module = std::make_unique<OVFXW>(host, host);
        ASSERT_TRUE(module->init());
        module->registerForNotifications();
    }

    std::shared_ptr<FakeDisk> addDisk(const std::string& identifier)
    {
        auto disk = std::make_shared<FakeDisk>(identifier);
        host.disks.push_back(disk);
        return disk;
    }

    std::shared_ptr<FakeDisk> addWholeDisk(const std::string& identifier)
    {
        auto disk = addDisk(identifier);
        disk->type = OVDisk::typeWhole;
        disk->whole = true;
        return disk;
    }
    std::shared_ptr<FakeDisk> addStartupDisk()
    {
        auto disk = addDisk("root");
        disk->boot = true;
        disk->verifiesLive = true;
        return disk;
    }
    std::shared_ptr<FakeDisk> addImage(const std::string& path)
    {
        auto disk = addDisk(path);
        disk->type = OVDisk::typeDiskImage;
        disk->imagePath = path;
        disk->offlineImage = true;
        return disk;
    }

    template <class... Disks>
    void select(const Disks&... disks)
    {
        host.selection = {disks...};
        module->selectionDidChange({OVDiskChangedNotification, nullptr, {}});
    }

    template <class... Disks>
    void verify(const Disks&... disks)
    {
        select(disks...);
        module->verifyDisk(nullptr);
    }

    void finish(const std::shared_ptr<FakeDisk>& disk, ErrorCode error = kPLNoError)
    {
        module->plAsyncFinishedForDisk(disk->reference, error, 0, {});
    }
    void say(const std::shared_ptr<FakeDisk>& disk, std::string_view line)
    {
        module->plAsyncMessageForDisk(disk->reference, line, {});
    }
    void say(const std::shared_ptr<FakeDisk>& disk, const Dictionary& message)
    {
        module->plAsyncMessageForDisk(disk->reference, {}, message);
    }
    void progress(const std::shared_ptr<FakeDisk>& disk, float percent)
    {
        module->plAsyncProgressForDisk(disk->reference, false, percent);
    }

    /// The texts of a disk's records, without the summaries.
    static std::vector<std::string> linesOf(const std::shared_ptr<FakeDisk>& disk)
    {
        std::vector<std::string> lines;
        for (const Value& record : disk->history.values())
            if (verbosityOf(record.dictionary()) != verbosity::summary)
                lines.emplace_back(finalText(record.dictionary()).characters());
        return lines;
    }

    testing::FakeButton& button(std::string_view name) { return host.buttons.find(name)->second; }

    // Private operations and fields, by their own names.
    std::int64_t action() const { return module->action; }
    Array completedList() const { return module->completedList; }
    Dictionary inflightItem() const { return module->inflightItem; }
    void setInflightItem(const Dictionary& entry) { module->inflightItem = entry; }
    void setAction(std::int64_t action) { module->action = action; }
    void add(const Array& history, const Dictionary& record, bool forces)
    {
        module->addObjectAndUpdateView(history, record, forces);
    }
    Array historyOfSelection() const { return module->allFsckHistoryOfSelection(); }
    void appendMessage(std::string_view text) { module->appendTitleToMessageText(text); }
    ButtonDecision buttonDecision() { return module->decideButtons(); }
    void fileAsCompleted(const Dictionary& entry) { module->addDiskToCompletedList(entry); }
    OVDiskPointer inflightDisk() const { return module->searchForInflightDisk(); }

    fixwell::testing::FakeHost host;
    std::unique_ptr<OVFXW> module;
};

}  // namespace fixwell

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/module/OVFXW.h"
#include "orvane/desktop/toolkit/QtAlerts.h"
#include "orvane/desktop/toolkit/QtControls.h"
#include "orvane/desktop/toolkit/QtInterface.h"
#include "orvane/desktop/toolkit/QtPasteboard.h"
#include "orvane/desktop/toolkit/QtPrinting.h"
#include "tests/module/FakeHost.h"

#include <QApplication>

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <string_view>

namespace orvane::desktop {

/// The directory of the interface file, and texts in a language of its own.
struct TestBundle final : contract::Bundle {
    std::string localizedString(std::string_view key, std::string_view,
                                std::string_view) const override
    {
        return key == "&Clear History" ? "Verlauf &löschen" : std::string(key);
    }
    std::uint64_t stringRevision() const override { return 1; }
    std::filesystem::path pathForResource(std::string_view name) const override
    {
        return name == "FXW.ui" ? FXW_UI : std::filesystem::path();
    }
};

/// A fake host, except for its screen.
struct ScreenHost final : fixwell::testing::FakeHost {
    TestBundle texts;
    QtAlerts qtAlerts{[](std::int32_t code) {
        return "code " + std::to_string(code);
    }};
    QtEvents qtEvents;
    int savesBeforeRows = 0;
    QtInterface qtInterface{[this] { ++savesBeforeRows; }, &texts};
    QtPasteboard qtPasteboard;
    int printFailures = 0;
    QtPrinting qtPrinting{texts, [this] {
                              ++printFailures;
                          }};

    ScreenHost() { qtInterface.setBundle(texts); }

    contract::Alerts& alerts() override { return qtAlerts; }
    contract::Events& events() override { return qtEvents; }
    QtInterface& interfaceLoader() override { return qtInterface; }
    contract::Pasteboard& generalPasteboard() override { return qtPasteboard; }
    contract::Printing& printing() override { return qtPrinting; }
};

/// The module with its controls, one selected disk, and that disk's log to write into.
class ToolkitTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        module = std::make_unique<fixwell::OVFXW>(host, host);
        ASSERT_TRUE(module->init());
        module->registerForNotifications();
        interface = host.qtInterface.latest();
        ASSERT_NE(interface, nullptr);
        view = interface->outlineView();
        ASSERT_NE(view, nullptr);
        disk->history = contract::Array::make();
        host.disks.push_back(disk);
        host.selection = {disk};
        interface->widget().resize(640, 560);
        interface->widget().show();
        selectDisk();
    }
    void TearDown() override { module.reset(); }

    void selectDisk()
    {
        module->selectionDidChange({contract::OVDiskChangedNotification, nullptr, {}});
        settle();
    }

    void addRow(std::string_view text, std::int64_t verbosity = 0,
                const contract::TextStyle& style = {})
    {
        contract::TextStyle complete = style;
        if (!complete.font)
            complete.font = contract::Font{verbosity < 0, 11};
        disk->history.append(contract::Dictionary::of(
            {{contract::kFsckVerbosity, verbosity},
             {fixwell::kOV_finalAttributedString_type,
              contract::StyledText::make(std::string(text) + "\n", complete)}}));
    }

    void reload()
    {
        view->reloadData();
        settle();
    }
    static void settle() { QApplication::processEvents(); }

    /// A run of the module: its first record, and a row for each of the texts.
    void addRun(std::string_view title, const std::vector<std::string>& rows,
                const std::shared_ptr<fixwell::testing::FakeDisk>& of = nullptr)
    {
        const contract::Array& history = (of ? of : disk)->history;
        const auto record = [](std::string_view text, std::int64_t verbosity) {
            return contract::Dictionary::of(
                {{contract::kFsckVerbosity, verbosity},
                 {fixwell::kOV_finalAttributedString_type,
                  contract::StyledText::make(std::string(text) + "\n",
                                             {contract::Font{verbosity < 0, 11}, {}, {}})}});
        };
        history.append(record(title, -1));
        for (const std::string& row : rows) {
            const contract::Dictionary line = record(row, 0);
            if (row.starts_with("problem"))
                line.set(contract::kFsckMessageType, contract::kFsckProblem);
            history.append(line);
        }
        history.append(record("", -2));
    }
    /// The rows that are shown, in one line.
    std::string shownRows()
    {
        QStringList rows;
        for (int row = 0; row < table().model()->rowCount(); ++row)
            rows += rowText(row);
        rows.removeAll(QString());
        return rows.join(QLatin1Char('|')).toStdString();
    }

    LogTable& table() { return interface->outlinePeer()->table(); }
    QString rowText(int row) { return table().model()->index(row, 0).data().toString(); }

    ScreenHost host;
    std::shared_ptr<fixwell::testing::FakeDisk> disk =
        std::make_shared<fixwell::testing::FakeDisk>("loop0");
    std::unique_ptr<fixwell::OVFXW> module;
    LoadedInterface* interface = nullptr;
    contract::OutlineView* view = nullptr;
};

}  // namespace orvane::desktop

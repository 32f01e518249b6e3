// SPDX-License-Identifier: Apache-2.0
// The dialogs that are chosen in the menus.

#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/settings/Switch.h"

#include <QAccessible>
#include <QApplication>
#include <QCheckBox>
#include <QClipboard>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QFile>
#include <QFileDialog>
#include <QLabel>
#include <QProcess>
#include <QProgressDialog>
#include <QPushButton>
#include <QRadioButton>
#include <QStandardPaths>
#include <QTableWidget>
#include <QTest>

namespace orvane::desktop::test {
namespace {

class DialogTest : public WindowFixture {
protected:
    template <class Control>
    Control& control(const char* name)
    {
        return *window().findChild<Control*>(QLatin1String(name));
    }
    /// In the preferences, which come to the front.
    template <class Control>
    Control& preference(const char* name)
    {
        command("preferences").trigger();
        QDialog& dialog = control<QDialog>("preferencesDialog");
        EXPECT_TRUE(QTest::qWaitForWindowActive(&dialog));
        return *dialog.findChild<Control*>(QLatin1String(name));
    }
    void choose(const char* name, std::uint64_t number)
    {
        auto& box = preference<QComboBox>(name);
        box.setCurrentIndex(box.findData(static_cast<qulonglong>(number)));
    }
    std::string keptNow() { return fromQt(preference<QLabel>("keptRepairsState").text()); }
    contract::UserDefaults& settings() { return session().host().standardUserDefaults(); }
};

using PreferencesTest = DialogTest;

TEST_F(PreferencesTest, HoldAtOnceAndAreShownAsTheyAre)
{
    openImage("sound");
    settings().setObjectForKey(std::int64_t{33}, "keptRepairDays");
    const auto isOn = [this](const char* name) {
        return preference<QCheckBox>(name).isChecked();
    };
    EXPECT_EQ(fromQt(preference<QComboBox>("keptRepairDays").currentText()), "33 days")
        << "none of the choices";
    for (const Switch& kept : {fetchesPackageArchives, thoroughVerification, asksBeforeRepair,
                               showsNotices, reopensImages}) {
        const bool before = kept.isOn(settings());
        EXPECT_EQ(isOn(kept.key.data()), before) << kept.key;
        preference<QCheckBox>(kept.key.data()).click();
        EXPECT_EQ(kept.isOn(settings()), !before) << kept.key;
    }
    const bool showed = button("showDetailsButton").isChecked();
    preference<QCheckBox>("showsDetails").click();
    EXPECT_NE(button("showDetailsButton").isChecked(), showed) << "the log follows";
    command("showDetails").trigger();
    window().activateWindow();
    ASSERT_TRUE(QTest::qWaitForWindowActive(&window()));
    EXPECT_EQ(isOn("showsDetails"), showed) << "changed elsewhere";
    choose("keptRepairMegabytes", unlimitedRepairs);
    close();
    EXPECT_EQ(readRepairSettings(directory_ / "config/settings.json"),
              (RepairSettings{20, 33, unlimitedRepairs, true}));
}

TEST_F(PreferencesTest, SayHowMuchIsKeptOfRepairsAndLimitAndDeleteIt)
{
    const std::vector<std::string> images{makeDamagedImage("one"), makeDamagedImage("two"),
                                          makeDamagedImage("three")};
    open(images);
    EXPECT_EQ(keptNow(), "Nothing is kept now.");
    run("repairDiskButton", images[0]);
    run("repairDiskButton", images[1]);
    EXPECT_TRUE(keptNow().starts_with("Kept now: 2 repairs, ")) << keptNow();
    preference<QPushButton>("deleteKeptRepairs").click();
    press(*sheet(), QStringLiteral("Cancel"));
    EXPECT_TRUE(keptNow().starts_with("Kept now: 2 repairs, ")) << keptNow();
    preference<QPushButton>("deleteKeptRepairs").click();
    ASSERT_TRUE(waitUntil([this] { return sheet() != nullptr; }));
    press(*sheet(), QStringLiteral("Delete"));
    EXPECT_TRUE(waitUntil([this] { return keptNow() == "Nothing is kept now."; }));
    EXPECT_FALSE(preference<QPushButton>("deleteKeptRepairs").isEnabled());
    EXPECT_TRUE(waitUntil([this] {
        return std::ranges::count(window().banner().summary().steps, NextStep::Undo) == 0;
    })) << "what is deleted cannot be undone";
    choose("keptRepairs", 0);
    run("repairDiskButton", images[2]);
    EXPECT_EQ(verdict(images[2]), "repaired");
    EXPECT_EQ(keptNow(), "Nothing is kept now.") << "asked for while the program ran";
}

class ReportTest : public DialogTest {
protected:
    /// Through the dialogs; what is saved then, or nothing.
    std::string save(const char* file, bool isLastAlone, bool hasDetails)
    {
        command("saveReport").trigger();
        control<QRadioButton>("lastRunAlone").setChecked(isLastAlone);
        control<QCheckBox>("withDetails").setChecked(hasDetails);
        auto* const buttons = control<QDialog>("reportDialog").findChild<QDialogButtonBox*>();
        QTest::mouseClick(buttons->buttons().front(), Qt::LeftButton);
        const auto path = directory_ / file;
        emit window().findChild<QFileDialog*>()->fileSelected(toQt(path.native()));
        const auto isOver = [this] {
            return window().findChild<QProgressDialog*>(QStringLiteral("reportProgress")) ==
                   nullptr;
        };
        EXPECT_TRUE(waitUntil(isOver));
        return contentsOf(path);
    }
    static std::string contentsOf(const std::filesystem::path& path)
    {
        QFile file(toQt(path.native()));
        return file.open(QIODevice::ReadOnly) ? file.readAll().toStdString() : std::string();
    }
    static std::size_t count(const std::string& text, std::string_view part)
    {
        std::size_t found = 0;
        for (std::size_t at = 0; (at = text.find(part, at)) != std::string::npos; ++at)
            ++found;
        return found;
    }
};

TEST_F(ReportTest, TellsTheDiskAndItsRunsAsTextAndHTML)
{
    const std::string image = makeDamagedImage("a <b>");
    open({image});
    for (const char* const button : {"verifyDiskButton", "repairDiskButton", "verifyDiskButton"})
        run(button, image);
    const std::string all = save("all.txt", false, false);
    for (const char* const told :
         {"Format: ext4", "Program: Orvane 0.", "Kernel: Linux ", "· damaged\n", "· repaired\n",
          "· sound\n", "Tool: e2fsck ", "\n    The volume “a <b>” appears to be OK."})
        EXPECT_NE(all.find(told), std::string::npos) << told << " in\n" << all;
    EXPECT_EQ(all.find("Pass 1"), std::string::npos);
    EXPECT_EQ(all.find("Checking inodes"), std::string::npos) << "not without details";
    EXPECT_LT(all.find("· damaged"), all.find("needs to be repaired"));
    EXPECT_LT(all.find("needs to be repaired"), all.find("· repaired")) << "each run with its rows";
    const std::string last = save("last.html", true, true);
    EXPECT_EQ(count(last, "<h3"), 1U) << last;
    EXPECT_NE(last.find("Checking inodes"), std::string::npos) << "with details";
    EXPECT_NE(last.find("<li class=\"good\">The volume “a &lt;b&gt;” appears"), std::string::npos);
    EXPECT_EQ(last.find("<b>"), std::string::npos) << "a label is no mark";
}

TEST_F(ReportTest, WhatWasThereStaysUntilTheNewOneIsComplete)
{
    openImage("sound");
    run("verifyDiskButton");
    EXPECT_TRUE(save("kept/report.txt", false, false).empty());
    EXPECT_TRUE(waitUntil([this] { return sheet() != nullptr; }));
    EXPECT_NE(takeSheet().find("kept/report.txt’: "), std::string::npos) << "no such directory";
    const std::string first = save("report.txt", false, false);
    command("saveReport").trigger();
    auto* const buttons = control<QDialog>("reportDialog").findChild<QDialogButtonBox*>();
    QTest::mouseClick(buttons->buttons().front(), Qt::LeftButton);
    emit window().findChild<QFileDialog*>()->fileSelected(
        toQt((directory_ / "report.txt").native()));
    close();
    EXPECT_EQ(contentsOf(directory_ / "report.txt"), first) << "given up";
}

TEST_F(ReportTest, PagesHoldTheSame)
{
    if (QStandardPaths::findExecutable(QStringLiteral("pdftotext")).isEmpty())
        GTEST_SKIP() << "pdftotext is not installed (package poppler-utils)";
    openImage("sound");
    run("verifyDiskButton");
    EXPECT_TRUE(save("report.pdf", false, true).starts_with("%PDF"));
    const std::string text = directory_ / "report.txt";
    ASSERT_EQ(QProcess::execute(QStringLiteral("pdftotext"),
                                {toQt((directory_ / "report.pdf").native()), toQt(text)}),
              0);
    for (const char* const told : {"Page 1 of 1", "Report on sound", "appears to be OK"})
        EXPECT_NE(contentsOf(text).find(told), std::string::npos) << told;
}

}  // namespace
}  // namespace orvane::desktop::test

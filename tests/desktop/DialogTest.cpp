// SPDX-License-Identifier: Apache-2.0
// The dialogs that are chosen in the menus.

#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/settings/Switch.h"

#include <QAccessible>
#include <QCheckBox>
#include <QComboBox>
#include <QLabel>
#include <QPushButton>

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

TEST_F(PreferencesTest, TheImagesOfTheLastTimeComeBackWhereThatIsWanted)
{
    const std::vector<std::string> images{makeImage("one"), makeImage("two"), makeImage("three")};
    const auto openAgain = [this] {
        close();
        openWith(options({}));
        return waitUntil([this] { return window().disks().model()->rowCount() > 0; });
    };
    open(images);
    reopensImages.set(settings(), true);
    close();
    std::filesystem::remove(images[1]);
    ASSERT_TRUE(openAgain());
    EXPECT_TRUE(row(images[0]).isValid() && row(images[2]).isValid());
    EXPECT_EQ(sheet(), nullptr) << "the one that has gone is no news";
    reopensImages.set(settings(), false);
    close();
    openWith(options({}));
    reopensImages.set(settings(), true);
    close();
    openWith(options({}));
    QTest::qWait(50);
    EXPECT_EQ(window().disks().model()->rowCount(), 0) << "they were forgotten";
}

}  // namespace
}  // namespace orvane::desktop::test

// SPDX-License-Identifier: Apache-2.0
// One run takes the pictures of one language and look: the environment says which, and how they
// are called (see `take`).

#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/support/texts/Language.h"
#include "tests/desktop/WindowFixture.h"
#include "tests/support/InterruptedRepair.h"
#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"

#include <QApplication>
#include <QLineEdit>
#include <QMenu>
#include <QMimeData>
#include <QPainter>
#include <QTabWidget>
#include <QTest>

#include <sys/mount.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>

namespace orvane::desktop::test {
namespace {

std::string look()
{
    return qEnvironmentVariable("PICTURE", QStringLiteral("light")).toStdString();
}

class Pictures : public WindowFixture {
protected:
    void openInOneSize(const std::vector<std::string>& images)
    {
        open(images);
        window().resize(1180, 600);
        window().splitter().setSizes({420, 760});
    }

    void finishJob()
    {
        ASSERT_TRUE(waitForJob());
        QTest::qWait(100);
        takeSheet();
        QTest::qWait(50);
    }

    void treat(const char* name, const std::string& image)
    {
        select(image);
        button(name).press();
        finishJob();
    }

    /// Keeps a picture of the window with the build.
    void takePicture(const std::string& name)
    {
        QPixmap picture = window().grab();
        QWidget* const above = sheet() != nullptr ? sheet() : QApplication::activePopupWidget();
        if (above != nullptr) {
            const QPoint corner = above->mapToGlobal(QPoint()) - window().mapToGlobal(QPoint());
            QPainter(&picture).drawPixmap(corner, above->grab());
        }
        save(picture, name);
    }

    void takePictureOfMenu(const char* command, const std::string& name)
    {
        auto* const menu = qobject_cast<QMenu*>(this->command(command).parent());
        menu->popup(window().mapToGlobal(QPoint(120, 24)));
        QTest::qWait(50);
        takePicture(name);
        menu->close();
        QTest::qWait(50);
    }

    /// Presses what changes something, of a sheet that asks.
    void accept()
    {
        for (QAbstractButton* button : sheet()->buttons())
            if (sheet()->buttonRole(button) == QMessageBox::DestructiveRole)
                QTest::mouseClick(button, Qt::LeftButton);
    }

    static void save(const QPixmap& picture, const std::string& name)
    {
        std::filesystem::create_directories(SCREENSHOT_DIRECTORY);
        EXPECT_TRUE(picture.save(
            QString::fromStdString(SCREENSHOT_DIRECTORY "/" + look() + name + ".png")));
    }
};

TEST_F(Pictures, OfADamagedDiskThatWasVerified)
{
    const std::string sound = makeImage("Photos");
    const std::string damaged = makeDamagedImage("Letters");
    openInOneSize({sound, damaged});
    takePicture("-empty");
    treat("verifyDiskButton", sound);
    treat("verifyDiskButton", damaged);
    takePicture("");
    window().disks().selectAll();
    QTest::qWait(50);
    takePicture("-several");
    select(damaged);
    session().host().sharedHelpManager().openHelpAnchor("ovhelp11868");
    QTest::qWait(50);
    QWidget& help = *session().host().sharedHelpManager().window();
    save(help.grab(), "-help");
    EXPECT_LE(window().minimumSizeHint().width(), 1180) << "it has room on a small screen";
}

TEST_F(Pictures, OfALogOfSeveralRuns)
{
    const std::string image = makeDamagedImage("Letters");
    openInOneSize({image});
    treat("verifyDiskButton", image);
    treat("repairDiskButton", image);
    treat("verifyDiskButton", image);
    session_.reset();
    openInOneSize({image});
    select(image);
    QTest::qWait(100);
    takePicture("-runs");
    button("showDetailsButton").press();
    // Without a window manager the window is not the active one, and has no shortcuts.
    LogSearch& search = *session().activeTab()->interface()->search();
    search.open();
    search.field().setText(QStringLiteral("block"));
    EXPECT_TRUE(waitUntil([this] { return logRows().size() > 20; }))
        << "a folded run with a match is open";
    QTest::qWait(100);
    takePicture("-search");
}

/// A machine that no test has: a drive with a system, a stick, and a drive that fails.
std::vector<DiskTree> machine()
{
    const auto disk = [](const char* node, const char* name, std::uint64_t gibibytes) {
        DiskTree tree;
        tree.facts.identifier = tree.facts.path = std::string("/dev/") + node;
        tree.facts.name = name;
        tree.facts.length = gibibytes << 30U;
        return tree;
    };
    const auto volume = [&](const char* node, const char* label, const char* format,
                            const char* place, std::uint64_t gibibytes) {
        DiskTree tree = disk(node, label, gibibytes);
        tree.facts.type = diskType::volume;
        tree.facts.label = label;
        tree.facts.filesystem = format;
        tree.facts.filesystemVersion = "FAT32";
        tree.facts.mountPoint = place;
        if (tree.facts.name.empty())
            tree.facts.name = node;
        return tree;
    };
    DiskTree drive = disk("nvme0n1", "Example NVMe 1TB", 954);
    drive.facts.model = "Example NVMe 1TB";
    drive.facts.partitionMap = "gpt";
    drive.children = {volume("nvme0n1p1", "EFI", "vfat", "/boot/efi", 1),
                      volume("nvme0n1p2", "System", "ext4", "/", 100),
                      volume("nvme0n1p3", "A label that is much longer than any list is wide",
                             "btrfs", "/home", 853)};
    drive.children[1].facts.isBootVolume = true;
    DiskTree stick = disk("sda", "Stick", 15);
    stick.facts.isEjectable = true;
    stick.children = {volume("sda1", "HOLIDAYS", "exfat", "", 15)};
    DiskTree failing = disk("sdb", "Example 2000", 2000);
    failing.facts.hasSMARTError = true;
    failing.children = {volume("sdb1", "", "ntfs", "", 2000)};
    return {drive, stick, failing};
}

TEST_F(Pictures, OfTheListOfDisks)
{
    openInOneSize({});
    QTest::qWait(50);
    takePicture("-no-disks");
    close();
    const std::string partitioned = makePartitionedImage("Whole Disk");
    directory_.damage(partitioned + "?offset=1048576", "set_super_value free_blocks_count 7");
    const std::string letters = makeImage("Letters");
    openInOneSize({partitioned, letters});
    session().host().sharedDiskController().synchronize(machine());
    treat("verifyDiskButton", letters);
    treat("verifyDiskButton", partitioned);
    window().disks().setFocus();
    window().activateWindow();
    QTest::qWait(200);
    takePicture("-list");
    takePictureOfMenu("openImage", "-file-menu");
    takePictureOfMenu("properties", "-disk-menu");
    takePictureOfMenu("filterDisks", "-view-menu");
    select("/dev/sdb");
    QTest::qWait(50);
    takePicture("-failing");
    select(partitioned);
    command("properties").trigger();
    QTest::qWait(50);
    auto* const dialog = window().findChild<QDialog*>(QStringLiteral("propertiesDialog"));
    save(dialog->grab(), "-properties");
    dialog->close();

    command("filterDisks").trigger();
    auto* const field = window().findChild<QLineEdit*>(QStringLiteral("diskFilter"));
    field->setText(QStringLiteral("fat"));
    QTest::qWait(50);
    takePicture("-filter");
    field->setText(QStringLiteral("zebra"));
    QTest::qWait(50);
    takePicture("-filter-nothing");
    field->clear();
    window().disks().setFocus();

    QMimeData files;
    files.setUrls({QUrl::fromLocalFile(QStringLiteral("/home/me/Backups/old-laptop.img"))});
    QDragEnterEvent enter({10, 10}, Qt::CopyAction, &files, Qt::LeftButton, {});
    QCoreApplication::sendEvent(&window(), &enter);
    takePicture("-drop");
    QDragLeaveEvent leave;
    QCoreApplication::sendEvent(&window(), &leave);

    window().resize(600, 400);
    select(partitioned);
    window().disks().scrollToTop();
    QTest::qWait(100);
    takePicture("-small");
    command("filterDisks").trigger();
    QTest::qWait(100);
    takePicture("-small-filter");
}

// A volume that is really mounted, as only root can have one.
TEST_F(Pictures, OfTwoModules)
{
    if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const orvane::test::LoopDevice device(
        directory_.makeExt("stick", 256 << 20, {"-L", "Holidays"}));
    const std::filesystem::path place = directory_ / "Holidays";
    std::filesystem::create_directory(place);
    if (::mount(device.name().c_str(), place.c_str(), "ext4", 0, nullptr) != 0)
        GTEST_SKIP() << "a loop device cannot be mounted here";
    const auto unmounted =
        std::shared_ptr<void>(nullptr, [place](void*) { ::umount(place.c_str()); });
    for (const auto& [name, kibibytes] :
         {std::pair{"Pictures/2025/one.raw", 91'000}, std::pair{"Pictures/2026/two.raw", 31'000},
          std::pair{"Films/film.mkv", 41'500}, std::pair{"Letters/letter.odt", 120},
          std::pair{"list.txt", 3}})
        orvane::test::write(place / name,
                            std::string(static_cast<std::size_t>(kibibytes) << 10U, 'x'));
    SessionOptions wanted = options({});
    wanted.moduleDirectories.insert(wanted.moduleDirectories.begin(), EXAMPLE_MODULES);
    openWith(std::move(wanted));
    window().resize(1180, 600);
    window().splitter().setSizes({420, 760});
    DiskTree stick = machine()[1];
    stick.children[0].facts.name = stick.children[0].facts.label = "Holidays";
    stick.children[0].facts.filesystem = "ext4";
    stick.children[0].facts.length = 256 << 20;
    stick.children[0].facts.mountPoint = place;
    session().host().sharedDiskController().synchronize({machine()[0], stick});
    select("/dev/sda1");
    window().tabs().setCurrentIndex(1);
    QTest::qWait(50);
    takePicture("-modules-before");
    button("measureButton").press();
    EXPECT_TRUE(waitUntil([this] { return button("measureButton").action() == "measure:"; }));
    QTest::qWait(100);
    takePicture("-modules");
}

TEST_F(Pictures, OfAJobInTheList)
{
    const std::string tools = directory_.fakeTools(
        "say Pass 1: Checking inodes, blocks, and sizes\nprogress 2 1 2 disk\nwait");
    ::setenv("FIXWELL_TOOL_PATH", tools.c_str(), 1);
    const std::string partitioned = makePartitionedImage("Whole Disk");
    openInOneSize({partitioned});
    session().host().sharedDiskController().synchronize(machine());
    select(partitioned + "#1");
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([&] { return verdict(partitioned).ends_with("%"); }));
    QTest::qWait(200);
    takePicture("-job-in-list");
    button("verifyDiskButton").press();
    finishJob();
}

TEST_F(Pictures, OfARepairThatIsUndone)
{
    const std::string image = makeDamagedImage("Letters");
    // What is inside loses its name, and is collected by the repair.
    directory_.damage(image, "mkdir /photos");
    directory_.damage(image, "mkdir /photos/summer");
    directory_.damage(image, "clri /photos");
    const std::string interrupted = makeImage("Photos");
    orvane::test::interruptRepair(interrupted, directory_ / "state/repairs/records");
    openInOneSize({image, interrupted});
    takePictureOfMenu("preferences", "-edit-menu");
    takePicture("-interrupted-row");
    select(interrupted);
    QTest::qWait(300);
    takePicture("-interrupted");
    treat("repairDiskButton", image);
    QTest::qWait(300);
    takePicture("-repaired");
    takePictureOfMenu("undoRepair", "-menu");
    command("undoRepair").trigger();
    QTest::qWait(100);
    takePicture("-undo");
    accept();
    QCoreApplication::sendPostedEvents(&window());
    takePicture("-undoing");
    ASSERT_TRUE(waitUntil([&] { return verdict(image) != "" && logRows().size() > 10; }));
    QTest::qWait(300);
    takePicture("-undone");
}

TEST_F(Pictures, OfAnImageThatCannotBeWritten)
{
    // Root may write everything: the picture is an ordinary user's.
    if (::geteuid() == 0)
        return;
    const std::string image = makeDamagedImage("Letters");
    std::filesystem::permissions(image, std::filesystem::perms::owner_read);
    openInOneSize({image});
    treat("verifyDiskButton", image);
    select(image);
    button("repairDiskButton").press();
    ASSERT_TRUE(waitForJob());
    QTest::qWait(300);
    takePicture("-no-rights");
}

TEST_F(Pictures, OfARepairThatIsNotProven)
{
    const std::string tools = directory_.fakeTools(
        "say Pass 1: Checking inodes, blocks, and sizes\nwrite-in-repair changed\nexit 4");
    ::setenv("FIXWELL_TOOL_PATH", tools.c_str(), 1);
    const std::string image = makeImage("Letters");
    openInOneSize({image});
    select(image);
    button("repairDiskButton").press();
    ASSERT_TRUE(waitForStep(NextStep::ApplyUnproven));
    QTest::qWait(300);
    takePicture("-unproven");
    take(NextStep::ApplyUnproven);
    QTest::qWait(100);
    takePicture("-unproven-confirmation");
}

TEST_F(Pictures, OfTheDialogs)
{
    const std::string image = makeDamagedImage("Letters");
    openInOneSize({image});
    treat("repairDiskButton", image);
    const auto dialog = [this](const char* name) -> QWidget& {
        QTest::qWait(100);
        return *window().findChild<QWidget*>(QLatin1String(name));
    };
    command("preferences").trigger();
    QWidget& preferences = dialog("preferencesDialog");
    auto& pages = *preferences.findChild<QTabWidget*>();
    for (int page = 0; page < pages.count(); ++page) {
        pages.setCurrentIndex(page);
        save(dialog("preferencesDialog").grab(), "-preferences-" + std::to_string(page));
    }
    preferences.close();
    command("about").trigger();
    QTest::qWait(2000);
    save(dialog("aboutDialog").grab(), "-about");
    dialog("aboutDialog").close();
    command("saveReport").trigger();
    save(dialog("reportDialog").grab(), "-report");
    dialog("reportDialog").close();
}

}  // namespace
}  // namespace orvane::desktop::test

int main(int argc, char** argv)
{
    ::setenv("LC_ALL", "C.UTF-8", 1);
    orvane::adoptUserLocale();
    testing::InitGoogleTest(&argc, argv);
    QApplication application(argc, argv);
    QLocale::setDefault(QLocale(QString::fromStdString(orvane::currentLanguage())));
    QApplication::setQuitOnLastWindowClosed(false);
    QApplication::setStyle(new orvane::desktop::FramedStyle);
    if (qEnvironmentVariable("PICTURE").contains(QLatin1String("dark")))
        QApplication::setPalette(orvane::desktop::darkPalette());
    if (const int points = qEnvironmentVariableIntValue("FONT_POINTS"); points > 0) {
        QFont font = QApplication::font();
        font.setPointSize(points);
        QApplication::setFont(font);
    }
    return RUN_ALL_TESTS();
}

// SPDX-License-Identifier: Apache-2.0
#include "tests/pellar/permissions/DebianSystem.h"

#include "pellar/bytes/Digest.h"
#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

namespace pellar::test {
namespace {

namespace fs = std::filesystem;

std::string nameOf(const PackageFile& file)
{
    const std::string name = file.path.substr(0, file.path.find(" -> "));
    return name.back() == '/' ? name.substr(0, name.size() - 1) : name;
}

void make(const fs::path& tree, const PackageFile& file)
{
    const fs::path path = tree / nameOf(file);
    const std::size_t arrow = file.path.find(" -> ");
    if (file.path.back() == '/')
        fs::create_directories(path);
    else if (arrow != std::string::npos)
        fs::create_symlink(file.path.substr(arrow + 4), path);
    else
        orvane::test::write(path, "contents\n");
    EXPECT_EQ(::lchown(path.c_str(), file.user, file.group), 0);
    if (arrow == std::string::npos)
        ::chmod(path.c_str(), file.mode);
}

}  // namespace

Rights rightsOf(const fs::path& path)
{
    struct stat status = {};
    EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
    return {status.st_mode & 07777U, status.st_uid, status.st_gid};
}

const char* DebianSystem::obstacle()
{
    if (::geteuid() != 0)
        return "giving files to others needs root";
    return findProgram("dpkg-deb", "/usr/bin:/bin").empty() ? "dpkg-deb is not installed" : nullptr;
}

DebianSystem::DebianSystem()
{
    for (const char* const directory :
         {"usr/bin", "etc", "var/lib/dpkg/info", "var/cache/apt/archives", "usr/lib/tmpfiles.d"})
        fs::create_directories(path(directory));
    fs::create_symlink("usr/bin", path("bin"));
    write("etc/passwd", "root:x:0:0::/root:/bin/sh\nplayer:x:4242:60::/:/bin/false\n");
    write("etc/group", "root:x:0:\nplayers:x:60:\n");
    write("var/lib/dpkg/status", "");
}

fs::path DebianSystem::path(std::string_view name) const
{
    const fs::path root = workshop_.path("root");
    return name.empty() ? root : root / name;
}

void DebianSystem::write(std::string_view name, std::string_view bytes) const
{
    orvane::test::write(path(name), bytes);
}

fs::path DebianSystem::archiveOf(const std::string& name) const
{
    return path("var/cache/apt/archives/" + name + "_1%3a2.0-1_all.deb");
}

void DebianSystem::install(const std::string& name, const std::vector<PackageFile>& files,
                           std::string_view afterInstallation)
{
    const fs::path tree = workshop_.path("tree-" + name);
    const std::string control = "Package: " + name +
                                "\nVersion: 1:2.0-1\nArchitecture: all\n"
                                "Maintainer: Nobody <nobody@example.org>\nDescription: test\n";
    orvane::test::write(tree / "DEBIAN/control", control);
    std::string list = "/.\n";
    std::string sums;
    for (const PackageFile& file : files) {
        make(tree, file);
        list += '/' + nameOf(file) + '\n';
        Digester digester(DigestKind::MD5);
        digester.add("contents\n");
        sums += digester.finish() + "  " + nameOf(file) + '\n';
    }
    ASSERT_EQ(runTool({"dpkg-deb", "-b", tree, archiveOf(name)}).status, 0);
    // dpkg unpacks "bin/x" behind the link; dpkg-deb would put a directory in its place.
    for (const PackageFile& file : files)
        make(path(), file);
    write("var/lib/dpkg/info/" + name + ".list", list);
    write("var/lib/dpkg/info/" + name + ".md5sums", sums);
    if (!afterInstallation.empty())
        write("var/lib/dpkg/info/" + name + ".postinst", afterInstallation);
    status_ += control + "Status: install ok installed\n\n";
    write("var/lib/dpkg/status", status_);
}

void DebianSystem::writeIndex() const
{
    std::string index;
    for (const auto& entry : fs::directory_iterator(path("var/cache/apt/archives"))) {
        const std::string name = entry.path().filename();
        const FileDescriptor archive(::open(entry.path().c_str(), O_RDONLY | O_CLOEXEC));
        index += "Package: " + name.substr(0, name.find('_')) +
                 "\nArchitecture: all\nVersion: 1:2.0-1\nDescription: x\nSHA256: " +
                 digestOfFile(archive.get(), DigestKind::SHA256, 1U << 20U).value_or("") + "\n\n";
    }
    write("var/lib/apt/lists/example_main_Packages", index);
}

contract::DiskReferencePointer mountedAt(const fs::path& root)
{
    contract::DiskReference disk;
    disk.path = "/dev/null";
    disk.identifier = "disk";
    disk.name = "Disk";
    disk.filesystem = "ext4";
    disk.mountPoint = root;
    return std::make_shared<const contract::DiskReference>(std::move(disk));
}

std::string PermissionBench::problems() const
{
    std::string all;
    for (const auto& type : {contract::kFsckError, contract::kFsckFail, contract::kFsckProblem})
        for (const std::string& line : listener.textsOf(type))
            all += line + '\n';
    return all;
}

std::string PermissionBench::remarks() const
{
    std::string all;
    for (const contract::Dictionary& message : listener.dictionaries)
        if (!message.has(contract::kFsckMessageType))
            all += std::string(message.string(contract::kFsckMessageString)) + "\n";
    return all;
}

}  // namespace pellar::test

// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/AttachedRegion.h"

#include "contract/pellar/MessageKeys.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cstring>
#include <optional>

namespace orvane {
namespace {

using pellar::Access;

Undone undone(contract::ErrorCode error, pellar::Sentence reason)
{
    return {error, contract::kPLVerdictFailed, std::move(reason)};
}

/// How the file is open; none when it can be neither read nor written through the descriptor.
std::optional<Access> accessOf(int file)
{
    const int flags = ::fcntl(file, F_GETFL);
    if (flags < 0 || (flags & O_PATH) != 0)
        return std::nullopt;
    switch (flags & O_ACCMODE) {
        case O_RDONLY: return Access::ReadOnly;
        case O_RDWR: return Access::ReadWrite;
        default: return std::nullopt;
    }
}

bool isInside(const contract::DiskReference& region, int file)
{
    struct stat status = {};
    if (::fstat(file, &status) != 0 || !S_ISREG(status.st_mode))
        return false;
    const auto size = static_cast<std::uint64_t>(status.st_size);
    return region.offset <= size && region.length <= size - region.offset;
}

}  // namespace

std::variant<AttachedRegion, Undone> AttachedRegion::attach(const FileDescriptor& image,
                                                            const HelperRequest& request)
{
    const Access wanted =
        request.operation == pellar::Operation::Repair ? Access::ReadWrite : Access::ReadOnly;
    const auto given = accessOf(image.get());
    if (!given || !isInside(request.disk, image.get()))
        return undone(contract::kPLErrorCannotOpen,
                      {"it is not a part of an image that you have opened", {}, {}});
    if (wanted == Access::ReadWrite && given == Access::ReadOnly)
        return undone(contract::kPLErrorReadOnly, {"you may not write to the image", {}, {}});
    auto device =
        pellar::LoopDevice::attach(image.get(), request.disk.offset, request.disk.length, wanted);
    if (!device)
        return undone(
            contract::kPLErrorCannotOpen,
            {"it could not be attached as a device: %1$@", ::strerrordesc_np(device.error()), {}});
    return AttachedRegion(*std::move(device));
}

contract::DiskReference AttachedRegion::disk(const HelperRequest& request) const
{
    contract::DiskReference disk = request.disk;
    disk.storage = contract::DiskReference::Storage::BlockDevice;
    disk.path = device_.node();
    disk.offset = 0;
    return disk;
}

}  // namespace orvane

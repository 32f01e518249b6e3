// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/images/ImageAttacher.h"

#include "fixwell/host/foundation/UTF8.h"
#include "orvane/support/images/ImageContents.h"
#include "orvane/support/images/ImageDisks.h"

#include <utility>

namespace orvane {
namespace {

const fixwell::Name attachmentKey{"orvane-attachment"};

}  // namespace

ImageAttacher::ImageAttacher(Disk::Surroundings surroundings, Translator translator)
    : surroundings_(std::move(surroundings)), translator_(std::move(translator))
{
}

fixwell::ErrorCode ImageAttacher::AttachImageWithURL(const std::filesystem::path& image,
                                                     fixwell::Dictionary& result)
{
    auto opened = openImage(image, translator_);
    if (failed(opened)) {
        const std::string name = fixwell::printable(image.filename().native());
        const std::lock_guard guard(lock_);
        lastErrors_[image.native()] =
            translator_.sentence("cannot attach ‘%@’: %@", {name, failureMessage(opened)});
        return fixwell::kPLErrorCannotOpen;
    }
    const auto& open = std::get<OpenImage>(opened);
    DiskTree disks = disksOfImage(open, readContents(open));
    const std::lock_guard guard(lock_);
    lastErrors_.erase(image.native());
    attached_.emplace(++attachments_, std::move(disks));
    result = fixwell::Dictionary::of({{attachmentKey, attachments_}});
    return fixwell::kPLNoError;
}

fixwell::OVDiskPointer ImageAttacher::TopLevelPLDiskForImageDict(const fixwell::Dictionary& result)
{
    const std::lock_guard guard(lock_);
    const auto found = attached_.extract(result.integer(attachmentKey));
    return found ? Disk::make(found.mapped(), surroundings_) : nullptr;
}

std::string ImageAttacher::lastError(const std::filesystem::path& image) const
{
    const std::lock_guard guard(lock_);
    const auto found = lastErrors_.find(image.native());
    return found != lastErrors_.end() ? found->second : std::string();
}

}  // namespace orvane

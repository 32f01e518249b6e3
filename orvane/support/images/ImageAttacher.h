// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/HostServices.h"
#include "orvane/support/disks/Disk.h"
#include "orvane/support/images/ImageReading.h"
#include "orvane/support/texts/Translator.h"

#include <chrono>
#include <filesystem>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <string_view>

namespace orvane {

/// Attaches disk images without the system's help: the image is read, and its volumes become
/// disks that name regions of the file. Nothing is mounted, no loop device is taken, nothing stays
/// open, no privileges are needed. Any thread.
///
/// The disks that come out of it become known to the disk controller when the main thread first
/// asks for their volumes, and are forgotten when they are ejected.
class ImageAttacher final : public contract::ImageAttachment {
public:
    ImageAttacher(Disk::Surroundings surroundings, Translator translator);

    /// kPLErrorCannotOpen when the file cannot be opened, is empty, is no disk image, or does not
    /// answer for half a minute; kPLErrorCancelled after `stopAttachments`.
    [[nodiscard]] contract::ErrorCode AttachImageWithURL(const std::filesystem::path& image,
                                                        contract::Dictionary& result) override;
    contract::OVDiskPointer TopLevelPLDiskForImageDict(const contract::Dictionary& result) override;

    /// Attachments that are under way end at once, and no others begin before
    /// `resumeAttachments`.
    void stopAttachments();
    void resumeAttachments();
    /// Before anything is attached: how an image is read, and how long that may take.
    void setReader(ImageReading::Reader reader) { reader_ = std::move(reader); }
    const ImageReading::Reader& reader() const { return reader_; }
    void setLongestWait(std::chrono::milliseconds longest) { longestWait_ = longest; }

    /// Why the last attachment of this image failed, as a sentence to show ("cannot attach
    /// ‘x.img’: the file is empty"); empty when it did not.
    [[nodiscard]] std::string lastError(const std::filesystem::path& image) const;

private:
    contract::ErrorCode note(const std::filesystem::path& image, std::string_view reason,
                            contract::ErrorCode code);

    const Disk::Surroundings surroundings_;
    const Translator translator_;

    ImageReading::Reader reader_ = ImageReading::readNow;
    std::chrono::milliseconds longestWait_ = std::chrono::seconds(30);

    mutable std::mutex lock_;
    std::set<std::shared_ptr<ImageReading>> readings_;  ///< that are waited for; guarded
    std::map<std::int64_t, DiskTree> attached_;         ///< by attachment, until asked for; guarded
    std::int64_t attachments_ = 0;                      ///< guarded
    bool isStopped_ = false;                            ///< guarded
    std::map<std::string, std::string> lastErrors_;     ///< by the path as given; guarded
};

}  // namespace orvane

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/HostServices.h"
#include "orvane/support/disks/Disk.h"
#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/files/Failure.h"
#include "orvane/support/texts/Catalogue.h"

#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <string_view>

namespace orvane {

struct ReadImage {
    DiskTree disks;          ///< as `disksOfImage` answers them
    std::string loopDevice;  ///< the node of the device that the file is as well; mostly empty
};

/// One reading of an image file, on a thread of its own: a file on a network or on a sleeping
/// drive may keep its reader waiting for as long as it likes, and no other thread has to wait with
/// it. Any thread.
class ImageReading {
public:
    /// A failure is the bare reason, in English where it is one of the host's own.
    using Outcome = Result<ReadImage, Failure>;

    using Reader = std::function<Outcome(const std::filesystem::path& image)>;

    /// Reads it on the calling thread.
    static Outcome readNow(const std::filesystem::path& image);
    /// `done` is called on the reader's thread, also after it was given up; none when empty. Where
    /// the system gives no thread, the image is read before this returns.
    static std::shared_ptr<ImageReading> start(const std::filesystem::path& image,
                                               std::function<void()> done = {},
                                               const Reader& reader = readNow);

    enum class State { Reading, Done, GivenUp };
    /// Returns when it is done or given up, or that time is over.
    State waitFor(std::chrono::milliseconds longest);
    /// The result is not wanted any more: `waitFor` returns at once.
    void giveUp();
    /// What was read; none while it is being read.
    std::optional<Outcome> result() const;

private:
    void finish(Outcome result);

    mutable std::mutex lock_;
    std::condition_variable changed_;
    std::optional<Outcome> result_;  ///< guarded
    bool isGivenUp_ = false;         ///< guarded
};

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
    /// Before anything is attached: how an image is read.
    void setReader(ImageReading::Reader reader) { reader_ = std::move(reader); }
    const ImageReading::Reader& reader() const { return reader_; }

    /// Why the last attachment of this image failed, as a sentence to show ("cannot attach
    /// ‘x.img’: the file is empty"); empty when it did not.
    [[nodiscard]] std::string lastError(const std::filesystem::path& image) const;

private:
    contract::ErrorCode note(const std::filesystem::path& image, std::string_view reason,
                             contract::ErrorCode code);

    const Disk::Surroundings surroundings_;
    const Translator translator_;

    ImageReading::Reader reader_ = ImageReading::readNow;

    mutable std::mutex lock_;
    std::set<std::shared_ptr<ImageReading>> readings_;  ///< that are waited for; guarded
    std::map<std::int64_t, DiskTree> attached_;         ///< by attachment, until asked for; guarded
    std::int64_t attachments_ = 0;                      ///< guarded
    bool isStopped_ = false;                            ///< guarded
    std::map<std::string, std::string> lastErrors_;     ///< by the path as given; guarded
};

}  // namespace orvane

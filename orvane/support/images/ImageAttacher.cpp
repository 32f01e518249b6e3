// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/images/ImageAttacher.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/images/ImageFile.h"
#include "pellar/disks/LoopDevice.h"

#include <sys/stat.h>

#include <system_error>
#include <thread>
#include <utility>

namespace orvane {
namespace {

std::string loopDeviceOf(const OpenImage& image)
{
    struct stat status = {};
    if (::fstat(image.descriptor.get(), &status) != 0)
        return {};
    return pellar::loopDeviceOn(status.st_dev, status.st_ino, pellar::SystemPaths());
}

}  // namespace

std::shared_ptr<ImageReading> ImageReading::start(const std::filesystem::path& image,
                                                  std::function<void()> done, const Reader& reader)
{
    auto reading = std::make_shared<ImageReading>();
    const auto task = [reading, image, reader, done = std::move(done)] {
        reading->finish(reader(image));
        if (done)
            done();
    };
    try {
        std::thread(task).detach();
    } catch (const std::system_error&) {
        task();
    }
    return reading;
}

// The host's texts may be gone when a file answers at last, so none are looked up here.
ImageReading::Outcome ImageReading::readNow(const std::filesystem::path& image)
{
    const auto opened = openImage(image, Translator());
    if (!opened)
        return opened.error();
    return ReadImage{disksOfImage(*opened, readContents(*opened)), loopDeviceOf(*opened)};
}

void ImageReading::finish(Outcome result)
{
    const std::lock_guard guard(lock_);
    result_ = std::move(result);
    changed_.notify_all();
}

ImageReading::State ImageReading::waitFor(std::chrono::milliseconds longest)
{
    std::unique_lock guard(lock_);
    changed_.wait_for(guard, longest, [this] { return result_ || isGivenUp_; });
    if (isGivenUp_)
        return State::GivenUp;
    return result_ ? State::Done : State::Reading;
}

void ImageReading::giveUp()
{
    const std::lock_guard guard(lock_);
    isGivenUp_ = true;
    changed_.notify_all();
}

std::optional<ImageReading::Outcome> ImageReading::result() const
{
    const std::lock_guard guard(lock_);
    return result_;
}

namespace {

const contract::Name attachmentKey{"orvane-attachment"};
constexpr std::chrono::seconds longestWait{30};

}  // namespace

ImageAttacher::ImageAttacher(Disk::Surroundings surroundings, Translator translator)
    : surroundings_(std::move(surroundings)), translator_(std::move(translator))
{
}

contract::ErrorCode ImageAttacher::AttachImageWithURL(const std::filesystem::path& image,
                                                      contract::Dictionary& result)
{
    const auto reading = ImageReading::start(image, {}, reader_);
    {
        const std::lock_guard guard(lock_);
        readings_.insert(reading);
        if (isStopped_)
            reading->giveUp();
    }
    const ImageReading::State state = reading->waitFor(longestWait);
    const std::lock_guard guard(lock_);
    readings_.erase(reading);
    if (state == ImageReading::State::GivenUp)
        return note(image, translator_.text("it was stopped"), contract::kPLErrorCancelled);
    if (state == ImageReading::State::Reading)
        return note(image, translator_.text("the file does not answer"),
                    contract::kPLErrorCannotOpen);
    const ImageReading::Outcome read = *reading->result();
    if (!read)
        return note(image, translator_.text(read.error().message), contract::kPLErrorCannotOpen);
    lastErrors_.erase(image.native());
    attached_.emplace(++attachments_, read->disks);
    result = contract::Dictionary::of({{attachmentKey, attachments_}});
    return contract::kPLNoError;
}

// With the lock held.
contract::ErrorCode ImageAttacher::note(const std::filesystem::path& image, std::string_view reason,
                                        contract::ErrorCode code)
{
    const std::string name = contract::printable(image.filename().native());
    lastErrors_[image.native()] = translator_.sentence("cannot attach ‘%@’: %@", {name, reason});
    return code;
}

void ImageAttacher::stopAttachments()
{
    const std::lock_guard guard(lock_);
    isStopped_ = true;
    for (const auto& reading : readings_)
        reading->giveUp();
}

void ImageAttacher::resumeAttachments()
{
    const std::lock_guard guard(lock_);
    isStopped_ = false;
}

contract::OVDiskPointer ImageAttacher::TopLevelPLDiskForImageDict(
    const contract::Dictionary& result)
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

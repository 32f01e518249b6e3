// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/images/ImageReading.h"

#include "orvane/support/images/ImageDisks.h"
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
ImageReading::Result ImageReading::readNow(const std::filesystem::path& image)
{
    auto opened = openImage(image, Translator());
    if (failed(opened))
        return Failure{failureMessage(opened)};
    const auto& open = std::get<OpenImage>(opened);
    return ReadImage{disksOfImage(open, readContents(open)), loopDeviceOf(open)};
}

void ImageReading::finish(Result result)
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

std::optional<ImageReading::Result> ImageReading::result() const
{
    const std::lock_guard guard(lock_);
    return result_;
}

}  // namespace orvane

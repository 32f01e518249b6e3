// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/UnreachedImage.h"

#include "contract/foundation/StyledText.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"

#include <chrono>

namespace orvane {
namespace {

// As the modules make the heading of an error (fixwell/messagelog).
contract::Dictionary headingOfError(const std::string& sentence)
{
    constexpr int heading = -1;
    constexpr double points = 11;
    const contract::Color red{1, 0, 0, 1};
    return contract::Dictionary::of(
        {{contract::kFsckMessageType, contract::kFsckFail},
         {contract::kFsckMessageString, std::string_view(sentence)},
         {contract::kFsckVerbosity, heading},
         {contract::Name("kOV_finalAttributedString_type"),
          contract::StyledText::make(sentence + "\n",
                                    {contract::Font::boldSystem(points), red, {}})}});
}

}  // namespace

std::string whyUnreached(SupportHost& host, const Disk& image, const std::string& name)
{
    const std::string why = host.imageAttachment().lastError(image.diskImagePath());
    return why.empty()
               ? host.translator().sentence(
                     "cannot check “%@”: there is no volume on it that can be checked", {name})
               : why;
}

void keepUnreached(SupportHost& host, Disk& image, Operation operation, const std::string& sentence)
{
    const auto now = std::chrono::system_clock::now();
    HistoryStore& store = host.historyStore();
    const std::int64_t run =
        store.beginRun(host.histories().keyOf(image.facts()), nameOf(operation), now);
    store.endRun(
        run, {std::string(contract::kPLVerdictFailed.text()), contract::kPLErrorCannotOpen, sentence},
        now);
    image.fsckHistoryNoChildren().append(headingOfError(sentence));
    host.histories().saveNew();
}

}  // namespace orvane

// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/messagelog/MessageStyle.h"
#include "fixwell/module/OVFXW.h"

namespace fixwell {
namespace {

constexpr std::size_t detailCapOnReadOnlyRoot = 1001;  // records
constexpr std::chrono::milliseconds reloadInterval{200};
constexpr std::size_t reloadBacklog = 48;         // records
constexpr std::size_t rowsThatAlwaysFollow = 50;  // below this, the log always scrolls
constexpr double scrollerAtBottom = 0.97;

}  // namespace

StyledText OVFXW::attributedStringForContext(const Dictionary& record,
                                             std::optional<std::string_view> string)
{
    if (!string)
        return StyledText::make();
    return StyledText::make(*string, messageStyle(record, errorColor(), passColor()));
}

const Color& OVFXW::errorColor()
{
    if (!errorColor_)
        errorColor_ = standardErrorColor;
    return *errorColor_;
}

const Color& OVFXW::passColor()
{
    if (!passColor_)
        passColor_ = standardPassColor;
    return *passColor_;
}

void OVFXW::appendTitleToMessageText(std::string_view text)
{
    appendMessage(text, std::nullopt, verbosity::heading);
}

void OVFXW::appendSuccessTitleToMessageText(std::string_view text)
{
    appendMessage(text, kFsckSuccess, verbosity::heading);
}

void OVFXW::appendWarningToMessageText(std::string_view text)
{
    appendMessage(text, kFsckFail, verbosity::detail);
}

void OVFXW::appendWarningTitleToMessageText(std::string_view text)
{
    appendMessage(text, kFsckFail, verbosity::main);
}

void OVFXW::appendErrorToMessageText(std::string_view text)
{
    appendMessage(text, kFsckFail, verbosity::main);
}

void OVFXW::appendErrorTitleToMessageText(std::string_view text)
{
    appendMessage(text, kFsckFail, verbosity::heading);
}

void OVFXW::addObjectAndUpdateView(const Array& history, const Dictionary& record, bool forceReload)
{
    const bool isCapped = rootFilesystemIsReadOnly && history.size() >= detailCapOnReadOnlyRoot &&
                          verbosityOf(record) > verbosity::main;
    if (isCapped)
        return;
    if (history)
        history.append(record);
    if (forceReload || reloadIsDue(history)) {
        reloadMessageView();
        lastReloadCount = history.size();
        lastReloadDate = host().threads().now();
    }
    keepNewestLineInSight();
    if (const StyledText text = finalText(record))
        host().log().logPriorityWithEOL(text.characters(), 0, false);
}

// A burst of output reloads the log five times a second, or when 49 records are waiting.
bool OVFXW::reloadIsDue(const Array& history) const
{
    if (history.size() > lastReloadCount + reloadBacklog)
        return true;
    return lastReloadDate && host().threads().now() - *lastReloadDate > reloadInterval;
}

// A user who has scrolled up to read is not pulled down.
void OVFXW::keepNewestLineInSight()
{
    if (messageOutlineView == nullptr)
        return;
    const std::size_t rows = messageOutlineView->numberOfRows();
    if (rows == 0)
        return;
    const bool isAtBottom = vScroller != nullptr && vScroller->value() >= scrollerAtBottom;
    if (rows < rowsThatAlwaysFollow || isAtBottom)
        messageOutlineView->scrollRowToVisible(rows - 1);
}

// The lock keeps two writers from overlapping in the common case, and is given back even by one
// who did not get it.
void OVFXW::clearMessageText()
{
    setMessageText("");
    if (repairMessageTextView != nullptr)
        repairMessageTextView->setNeedsDisplay(true);
}

void OVFXW::setMessageText(std::string_view text)
{
    if (statusViewLock)
        static_cast<void>(statusViewLock->tryLock());
    if (repairMessageTextView != nullptr)
        repairMessageTextView->setString(text);
    if (statusViewLock)
        statusViewLock->unlock();
}

void OVFXW::reloadMessageView()
{
    if (messageOutlineView != nullptr)
        messageOutlineView->reloadData();
}

}  // namespace fixwell

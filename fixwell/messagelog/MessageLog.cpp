// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/module/OVFXW.h"

namespace fixwell {
namespace {

constexpr std::size_t detailCapOnReadOnlyRoot = 1001;  // records
constexpr std::chrono::milliseconds reloadInterval{200};
constexpr std::size_t reloadBacklog = 48;         // records
constexpr std::size_t rowsThatAlwaysFollow = 50;  // below this, the log always scrolls
constexpr double scrollerAtBottom = 0.97;

/// The library's own verbosity, except where the type decides.
std::int64_t verbosityOfMessage(const Dictionary& message)
{
    const std::string_view type = message.string(kFsckMessageType);
    if (type == kFsckVerify.text() || type == kFsckRepair.text())
        return verbosity::detail;
    if (type == kFsckError.text())
        return verbosity::heading;
    return message.integer(kFsckVerbosity);
}

}  // namespace

std::string OVFXW::doParameterSubstitutionForMessageString(const Dictionary& message) const
{
    return substitutedParameters(
        message.string(kFsckMessageString), message[kFsckParameters].array(),
        [this](const Value& number) { return host().decimalString(number); });
}

void OVFXW::repairOutputDictionary(const Dictionary& message, std::string_view string,
                                   const OVDiskPointer& disk)
{
    ov_log(
        OVLog::trace, "repairOutputDictionary for %@: %@\n", [&] { return identifierOf(disk); },
        [&] { return Value(message).description(); });
    const OVDiskPointer inflight = diskOfEntry(inflightItem);
    if (!inflight || !disk || !message) {
        ov_log(OVLog::trace, "repairOutputDictionary disk or output not valid\n");
        return;
    }
    if (!message.string(kFsckMessageString).empty()) {
        if (inflight != disk && !inflight->isEqual(*disk))
            ov_log(OVLog::mismatch, "inflight disk (%s) not matching repairOutput disk (%@)\n",
                   inflight->diskIdentifier(), disk->diskIdentifier());
        addMessageRecord(message, string, verbosityOfMessage(message), inflight);
    }
    const Array parameters = message[kFsckParameters].array();
    if (message.string(kFsckMessageType) == kFsckProgress.text() && !parameters.isEmpty())
        plAsyncProgressForDisk(disk->theKRDisk(), false,
                               static_cast<float>(parameters.front().real()));
}

void OVFXW::addMessageRecord(const Dictionary& message, std::string_view string, std::int64_t level,
                             const OVDiskPointer& inflight)
{
    const Dictionary record = message.mutableCopy();
    record.set(kOV_typeOfOutputKey, kOV_typeOfOutput_dict);
    const StyledText text = attributedStringForContext(
        record,
        string.empty() ? doParameterSubstitutionForMessageString(message) : std::string(string));
    text.append("\n");
    record.set(kOV_finalAttributedString_type, text);
    record.set(kFsckVerbosity, level);
    const Array history = inflight->fsckHistoryNoChildren();
    addObjectAndUpdateView(history, record, forcesReloadOfDiskCheck(history));
}

bool OVFXW::forcesReloadOfDiskCheck(const Array& history) const
{
    constexpr std::size_t promptRecords = 99;
    return isDiskAction(action) && history.size() <= promptRecords;
}

void OVFXW::appendMessage(std::string_view text, std::optional<Name> type, std::int64_t level)
{
    const OVDiskPointer disk = searchForInflightDisk();
    if (!disk) {
        ov_log(OVLog::trace, "No inflight item for appendMessage: %@\n", text);
        return;
    }
    const Dictionary record = Dictionary::of({{kOV_typeOfOutputKey, kOV_typeOfOutput_OV_addition}});
    if (type)
        record.set(kFsckMessageType, *type);
    record.set(kFsckVerbosity, level);
    record.set(kOV_finalAttributedString_type, attributedStringForContext(record, text));
    addObjectAndUpdateView(disk->fsckHistoryNoChildren(), record, level < verbosity::detail);
}

void OVFXW::createStartupObject(std::string_view text, const OVDiskPointer& disk)
{
    if (!disk)
        return;
    const StyledText line = StyledText::make(text, {Font::boldSystem(messageFontPoints), {}, {}});
    line.append(StyledText::make("\n"));
    const Dictionary record = Dictionary::of({{kFsckMessageString, text},
                                              {kOV_finalAttributedString_type, line},
                                              {kFsckVerbosity, verbosity::heading}});
    if (!disk->fsckHistoryNoChildren())
        disk->setFsckHistory(Array::make());
    addObjectAndUpdateView(disk->fsckHistoryNoChildren(), record, true);
}

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

void OVFXW::clearMessageText()
{
    setMessageText("");
    if (repairMessageTextView != nullptr)
        repairMessageTextView->setNeedsDisplay(true);
}

// The lock keeps two writers from overlapping in the common case, and is given back even by a
// writer that did not get it.
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

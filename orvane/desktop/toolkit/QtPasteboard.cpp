// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtPasteboard.h"

#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QClipboard>
#include <QGuiApplication>

#include <algorithm>

namespace orvane::desktop {
namespace {

// Pasted into a terminal, a disk's label must not press keys there.
QByteArray withoutControls(std::string_view text)
{
    std::string result;
    result.reserve(text.size());
    while (!text.empty()) {
        const std::size_t end = std::min(text.find_first_of("\n\t"), text.size());
        result += contract::printable(text.substr(0, end));
        result += text.substr(end, 1);
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return {result.data(), static_cast<qsizetype>(result.size())};
}

void put(QMimeData& data, std::string_view bytes, contract::PasteboardType type)
{
    const QByteArray raw(bytes.data(), static_cast<qsizetype>(bytes.size()));
    switch (type) {
        case contract::PasteboardType::PlainString:
            data.setText(QString::fromUtf8(withoutControls(bytes)));
            return;
        case contract::PasteboardType::TabularText:
            data.setData(QStringLiteral("text/tab-separated-values"), withoutControls(bytes));
            return;
        case contract::PasteboardType::RTF:
            data.setData(QStringLiteral("text/rtf"), raw);
            data.setData(QStringLiteral("application/rtf"), raw);
            return;
        case contract::PasteboardType::RTFD:
            data.setData(QStringLiteral("application/x-rtfd"), raw);
            return;
    }
}

}  // namespace

void MimePasteboard::declareTypes(const std::vector<contract::PasteboardType>& types,
                                  const void* /*owner*/)
{
    data_ = std::make_unique<QMimeData>();
    missing_ = types;
}

void MimePasteboard::setData(std::string_view data, contract::PasteboardType type)
{
    const auto declared = std::find(missing_.begin(), missing_.end(), type);
    if (!data_ || declared == missing_.end())
        return;
    put(*data_, data, type);
    missing_.erase(declared);
    if (missing_.empty())
        becameComplete();
}

void MimePasteboard::replaceText(std::string_view text)
{
    if (!data_ || text.empty())
        return;
    put(*data_, text, contract::PasteboardType::PlainString);
    put(*data_, text, contract::PasteboardType::TabularText);
}

void QtPasteboard::becameComplete()
{
    if (text_)
        replaceText(text_());
    std::unique_ptr<QMimeData> data = take();
    const std::string html = html_ ? html_() : std::string();
    if (!html.empty())
        data->setHtml(toQt(html));
    QGuiApplication::clipboard()->setMimeData(data.release());
}

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Pasteboard.h"

#include <QMimeData>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace orvane::desktop {

/// Collects what a module puts on a pasteboard as MIME data: text/plain,
/// text/tab-separated-values, text/rtf and application/rtf, application/x-rtfd.
class MimePasteboard : public contract::Pasteboard {
public:
    void declareTypes(const std::vector<contract::PasteboardType>& types,
                      const void* owner) override;
    void setData(std::string_view data, contract::PasteboardType type) override;

    /// What was collected as plain text is this instead, unless it is empty.
    void replaceText(std::string_view text);

    /// What was collected; none when nothing was declared since the last call.
    std::unique_ptr<QMimeData> take() { return std::move(data_); }

protected:
    /// The last one of the declared types has got its data.
    virtual void becameComplete() {}

private:
    std::unique_ptr<QMimeData> data_;
    std::vector<contract::PasteboardType> missing_;
};

/// The clipboard. Everything that was declared goes there together.
class QtPasteboard final : public MimePasteboard {
public:
    using HTMLSource = std::function<std::string()>;

    /// Asked for an HTML version of what is copied; an empty answer is none.
    void setHTMLSource(HTMLSource source) { html_ = std::move(source); }
    /// Asked for the plain text; an empty answer leaves what the module gave.
    void setTextSource(std::function<std::string()> source) { text_ = std::move(source); }

private:
    void becameComplete() override;

    HTMLSource html_;
    std::function<std::string()> text_;
};

}  // namespace orvane::desktop

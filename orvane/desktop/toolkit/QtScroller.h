// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"

#include <QScrollBar>

namespace orvane::desktop {

/// A scroll bar, which must live as long as this object is used.
class QtScroller final : public contract::Scroller {
public:
    explicit QtScroller(const QScrollBar& bar) : bar_(bar) {}

    /// 1.0 also when everything fits: the end is in sight.
    double value() const override
    {
        const int range = bar_.maximum() - bar_.minimum();
        return range > 0 ? static_cast<double>(bar_.value() - bar_.minimum()) / range : 1.0;
    }

private:
    const QScrollBar& bar_;
};

}  // namespace orvane::desktop

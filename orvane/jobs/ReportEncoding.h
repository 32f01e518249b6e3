// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/Report.h"

#include <memory>
#include <string>
#include <string_view>

namespace orvane {

/// Puts a report's lines into a file format, UTF-8, one after the other. Any thread.
class ReportEncoding {
public:
    virtual ~ReportEncoding() = default;

    /// What stands in front of all lines.
    [[nodiscard]] virtual std::string begin(std::string_view title) = 0;
    [[nodiscard]] virtual std::string add(const ReportLine& line) = 0;
    [[nodiscard]] virtual std::string end() = 0;
};

[[nodiscard]] std::unique_ptr<ReportEncoding> makeTextEncoding();

/// One page of HTML 5 that needs nothing else. Everything is escaped. `language` is a code ("de").
[[nodiscard]] std::unique_ptr<ReportEncoding> makeHTMLEncoding(std::string language);

}  // namespace orvane

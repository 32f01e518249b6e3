// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/Reporter.h"

#include <nlohmann/json_fwd.hpp>

#include <chrono>

namespace orvane {

/// Speaks to other programs: one JSON object (RFC 8259) per line of standard output, each with an
/// "event". Bytes that are no UTF-8 become U+FFFD.
class JSONReporter final : public Reporter {
public:
    void started(const std::string& disk, std::string_view action,
                 const std::string& title) override;
    void record(const std::string& disk, const contract::Dictionary& record,
                const contract::StyledText& text) override;
    void rowsWritten() override;
    void progress(const std::string& disk, std::optional<double> percent,
                  const std::string& status) override;
    void finished(const std::string& disk, std::string_view verdict, contract::ErrorCode error,
                  std::string_view message) override;
    void report(const std::string& disk, const contract::Dictionary& report) override;
    void alert(const std::string& title, const std::string& message) override;
    void failure(const std::string& disk, const std::string& sentence) override;
    void warning(const std::string& sentence) override;
    void listed(const DiskLine& disk) override;
    void done(const std::string& disk, std::string_view action, const std::string& place,
              const std::string& sentence) override;
    void runs(const std::string& disk, const std::vector<RunLine>& runs) override;

private:
    static void write(const nlohmann::ordered_json& event);

    std::optional<double> shownPercent_;
    std::string shownStatus_;
};

}  // namespace orvane

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Format.h"
#include "orvane/terminal/ProgressLine.h"
#include "orvane/terminal/Reporter.h"

#include <chrono>
#include <cstdio>
#include <functional>

namespace orvane {

/// Speaks to people: rows as they come, and on a terminal one live line at the bottom.
class TextReporter final : public Reporter {
public:
    struct Options {
        bool colors = false;
        bool showsProgress = false;
        /// A text of the host's own in the user's language.
        std::function<std::string(std::string_view key)> translate = [](std::string_view key) {
            return std::string(key);
        };
    };

    explicit TextReporter(Options options) : options_(std::move(options)) {}
    ~TextReporter() override { hideProgress(); }

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
    void prompt(Prompt state) override;
    void alert(const std::string& title, const std::string& message) override;
    void failure(const std::string& disk, const std::string& sentence) override;
    void warning(const std::string& sentence) override;
    void listed(const DiskLine& disk) override;
    void done(const std::string& disk, std::string_view action, const std::string& place,
              const std::string& sentence) override;
    void runs(const std::string& disk, const std::vector<RunLine>& runs) override;
    bool end() override;

private:
    using Clock = std::chrono::steady_clock;

    void write(std::string_view text);
    void endLine();
    void hideProgress();
    void drawProgress();
    std::string bold(std::string_view text) const;
    std::string sentence(std::string_view key,
                         std::initializer_list<contract::FormatArgument> arguments) const;
    std::string verdictText(std::string_view verdict) const;

    Options options_;
    JobProgress progress_;
    Clock::time_point began_ = Clock::now();
    Clock::time_point drawn_{};
    bool isProgressShown_ = false;
    bool isHeldBack_ = false;
    bool isAtLineStart_ = true;
    bool hasWrittenRows_ = false;
};

}  // namespace orvane

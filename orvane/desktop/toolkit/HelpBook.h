// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>
#include <QStringList>

#include <filesystem>
#include <string_view>

namespace orvane::desktop {

/// The help book in one language: pages of HTML in a directory, with the contents in index.html.
/// Pages are read when they are asked for. Any thread.
class HelpBook {
public:
    /// An empty directory is a book that cannot be read.
    explicit HelpBook(std::filesystem::path directory) : directory_(std::move(directory)) {}

    QString contents() const { return page(QStringLiteral("index.html")); }
    /// The page where `<a name="ANCHOR">` stands; the contents for an anchor that is nowhere.
    QString pageWith(std::string_view anchor) const;
    /// All pages as the contents name them, themselves first; none when they cannot be read.
    QStringList pages() const;
    /// A page's words without its marks; empty when it cannot be read.
    static QString plainText(const QString& page);

private:
    QString page(const QString& name) const;

    std::filesystem::path directory_;
};

}  // namespace orvane::desktop

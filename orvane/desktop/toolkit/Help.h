// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/support/OVPreferences.h"
#include "contract/toolkit/Help.h"

#include <QLineEdit>
#include <QListWidget>
#include <QMainWindow>
#include <QPointer>
#include <QString>
#include <QStringList>
#include <QTextBrowser>

#include <filesystem>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// A page on which all the words that are looked for stand.
struct HelpHit {
    QString page;  ///< its file
    QString title;
    QString line;  ///< the text around the first of the words
    double relevance = 0;
};

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
    /// The pages with all of these words, whatever their case, the most relevant first: a word in
    /// the title counts for more than in a heading, and that for more than elsewhere; the more
    /// often and the further in front, the better.
    std::vector<HelpHit> search(const QString& words) const;

private:
    QString page(const QString& name) const;

    std::filesystem::path directory_;
};

/// A window to read the help book in, with a way back and forward, and a search through all of
/// its pages that lists what it finds as one types. A link that leads out of the book is not
/// followed. Main thread.
class HelpWindow final : public QMainWindow {
public:
    /// `texts` and `settings`, which keep the window's size and place, outlive the window.
    HelpWindow(HelpBook book, const contract::Bundle& texts, contract::UserDefaults& settings);

    /// Shows the page where the anchor stands; an empty one is the contents. A book that cannot
    /// be read is said so in the window.
    void open(std::string_view anchor);

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    enum class Direction { Forward, Backward };

    QString text(std::string_view key) const;
    QAction* addCommand(QToolBar& bar, std::string_view title, QIcon icon, QKeySequence key);
    void addTools();
    void addFindField(QToolBar& bar);
    void follow(const QUrl& link);
    void listHits();
    void openHit();
    void find(Direction direction);
    bool findInPage(Direction direction);

    const HelpBook book_;
    const contract::Bundle& texts_;
    contract::UserDefaults& settings_;
    QTextBrowser* browser_;
    QLineEdit* findField_;
    QListWidget* hits_;  ///< hidden where nothing is looked for
};

/// The help book in a window of its own; no network and no browser is needed. The book is in the
/// language of the bundle's texts, in `help/LANGUAGE`.
class QtHelp final : public contract::HelpManager {
public:
    /// `bundle` holds the book and the window's own few texts; `settings` keeps the window's size
    /// and place. Both outlive this object.
    QtHelp(const contract::Bundle& bundle, contract::UserDefaults& settings)
        : bundle_(bundle), settings_(settings)
    {
    }
    QtHelp(const QtHelp&) = delete;
    QtHelp& operator=(const QtHelp&) = delete;
    ~QtHelp() override;

    /// Opens the book, or brings it to the front. An empty anchor is the book's beginning. A book
    /// that cannot be read is said so in the window.
    void openHelpAnchor(std::string_view anchor) override;
    /// None while it is closed.
    HelpWindow* window() { return window_; }

private:
    const contract::Bundle& bundle_;
    contract::UserDefaults& settings_;
    QPointer<HelpWindow> window_;
};

}  // namespace orvane::desktop

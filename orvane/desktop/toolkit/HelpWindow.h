// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "orvane/desktop/toolkit/HelpBook.h"

#include <QLineEdit>
#include <QMainWindow>
#include <QTextBrowser>

#include <functional>

namespace orvane::desktop {

/// A window to read the help book in, with a way back and forward, and a search through all of
/// its pages. A link that leads out of the book is not followed. Main thread.
class HelpWindow final : public QMainWindow {
public:
    /// `texts` outlives the window.
    HelpWindow(HelpBook book, const contract::Bundle& texts);

    /// Shows the page where the anchor stands; an empty one is the contents. A book that cannot
    /// be read is said so in the window.
    void open(std::string_view anchor);
    /// Told of the geometry when the window is closed.
    void setClosed(std::function<void(const QByteArray& geometry)> closed)
    {
        closed_ = std::move(closed);
    }

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    enum class Direction { Forward, Backward };

    QString text(std::string_view key) const;
    QAction* addCommand(QToolBar& bar, std::string_view title, QIcon icon, QKeySequence key);
    void addTools();
    void addFindField(QToolBar& bar);
    void follow(const QUrl& link);
    void find(Direction direction);
    bool findInPage(Direction direction);

    const HelpBook book_;
    const contract::Bundle& texts_;
    QTextBrowser* browser_;
    QLineEdit* findField_;
    std::function<void(const QByteArray&)> closed_;
};

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtHelp.h"

#include "fixwell/host/foundation/Format.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QFileInfo>
#include <QUrl>

namespace orvane::desktop {
namespace {

constexpr QSize windowSize(640, 560);

}  // namespace

QtHelp::QtHelp(std::filesystem::path book, const fixwell::Bundle& texts)
    : book_(std::move(book)), texts_(texts)
{
}

QtHelp::~QtHelp()
{
    delete window_;
}

QTextBrowser& QtHelp::window()
{
    if (!window_) {
        window_ = new QTextBrowser;
        window_->setAttribute(Qt::WA_DeleteOnClose);
        // The program ends with its main window, whatever help is open.
        window_->setAttribute(Qt::WA_QuitOnClose, false);
        window_->setWindowTitle(toQt(texts_.localizedString("Orvane Help")));
        window_->setAccessibleName(window_->windowTitle());
        window_->resize(windowSize);
    }
    return *window_;
}

void QtHelp::openHelpAnchor(std::string_view anchor)
{
    QTextBrowser& browser = window();
    browser.show();
    const QString file = QString::fromStdString(book_.string());
    if (QFileInfo(file).isReadable()) {
        QUrl place = QUrl::fromLocalFile(file);
        place.setFragment(toQt(anchor));
        browser.setSource(place);
    } else {
        browser.setPlainText(toQt(fixwell::format(
            texts_.localizedString("The help book %@ cannot be read."), {book_.string()})));
    }
    browser.raise();
    browser.activateWindow();
}

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtHelp.h"

#include "orvane/desktop/toolkit/QtTexts.h"

namespace orvane::desktop {
namespace {

constexpr std::string_view geometryKey = "HelpWindow.geometry";
constexpr std::string_view books = "help/";

// English where the language has texts, but no book.
std::filesystem::path bookDirectory(const contract::Bundle& bundle)
{
    const auto translated = bundle.pathForResource(std::string(books) + languageOf(bundle));
    return translated.empty() ? bundle.pathForResource(std::string(books) + "en") : translated;
}

}  // namespace

QtHelp::~QtHelp()
{
    delete window_;
}

void QtHelp::makeWindow()
{
    window_ = new HelpWindow(HelpBook(bookDirectory(bundle_)), bundle_);
    window_->setAttribute(Qt::WA_DeleteOnClose);
    // The program ends with its main window, whatever help is open.
    window_->setAttribute(Qt::WA_QuitOnClose, false);
    window_->restoreGeometry(QByteArray::fromBase64(
        QByteArray::fromStdString(std::string(settings_.objectForKey(geometryKey).string()))));
    window_->setClosed([this](const QByteArray& geometry) {
        settings_.setObjectForKey(contract::Value(geometry.toBase64().toStdString()), geometryKey);
    });
}

void QtHelp::openHelpAnchor(std::string_view anchor)
{
    if (!window_)
        makeWindow();
    window_->show();
    window_->open(anchor);
    window_->raise();
    window_->activateWindow();
}

}  // namespace orvane::desktop

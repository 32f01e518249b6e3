// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DesktopHost.h"

#include "orvane/desktop/toolkit/Text.h"

namespace orvane::desktop {

DesktopHost::DesktopHost(SupportOptions options, QtLoop& loop)
    : SupportHost(std::move(options), loop),
      alerts_([this](std::int32_t code) { return OVLocalizedErrorString(code); }),
      help_(hostBundle(), standardUserDefaults()),
      // What the user has seen is kept, whatever happens to the program.
      interface_([this] { histories().saveNew(); }, &hostBundle()),
      printing_(hostBundle(), [this] {
          alerts_.simpleModuleAlert(translator().text("The log could not be printed."), "", 0);
      })
{
    translateQt(hostBundle());
    // Every volume of an image is there when the attachment has returned.
    threads().setAttachesSynchronously(true);
}

void DesktopHost::setWindow(QWidget* window)
{
    alerts_.setWindow(window);
    printing_.setWindow(window);
}

void DesktopHost::showSheet(const std::string& title, const std::vector<std::string>& sentences)
{
    std::string text;
    for (const std::string& sentence : sentences)
        text += (text.empty() ? "" : "\n") + sentence;
    if (!text.empty())
        alerts_.simpleModuleAlert(title, text, 0);
}

}  // namespace orvane::desktop

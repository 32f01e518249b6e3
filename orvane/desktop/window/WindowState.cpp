// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/WindowState.h"

namespace orvane::desktop {
namespace {

constexpr std::string_view geometryKey = "MainWindow.geometry";
constexpr std::string_view splitterKey = "MainWindow.splitter";

QByteArray stored(const contract::UserDefaults& settings, std::string_view key)
{
    const contract::Value value = settings.objectForKey(key);
    return QByteArray::fromBase64(QByteArray::fromStdString(std::string(value.string())));
}

void store(contract::UserDefaults& settings, std::string_view key, const QByteArray& bytes)
{
    const std::string text = bytes.toBase64().toStdString();
    if (settings.objectForKey(key).string() != text)
        settings.setObjectForKey(contract::Value(text), key);
}

}  // namespace

void restoreWindow(MainWindow& window, const contract::UserDefaults& settings)
{
    window.restoreGeometry(stored(settings, geometryKey));
    window.splitter().restoreState(stored(settings, splitterKey));
}

void saveWindow(MainWindow& window, contract::UserDefaults& settings)
{
    store(settings, geometryKey, window.saveGeometry());
    store(settings, splitterKey, window.splitter().saveState());
}

}  // namespace orvane::desktop

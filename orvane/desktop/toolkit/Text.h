// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/foundation/StyledText.h"
#include "contract/support/OVPreferences.h"

#include <QByteArray>
#include <QString>

#include <string>
#include <string_view>

namespace orvane::desktop {

/// UTF-8 for Qt; what is no UTF-8 becomes U+FFFD. Nothing is interpreted: show it where the text
/// format is Qt::PlainText.
QString toQt(std::string_view text);
std::string fromQt(const QString& text);
/// One line of what stands on a disk, fit to be shown: without control characters.
QString toQtLine(std::string_view text);

/// A title for a button or menu, where Qt takes an ampersand for the mark of a shortcut.
QString toQtTitle(std::string_view title);

/// A tool tip. Qt guesses whether a tool tip is HTML, so this is HTML with everything escaped and
/// with its line ends kept; long lines are wrapped.
QString toQtToolTip(std::string_view text);

/// The text as a fragment of HTML, everything escaped: bold, colour and size (in points,
/// multiplied by `fontScale`) of each run, and one paragraph for each line.
std::string html(const contract::StyledText& text, double fontScale = 1);

/// Bytes that are kept in the settings as text, such as a window's geometry; empty when there are
/// none. Written only where they differ.
[[nodiscard]] QByteArray storedBytes(const contract::UserDefaults& settings, std::string_view key);
void storeBytes(contract::UserDefaults& settings, std::string_view key, const QByteArray& bytes);

/// The language of the bundle's texts as a code ("de"); "en" where they are not translated. It is
/// the translation of "en".
[[nodiscard]] std::string languageOf(const contract::Bundle& bundle);

/// Qt's own texts, as in the dialogs for files and printing, come in the bundle's language from
/// now on, where Qt's translations are installed. Main thread, with the application object there.
void translateQt(const contract::Bundle& bundle);

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"

#include <string>

namespace orvane::desktop {

/// The language of the bundle's texts as a code ("de"); "en" where they are not translated. It is
/// the translation of "en".
[[nodiscard]] std::string languageOf(const contract::Bundle& bundle);

/// Qt's own texts, as in the dialogs for files and printing, come in the bundle's language from
/// now on, where Qt's translations are installed. Main thread, with the application object there.
void translateQt(const contract::Bundle& bundle);

}  // namespace orvane::desktop

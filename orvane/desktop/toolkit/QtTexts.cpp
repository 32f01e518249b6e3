// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtTexts.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QCoreApplication>
#include <QLibraryInfo>
#include <QLocale>
#include <QTranslator>

namespace orvane::desktop {

std::string languageOf(const contract::Bundle& bundle)
{
    return bundle.localizedString("en");
}

void translateQt(const contract::Bundle& bundle)
{
    const std::string language = languageOf(bundle);
    if (language == "en")
        return;
    auto translator = std::make_unique<QTranslator>();
    if (!translator->load(QLocale(toQt(language)), QStringLiteral("qtbase"), QStringLiteral("_"),
                          QLibraryInfo::path(QLibraryInfo::TranslationsPath)))
        return;
    translator->setParent(QCoreApplication::instance());
    QCoreApplication::installTranslator(translator.release());
}

}  // namespace orvane::desktop

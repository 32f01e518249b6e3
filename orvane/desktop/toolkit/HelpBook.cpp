// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/HelpBook.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QFile>
#include <QRegularExpression>
#include <QTextDocument>

namespace orvane::desktop {
namespace {

QString readPage(const QString& page)
{
    QFile file(page);
    return !page.isEmpty() && file.open(QIODevice::ReadOnly) ? QString::fromUtf8(file.readAll())
                                                             : QString();
}

}  // namespace

QString HelpBook::page(const QString& name) const
{
    // Without a directory, the name would be looked for wherever the program was started.
    return directory_.empty() ? QString() : QFile::decodeName((directory_ / fromQt(name)).c_str());
}

QString HelpBook::pageWith(std::string_view anchor) const
{
    if (!anchor.empty()) {
        const QString mark = QStringLiteral("<a name=\"%1\">").arg(toQt(anchor));
        for (const QString& candidate : pages())
            if (readPage(candidate).contains(mark))
                return candidate;
    }
    return contents();
}

QStringList HelpBook::pages() const
{
    const QString text = readPage(contents());
    if (text.isEmpty())
        return {};
    QStringList found{contents()};
    static const QRegularExpression link(QStringLiteral("<li><a href=\"([a-z]+\\.html)\">"));
    for (const QRegularExpressionMatch& match : link.globalMatch(text))
        found += page(match.captured(1));
    return found;
}

QString HelpBook::plainText(const QString& page)
{
    QTextDocument document;
    document.setHtml(readPage(page));
    return document.toPlainText();
}

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/PropertiesDialog.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/ElidedLabel.h"

#include <QApplication>
#include <QClipboard>
#include <QDialogButtonBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QPushButton>
#include <QTextEdit>
#include <QTextTable>
#include <QVBoxLayout>

namespace orvane::desktop {
namespace {

constexpr int iconSide = 32;  // pixels
constexpr int widthInCharacters = 76;
constexpr int heightInLines = 24;
constexpr double padding = 3;  // pixels, in a cell

/// As a table: one can select across the facts. All texts go in as text, none as HTML.
void fill(QTextDocument& document, const std::vector<DiskProperty>& properties,
          const QPalette& palette)
{
    QTextTableFormat format;
    format.setBorder(0);
    format.setCellPadding(padding);
    format.setCellSpacing(0);
    format.setColumnWidthConstraints({QTextLength(QTextLength::PercentageLength, 26),
                                      QTextLength(QTextLength::PercentageLength, 74)});
    QTextCursor cursor(&document);
    QTextTable* const table = cursor.insertTable(static_cast<int>(properties.size()), 2, format);
    QTextCharFormat quiet;
    quiet.setForeground(palette.color(QPalette::PlaceholderText));
    for (int row = 0; row < table->rows(); ++row) {
        const DiskProperty& property = properties[static_cast<std::size_t>(row)];
        table->cellAt(row, 0).firstCursorPosition().insertText(property.name, quiet);
        table->cellAt(row, 1).firstCursorPosition().insertText(property.value);
    }
}

QTextEdit* makeText(const ShownProperties& shown, const QString& name, QWidget* parent)
{
    auto* const text = new QTextEdit(parent);
    text->setObjectName(QStringLiteral("diskProperties"));
    text->setAccessibleName(name);
    text->setReadOnly(true);
    text->setTabChangesFocus(true);
    text->setTextInteractionFlags(Qt::TextSelectableByMouse | Qt::TextSelectableByKeyboard);
    text->setWordWrapMode(QTextOption::WrapAtWordBoundaryOrAnywhere);
    fill(*text->document(), shown.properties, text->palette());
    // Into the table: what lies before it is an empty line.
    text->moveCursor(QTextCursor::Start);
    text->moveCursor(QTextCursor::NextBlock);
    return text;
}

}  // namespace

QDialog* showProperties(QWidget& window, const ShownProperties& shown, const Translator& texts)
{
    auto* const dialog = new QDialog(&window);
    dialog->setObjectName(QStringLiteral("propertiesDialog"));
    dialog->setAttribute(Qt::WA_DeleteOnClose);
    dialog->setWindowTitle(toQt(texts.sentence("Properties of “%@”", {fromQt(shown.disk)})));

    auto* const icon = new QLabel(dialog);
    icon->setPixmap(shown.icon.pixmap(iconSide));
    auto* const title = new ElidedLabel(dialog);
    QFont large = title->font();
    large.setBold(true);
    large.setPointSizeF(large.pointSizeF() * 1.2);
    title->setFont(large);
    title->setFullText(shown.disk);
    auto* const head = new QHBoxLayout;
    head->addWidget(icon);
    head->addWidget(title, 1);

    QTextEdit* const text = makeText(shown, dialog->windowTitle(), dialog);
    auto* const buttons = new QDialogButtonBox(dialog);
    auto* const copy =
        buttons->addButton(toQtTitle(texts.text("Copy")), QDialogButtonBox::ActionRole);
    copy->setObjectName(QStringLiteral("copyProperties"));
    copy->setAutoDefault(false);
    auto* const close =
        buttons->addButton(toQtTitle(texts.text("Close")), QDialogButtonBox::RejectRole);
    close->setDefault(true);
    QObject::connect(copy, &QPushButton::clicked, dialog, [whole = plainText(shown.properties)] {
        QApplication::clipboard()->setText(whole);
    });
    QObject::connect(buttons, &QDialogButtonBox::rejected, dialog, &QDialog::close);

    auto* const rows = new QVBoxLayout(dialog);
    rows->addLayout(head);
    rows->addWidget(text, 1);
    rows->addWidget(buttons);
    const QFontMetrics metrics = dialog->fontMetrics();
    dialog->resize(
        QSize(metrics.averageCharWidth() * widthInCharacters, metrics.height() * heightInLines));
    dialog->show();
    return dialog;
}

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/InterfaceFile.h"

#include "orvane/desktop/toolkit/LogTable.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QAbstractButton>
#include <QFile>
#include <QLabel>
#include <QUiLoader>

namespace orvane::desktop {
namespace {

class Loader final : public QUiLoader {
public:
    QWidget* createWidget(const QString& className, QWidget* parent, const QString& name) override
    {
        if (availableWidgets().contains(className))
            return QUiLoader::createWidget(className, parent, name);
        auto* const table = new LogTable(parent);
        table->setObjectName(name);
        table->setProperty(viewClassProperty, className);
        return table;
    }
};

QString translated(const QString& text, const contract::Bundle& texts)
{
    return text.isEmpty() ? text : toQt(texts.localizedString(fromQt(text)));
}

void translate(QWidget& widget, const contract::Bundle& texts)
{
    if (auto* const button = qobject_cast<QAbstractButton*>(&widget)) {
        const QKeySequence shortcut = button->shortcut();
        button->setText(translated(button->text(), texts));
        if (!button->text().contains(u'&'))
            button->setShortcut(shortcut);
    } else if (auto* const label = qobject_cast<QLabel*>(&widget)) {
        label->setText(translated(label->text(), texts));
    }
    for (const char* const name : {emptyNoteProperty, problemProperty, successProperty})
        if (const QVariant text = widget.property(name); text.isValid())
            widget.setProperty(name, translated(text.toString(), texts));
    // The tool tip becomes HTML, which must not be read out.
    if (widget.accessibleDescription().isEmpty())
        widget.setAccessibleDescription(widget.toolTip());
    widget.setToolTip(toQtToolTip(fromQt(translated(widget.toolTip(), texts))));
    widget.setAccessibleName(translated(widget.accessibleName(), texts));
    widget.setAccessibleDescription(translated(widget.accessibleDescription(), texts));
}

}  // namespace

std::unique_ptr<QWidget> loadInterfaceFile(const std::filesystem::path& file,
                                           const contract::Bundle& texts, QString& error)
{
    QFile contents(QString::fromStdString(file.string()));
    if (!contents.open(QIODevice::ReadOnly)) {
        error = contents.errorString();
        return nullptr;
    }
    Loader loader;
    loader.setLanguageChangeEnabled(false);
    std::unique_ptr<QWidget> root(loader.load(&contents));
    if (!root) {
        error = loader.errorString();
        return nullptr;
    }
    translate(*root, texts);
    for (QWidget* widget : root->findChildren<QWidget*>())
        translate(*widget, texts);
    return root;
}

}  // namespace orvane::desktop

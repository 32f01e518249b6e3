// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtInterface.h"

#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/toolkit/FittingLayout.h"
#include "orvane/desktop/toolkit/LogTable.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QAbstractButton>
#include <QBoxLayout>
#include <QEvent>
#include <QFile>
#include <QGridLayout>
#include <QLabel>
#include <QScrollArea>
#include <QSplitter>
#include <QUiLoader>

#include <algorithm>
#include <filesystem>
#include <variant>

namespace orvane::desktop {
namespace {

// Dynamic properties of the widgets of an interface file.
constexpr const char* actionProperty = "action";        // of buttons, in the file
constexpr const char* emptyNoteProperty = "emptyNote";  // of a LogTable, in the file
constexpr const char* problemProperty = "problemWord";  // likewise: spoken for a red row
constexpr const char* successProperty = "successWord";  // likewise: for a green one
constexpr const char* viewClassProperty = "viewClass";  // of a LogTable, set by the loader

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

/// Makes the widgets of a file of Qt Designer, with their texts as the bundle translates them. A
/// custom widget class of a name that Qt does not know becomes a LogTable. None when the file
/// cannot be read; then `error` says why.
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

QGridLayout* gridOf(const QWidget& page, QWidget& widget)
{
    for (QGridLayout* const grid : page.findChildren<QGridLayout*>())
        if (grid->indexOf(&widget) >= 0)
            return grid;
    return nullptr;
}

}  // namespace

LoadedInterface::LoadedInterface(std::unique_ptr<QWidget> root, contract::InterfaceOwner& owner,
                                 const std::function<void()>& beforeRows,
                                 const contract::Bundle* hostTexts)
    : root_(root.release()), owner_(&owner), beforeRows_(beforeRows), hostTexts_(hostTexts)
{
    adoptButtons();
    for (const contract::Outlet& outlet : owner.outlets())
        fill(outlet);
    limitSplitView();
    fitButtons();
}

LoadedInterface::~LoadedInterface()
{
    disconnect();
    buttons_.clear();
    texts_.clear();
    peer_.reset();
    delete root_;
}

void LoadedInterface::adoptButtons()
{
    for (QAbstractButton* widget : root_->findChildren<QAbstractButton*>()) {
        auto button = std::make_unique<QtButton>(*widget, [this](QtButton& sender) {
            const bool mayPerform = !mayPerform_ || mayPerform_(sender.action());
            if (owner_ != nullptr && mayPerform)
                owner_->perform(sender.action(), &sender);
        });
        const std::string action = fromQt(widget->property(actionProperty).toString());
        button->setAction(action);
        buttons_.emplace(fromQt(widget->objectName()), std::move(button));
    }
}

template <class Control, class Widget, class Outlet>
void LoadedInterface::fillText(Outlet** place, std::string_view name)
{
    auto* const widget = root_->findChild<Widget*>(toQt(name));
    if (widget == nullptr)
        return;
    auto control = std::make_unique<Control>(*widget);
    *place = control.get();
    texts_.push_back(std::move(control));
}

void LoadedInterface::fill(const contract::Outlet& outlet)
{
    if (auto* const buttonPlace = std::get_if<contract::Button**>(&outlet.place)) {
        if (QtButton* const found = button(outlet.name))
            **buttonPlace = found;
    } else if (auto* const fieldPlace = std::get_if<contract::TextField**>(&outlet.place)) {
        fillText<QtTextField, QLabel>(*fieldPlace, outlet.name);
    } else if (auto* const viewPlace = std::get_if<contract::TextView**>(&outlet.place)) {
        fillText<QtTextView, QPlainTextEdit>(*viewPlace, outlet.name);
    } else if (auto* const table =
                   dynamic_cast<LogTable*>(root_->findChild<QTableView*>(toQt(outlet.name)))) {
        makeOutlineView(std::get<contract::OutlineView**>(outlet.place), *table);
    }
}

void LoadedInterface::makeOutlineView(contract::OutlineView** place, LogTable& table)
{
    peer_ = std::make_unique<OutlinePeer>(table, beforeRows_);
    outlineView_ =
        owner_->makeOutlineView(fromQt(table.property(viewClassProperty).toString()), *peer_);
    if (!outlineView_)
        return;
    *place = outlineView_.get();
    outlineView_->setDataSource(owner_->outlineViewDelegate());
    peer_->setView(outlineView_.get());
    const auto word = [&table](const char* property) {
        return table.property(property).toString();
    };
    const auto hostWord = [this](std::string_view key) {
        return hostTexts_ != nullptr ? toQt(hostTexts_->localizedString(key)) : toQt(key);
    };
    static_cast<LogModel*>(table.model())
        ->setSpokenTypes({word(problemProperty), word(successProperty), hostWord("expanded"),
                          hostWord("collapsed")});
    if (hostTexts_ != nullptr)
        addHostControls(table);
    if (const QString note = word(emptyNoteProperty); !note.isEmpty())
        emptyNote_ = new EmptyNote(table, note);
}

// The search above the log, and the switch beside that for the details, where there is one.
void LoadedInterface::addHostControls(LogTable& table)
{
    const auto layoutOf = [](QWidget& widget) -> QBoxLayout* {
        QWidget* const parent = widget.parentWidget();
        if (parent == nullptr || parent->layout() == nullptr)
            return nullptr;
        for (QBoxLayout* const layout : parent->findChildren<QBoxLayout*>())
            if (layout->indexOf(&widget) >= 0)
                return layout;
        return nullptr;
    };
    QBoxLayout* const rows = layoutOf(table);
    if (rows == nullptr)
        return;
    search_ = new LogSearch(*peer_, *hostTexts_, table.parentWidget());
    rows->insertWidget(rows->indexOf(&table), search_);
    QWidget* const details = root_->findChild<QWidget*>(toQt(contract::outlet::showDetails));
    QBoxLayout* const head = details != nullptr ? layoutOf(*details) : nullptr;
    QCheckBox* const toggle = makeProblemsToggle(*peer_, *hostTexts_, table.parentWidget());
    if (head != nullptr)
        head->insertWidget(head->indexOf(details) + 1, toggle);
    else
        rows->insertWidget(rows->indexOf(search_), toggle);
}

// The divider stands below the first pane: its limits are the pane's.
void LoadedInterface::limitSplitView()
{
    auto* const splitter = root_->findChild<QSplitter*>();
    contract::SplitViewDelegate* const delegate = owner_->splitViewDelegate();
    if (splitter == nullptr || splitter->count() < 2 || delegate == nullptr)
        return;
    const double proposed = splitter->sizes().front();
    const int least =
        static_cast<int>(delegate->splitViewConstrainMinCoordinateOfSubviewAt(proposed, 0));
    const int most =
        static_cast<int>(delegate->splitViewConstrainMaxCoordinateOfSubviewAt(proposed, 0));
    splitter->setChildrenCollapsible(false);
    QWidget& pane = *splitter->widget(0);
    if (splitter->orientation() == Qt::Vertical) {
        pane.setMinimumHeight(least);
        pane.setMaximumHeight(most);
        if (auto* const text = pane.findChild<QScrollArea*>())
            new FittingPane(*splitter, *text);
    } else {
        pane.setMinimumWidth(least);
        pane.setMaximumWidth(most);
    }
}

void LoadedInterface::fitButtons()
{
    std::vector<QWidget*> actions;
    for (const std::string_view name : contract::outlet::actions)
        if (auto* const button = root_->findChild<QWidget*>(toQt(name)))
            actions.push_back(button);
    QGridLayout* const grid = actions.size() > 1 ? gridOf(*root_, *actions.front()) : nullptr;
    if (grid == nullptr)
        return;
    QWidget* beside = nullptr;
    for (int i = 0; i < grid->count(); ++i)
        if (QWidget* const other = grid->itemAt(i)->widget();
            std::ranges::count(actions, other) == 0)
            beside = other;
    new FittingButtons(*root_, *grid, std::move(actions), beside);
}

void LoadedInterface::setCompact(bool isCompact)
{
    auto* const splitter = root_->findChild<QSplitter*>();
    if (splitter != nullptr && splitter->count() > 1)
        splitter->widget(0)->setVisible(!isCompact);
}

QtButton* LoadedInterface::button(std::string_view name)
{
    const auto found = buttons_.find(name);
    return found == buttons_.end() ? nullptr : found->second.get();
}

QtButton* LoadedInterface::stopButton()
{
    const auto found = std::ranges::find_if(buttons_, [](const auto& named) {
        return named.second->action() == contract::selector::stop && named.second->isEnabled();
    });
    return found == buttons_.end() ? nullptr : found->second.get();
}

void LoadedInterface::disconnect()
{
    owner_ = nullptr;
    if (peer_)
        peer_->setView(nullptr);
    outlineView_.reset();
}

bool QtInterface::loadInterface(std::string_view name, contract::InterfaceOwner& owner)
{
    QString error;
    std::unique_ptr<QWidget> root;
    if (bundle_ != nullptr)
        root =
            loadInterfaceFile(bundle_->pathForResource(std::string(name) + ".ui"), *bundle_, error);
    const bool isLoaded = root != nullptr;
    if (isLoaded)
        loaded_.push_back(
            std::make_unique<LoadedInterface>(std::move(root), owner, beforeRows_, hostTexts_));
    else
        qWarning("cannot load the interface %s: %s", std::string(name).c_str(),
                 qPrintable(error.isEmpty() ? QStringLiteral("no such file") : error));
    owner.awakeFromNib();
    return isLoaded;
}

void QtInterface::disconnect(contract::InterfaceOwner& owner)
{
    for (const auto& loaded : loaded_)
        if (loaded->belongsTo(owner))
            loaded->disconnect();
}

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtInterface.h"

#include "orvane/desktop/toolkit/FittingPane.h"
#include "orvane/desktop/toolkit/InterfaceFile.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QSplitter>

#include <variant>

namespace orvane::desktop {

LoadedInterface::LoadedInterface(std::unique_ptr<QWidget> root, contract::InterfaceOwner& owner,
                                 const std::function<void()>& beforeRows)
    : root_(root.release()), owner_(&owner), beforeRows_(beforeRows)
{
    adoptButtons();
    for (const contract::Outlet& outlet : owner.outlets())
        fill(outlet);
    limitSplitView();
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
            if (beforeAction_)
                beforeAction_(sender.action());
            if (owner_ != nullptr)
                owner_->perform(sender.action(), &sender);
        });
        const std::string action = fromQt(widget->property(actionProperty).toString());
        button->setAction(action);
        buttons_.emplace(fromQt(widget->objectName()), std::move(button));
    }
}

template <class Widget>
Widget* LoadedInterface::find(std::string_view name)
{
    return root_->findChild<Widget*>(toQt(name));
}

void LoadedInterface::fill(const contract::Outlet& outlet)
{
    if (auto* const buttonPlace = std::get_if<contract::Button**>(&outlet.place)) {
        if (QtButton* const found = button(outlet.name))
            **buttonPlace = found;
    } else if (auto* const fieldPlace = std::get_if<contract::TextField**>(&outlet.place)) {
        if (auto* const label = find<QLabel>(outlet.name)) {
            auto field = std::make_unique<QtTextField>(*label);
            **fieldPlace = field.get();
            texts_.push_back(std::move(field));
        }
    } else if (auto* const viewPlace = std::get_if<contract::TextView**>(&outlet.place)) {
        if (auto* const edit = find<QPlainTextEdit>(outlet.name)) {
            auto view = std::make_unique<QtTextView>(*edit);
            **viewPlace = view.get();
            texts_.push_back(std::move(view));
        }
    } else if (auto* const tree = dynamic_cast<LogTable*>(find<QTableView>(outlet.name))) {
        makeOutlineView(std::get<contract::OutlineView**>(outlet.place), *tree);
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
    static_cast<LogModel*>(table.model())
        ->setSpokenTypes({word(problemProperty), word(successProperty)});
    if (const QString note = word(emptyNoteProperty); !note.isEmpty())
        emptyNote_ = new EmptyNote(table, note);
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

QtButton* LoadedInterface::button(std::string_view name)
{
    const auto found = buttons_.find(name);
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
        loaded_.push_back(std::make_unique<LoadedInterface>(std::move(root), owner, beforeRows_));
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

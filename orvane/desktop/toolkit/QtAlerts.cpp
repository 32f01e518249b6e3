// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtAlerts.h"

#include "orvane/desktop/toolkit/QtControls.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QApplication>
#include <QLabel>
#include <QMessageBox>
#include <QMetaObject>
#include <QPushButton>

#include <utility>

namespace orvane::desktop {
namespace {

QMessageBox* makeBox(QWidget* window, const std::string& message, const std::string& informative)
{
    auto* const box = new QMessageBox(window);
    box->setIcon(QMessageBox::Warning);
    box->setWindowTitle(QApplication::applicationDisplayName());
    box->setText(toQt(message));
    box->setInformativeText(toQt(informative));
    // The box's own text format is not that of the informative text, and both hold disk labels.
    for (QLabel* label : box->findChildren<QLabel*>())
        label->setTextFormat(Qt::PlainText);
    return box;
}

}  // namespace

class QtAlerts::Sheet final : public contract::Alert, public std::enable_shared_from_this<Sheet> {
public:
    Sheet(QWidget* window, const Text& text)
        : box_(makeBox(window, text.message, text.informative)),
          default_(*box_->addButton(toQtTitle(text.defaultButton), QMessageBox::AcceptRole),
                   [](QtButton&) {})
    {
        default_.setKeyEquivalent("\r");
        box_->setEscapeButton(&default_.widget());
        if (text.alternateButton.empty())
            return;
        alternate_ = std::make_unique<QtButton>(
            *box_->addButton(toQtTitle(text.alternateButton), QMessageBox::RejectRole),
            [](QtButton&) {});
        alternate_->setKeyEquivalent("");
        box_->setEscapeButton(&alternate_->widget());
    }

    ~Sheet() override
    {
        if (box_)
            box_->deleteLater();
    }

    std::vector<contract::Button*> buttons() override
    {
        std::vector<contract::Button*> all{&default_};
        if (alternate_)
            all.push_back(alternate_.get());
        return all;
    }

    void beginSheetModalForWindow(contract::Window* /*window*/,
                                  std::function<void(Alert&, long)> end) override
    {
        for (QtButton* button : {&default_, alternate_.get()})
            if (button != nullptr && button->isDefault())
                box_->setDefaultButton(qobject_cast<QPushButton*>(&button->widget()));
        end_ = std::move(end);
        QObject::connect(box_, &QDialog::finished, box_,
                         [self = shared_from_this()] { self->finish(); });
        box_->open();
    }

    void orderOut() override
    {
        if (box_)
            box_->hide();
    }

private:
    // The answer is told when the box's own functions have returned: it may be the end of this
    // object, and with it of the box.
    void finish()
    {
        if (!end_)
            return;
        QMetaObject::invokeMethod(
            qApp,
            [self = shared_from_this(), end = std::exchange(end_, nullptr), tag = pressedTag()] {
                end(*self, tag);
            },
            Qt::QueuedConnection);
        box_->disconnect(box_);
    }

    long pressedTag() const
    {
        const bool isEscaped = box_->clickedButton() == nullptr;
        const QAbstractButton* const pressed =
            isEscaped ? box_->escapeButton() : box_->clickedButton();
        const bool isAlternate = alternate_ && pressed == &alternate_->widget();
        return static_cast<long>(isAlternate ? alternate_->tag() : default_.tag());
    }

    QPointer<QMessageBox> box_;
    QtButton default_;
    std::unique_ptr<QtButton> alternate_;
    std::function<void(Alert&, long)> end_;
};

std::shared_ptr<contract::Alert> QtAlerts::makeAlert(const contract::Alert::Text& text)
{
    return std::make_shared<Sheet>(window_, text);
}

void QtAlerts::simpleModuleAlert(const std::string& title, const std::string& message,
                                 std::int32_t error)
{
    if (isWithheld_ && isWithheld_())
        return;
    std::string informative = title.empty() ? std::string() : message;
    if (error != 0 && errorText_)
        informative += (informative.empty() ? "" : "\n\n") + errorText_(error);
    QMessageBox* const box = makeBox(window_, title.empty() ? message : title, informative);
    box->setAttribute(Qt::WA_DeleteOnClose);
    box->addButton(QMessageBox::Ok);
    box->open();
}

}  // namespace orvane::desktop

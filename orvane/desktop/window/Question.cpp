// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/Question.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QApplication>
#include <QLabel>
#include <QPushButton>

namespace orvane::desktop {
namespace {

constexpr int widthInCharacters = 60;

}  // namespace

QMessageBox* ask(QWidget& window, const Question& question)
{
    auto* const box = new QMessageBox(QMessageBox::Warning, QApplication::applicationDisplayName(),
                                      toQt(question.text), QMessageBox::NoButton, &window);
    box->setObjectName(QLatin1String(question.objectName));
    box->setInformativeText(toQt(question.details));
    // The box's own text format is not that of the informative text, and both hold disk labels.
    for (QLabel* label : box->findChildren<QLabel*>()) {
        label->setTextFormat(Qt::PlainText);
        // Else a short question above it makes a long text narrow and high.
        if (label->text() == box->informativeText())
            label->setMinimumWidth(label->fontMetrics().averageCharWidth() * widthInCharacters);
    }
    box->setWindowModality(Qt::WindowModal);
    box->setAttribute(Qt::WA_DeleteOnClose);
    for (const Question::Answer& answer : question.answers) {
        QPushButton* const button =
            box->addButton(toQtTitle(answer.title), QMessageBox::DestructiveRole);
        // Another sheet may follow, or a job begin.
        QObject::connect(button, &QPushButton::clicked, &window, answer.chosen,
                         Qt::QueuedConnection);
    }
    QPushButton* const decline =
        box->addButton(toQtTitle(question.decline), QMessageBox::RejectRole);
    box->setDefaultButton(decline);
    box->setEscapeButton(decline);
    box->open();
    return box;
}

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/Question.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QApplication>
#include <QLabel>
#include <QPushButton>

namespace orvane::desktop {
namespace {

constexpr int widthInCharacters = 60;

/// The title with a letter of its own, by which the keyboard reaches the answer at once; `taken`
/// are the others'. Without one where there is none left.
QString withLetter(const std::string& title, QString& taken)
{
    const QString text = toQtLine(title);
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar letter = text[i].toLower();
        if (!letter.isLetter() || taken.contains(letter))
            continue;
        taken += letter;
        return toQtTitle(fromQt(text.first(i))) + u'&' + toQtTitle(fromQt(text.sliced(i)));
    }
    return toQtTitle(title);
}

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
    QString letters;
    for (const Question::Answer& answer : question.answers) {
        QPushButton* const button =
            box->addButton(withLetter(answer.title, letters), QMessageBox::DestructiveRole);
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

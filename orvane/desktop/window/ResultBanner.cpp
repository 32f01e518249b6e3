// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/ResultBanner.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/Symbols.h"
#include "orvane/desktop/window/WindowColors.h"

#include <QEvent>
#include <QPainter>
#include <QStyle>
#include <QVBoxLayout>

#include <algorithm>
#include <array>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr int spacing = 8;      // pixels
constexpr int stripeWidth = 4;  // pixels
constexpr std::size_t mostLinks = 12;

struct StepTitle {
    NextStep step;
    std::string_view title;
    Symbol symbol;
};

constexpr std::array stepTitles{
    StepTitle{NextStep::Repair, "Repair…", Symbol::Repair},
    StepTitle{NextStep::Preview, "Preview Repair", Symbol::Preview},
    StepTitle{NextStep::Undo, "Undo Repair…", Symbol::Undo},
    StepTitle{NextStep::UndoPermissions, "Undo Repair…", Symbol::Undo},
    StepTitle{NextStep::Finish, "Finish Repair…", Symbol::Finish},
    StepTitle{NextStep::ApplyUnproven, "Apply Anyway…", Symbol::Repair},
    StepTitle{NextStep::RepairDirectly, "Repair Directly…", Symbol::Repair},
    StepTitle{NextStep::ShowProblems, "Show Findings", Symbol::Search},
    StepTitle{NextStep::CopyDisk, "Copy the Disk First…", Symbol::Copy},
    StepTitle{NextStep::Reopen, "Reopen", Symbol::Open}};

/// The sign that says the same as the tone's colour.
std::string_view verdictLike(Tone tone)
{
    switch (tone) {
        case Tone::Good: return contract::kPLVerdictSound.text();
        case Tone::Bad: return contract::kPLVerdictDamaged.text();
        case Tone::Neutral:
        case Tone::Caution: break;
    }
    return "";
}

}  // namespace

ResultBanner::ResultBanner(const Translator& texts, QWidget* parent)
    : QWidget(parent),
      texts_(texts),
      icon_(new QLabel(this)),
      title_(new QLabel(this)),
      details_(new QLabel(this)),
      buttons_(new QHBoxLayout),
      close_(new QPushButton(this))
{
    setObjectName(QStringLiteral("resultBanner"));
    title_->setObjectName(QStringLiteral("resultTitle"));
    details_->setObjectName(QStringLiteral("resultDetails"));
    title_->setTextFormat(Qt::PlainText);
    for (QLabel* const label : {title_, details_}) {
        label->setWordWrap(true);
        label->setSizePolicy(QSizePolicy::Ignored, QSizePolicy::Minimum);
    }
    title_->setTextInteractionFlags(Qt::TextSelectableByMouse);
    connect(details_, &QLabel::linkActivated, this, [this](const QString& link) {
        if (events_.diskChosen)
            events_.diskChosen(fromQt(link));
    });
    close_->setFlat(true);
    close_->setIcon(symbol(Symbol::Close));
    close_->setAccessibleName(toQt(texts.text("Close the message")));
    close_->setToolTip(toQt(texts.text("Close the message")));
    connect(close_, &QPushButton::clicked, this, &QWidget::hide);

    buttons_->setSpacing(spacing);
    auto* const text = new QVBoxLayout;
    text->setSpacing(spacing / 2);
    text->addWidget(title_);
    text->addWidget(details_);
    text->addLayout(buttons_);
    auto* const layout = new QHBoxLayout(this);
    layout->setContentsMargins(2 * spacing, spacing, spacing, spacing);
    layout->setSpacing(spacing);
    layout->addWidget(icon_, 0, Qt::AlignTop);
    layout->addLayout(text, 1);
    layout->addWidget(close_, 0, Qt::AlignTop);
    hide();
}

void ResultBanner::show(const ResultSummary& summary)
{
    if (summary == shown_)
        return;
    shown_ = summary;
    fill();
    setVisible(!summary.title.empty());
}

void ResultBanner::setCompact(bool isCompact)
{
    if (std::exchange(isCompact_, isCompact) != isCompact)
        fill();
}

void ResultBanner::fill()
{
    title_->setText(toQt(shown_.title));
    details_->setTextFormat(shown_.disks.empty() ? Qt::PlainText : Qt::RichText);
    QString details = toQt(shown_.details);
    if (!shown_.disks.empty()) {
        QStringList links;
        for (std::size_t i = 0; i < shown_.disks.size() && i < mostLinks; ++i)
            links += QStringLiteral("<a href=\"%1\">%2</a>")
                         .arg(toQt(shown_.disks[i].identifier).toHtmlEscaped(),
                              toQt(shown_.disks[i].name).toHtmlEscaped());
        if (shown_.disks.size() > mostLinks)
            links += toQt(texts_.sentence("and %ld more",
                                          {static_cast<long>(shown_.disks.size() - mostLinks)}));
        details = links.join(QStringLiteral(", "));
    }
    details_->setText(details);
    // What nothing can be done with is no stop on the way of the Tab key.
    details_->setTextInteractionFlags(shown_.disks.empty() ? Qt::TextSelectableByMouse
                                                           : Qt::TextBrowserInteraction);
    details_->setVisible(!details.isEmpty() && (!isCompact_ || !shown_.disks.empty()));
    setAccessibleName(toQt(shown_.title));
    addButtons();
    adoptColors();
}

void ResultBanner::addButtons()
{
    while (QLayoutItem* const item = buttons_->takeAt(0)) {
        // Its press may have led here.
        if (QWidget* const button = item->widget()) {
            button->hide();
            button->deleteLater();
        }
        delete item;
    }
    // Where it stands, is where the Tab key comes to it.
    QWidget* before = details_;
    for (const NextStep step : shown_.steps) {
        const auto* const title = std::ranges::find(stepTitles, step, &StepTitle::step);
        auto* const button = new QPushButton(toQtTitle(texts_.text(title->title)), this);
        if (!isCompact_)
            button->setIcon(symbol(title->symbol));
        button->setObjectName(QStringLiteral("step%1").arg(static_cast<int>(step)));
        button->setAutoDefault(true);
        connect(button, &QPushButton::clicked, this, [this, step] {
            if (events_.stepChosen)
                events_.stepChosen(step);
        });
        buttons_->addWidget(button);
        setTabOrder(before, button);
        before = button;
    }
    setTabOrder(before, close_);
    buttons_->addStretch(1);
}

void ResultBanner::adoptColors()
{
    QFont bold = font();
    bold.setBold(true);
    title_->setFont(bold);
    const BannerColors colors = bannerColors(shown_.tone, palette());
    for (QLabel* const label : {title_, details_}) {
        QPalette own;
        own.setColor(QPalette::WindowText, colors.text);
        own.setColor(QPalette::Link, colors.link);
        label->setPalette(own);
    }
    const int side = fontMetrics().height();
    icon_->setPixmap(
        verdictIcon(verdictLike(shown_.tone)).pixmap(QSize(side, side), devicePixelRatioF()));
    icon_->setVisible(shown_.tone != Tone::Neutral);
    update();
}

void ResultBanner::changeEvent(QEvent* event)
{
    QWidget::changeEvent(event);
    if (event->type() == QEvent::PaletteChange || event->type() == QEvent::FontChange)
        adoptColors();
}

void ResultBanner::paintEvent(QPaintEvent* /*event*/)
{
    QPainter painter(this);
    const BannerColors colors = bannerColors(shown_.tone, palette());
    painter.fillRect(rect(), colors.ground);
    const QRect stripe(0, 0, stripeWidth, height());
    painter.fillRect(QStyle::visualRect(layoutDirection(), rect(), stripe), colors.stripe);
}

}  // namespace orvane::desktop

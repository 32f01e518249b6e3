// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/dialogs/AboutDialog.h"

#include "orvane/desktop/dialogs/SettingRows.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/ProgramStart.h"

#include <QApplication>
#include <QClipboard>
#include <QDialogButtonBox>
#include <QHeaderView>
#include <QIcon>

#include <system_error>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr int widthInCharacters = 70;
constexpr int iconSize = 8 * gridUnit;

}  // namespace

AboutDialog::AboutDialog(std::string toolPath, EventLoop& loop, const Translator& texts,
                         QWidget* parent)
    : QDialog(parent), texts_(texts), tools_(new QTableWidget(0, 3, this))
{
    setObjectName(QStringLiteral("aboutDialog"));
    setWindowTitle(text("About Orvane"));
    setAttribute(Qt::WA_DeleteOnClose);
    auto* const rows = new QVBoxLayout(this);
    rows->setContentsMargins(2 * gridUnit, 2 * gridUnit, 2 * gridUnit, 2 * gridUnit);
    rows->setSpacing(gridUnit);
    auto* const head = new QHBoxLayout;
    head->setSpacing(2 * gridUnit);
    auto* const icon = new QLabel(this);
    icon->setPixmap(QApplication::windowIcon().pixmap(iconSize));
    head->addWidget(icon, 0, Qt::AlignTop);
    QLabel* const words = makeNote(
        QStringLiteral("Orvane ") + toQt(programVersion()) + QLatin1Char('\n') +
            text("Checks whether the file systems on your disks are sound, and repairs them.") +
            QLatin1Char('\n') + text("Licence: Apache-2.0") + QStringLiteral(" · Qt ") +
            QLatin1String(qVersion()),
        this);
    words->setObjectName(QStringLiteral("aboutWords"));
    head->addWidget(words, 1);
    rows->addLayout(head);
    tools_->setHorizontalHeaderLabels({text("Checking tool"), text("Version"), text("Package")});
    tools_->setAccessibleName(text("Checking tools"));
    tools_->setEditTriggers(QAbstractItemView::NoEditTriggers);
    tools_->setSelectionMode(QAbstractItemView::NoSelection);
    tools_->verticalHeader()->hide();
    tools_->horizontalHeader()->setSectionResizeMode(QHeaderView::Stretch);
    // All of them are seen at once.
    const int height = tools_->fontMetrics().height() + gridUnit;
    tools_->verticalHeader()->setMinimumSectionSize(1);
    tools_->verticalHeader()->setDefaultSectionSize(height);
    tools_->setMinimumHeight(height * 9);
    rows->addWidget(tools_, 1);
    auto* const buttons = new QDialogButtonBox(this);
    buttons->addButton(text("Close"), QDialogButtonBox::RejectRole)->setDefault(true);
    QPushButton* const copies = buttons->addButton(text("Copy"), QDialogButtonBox::ActionRole);
    copies->setAutoDefault(false);
    connect(copies, &QPushButton::clicked, this, [this] { copy(); });
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    rows->addWidget(buttons);
    fitToTexts(*this, widthInCharacters);
    const auto ask = [toolPath = std::move(toolPath), &loop, about = liveness_, stop = stop_] {
        loop.post([about, tools = pellar::installedTools(toolPath, *stop)] {
            if (*about != nullptr)
                (*about)->show(tools);
        });
    };
    try {
        thread_ = std::jthread(ask);
    } catch (const std::system_error&) {
        ask();
    }
}

AboutDialog::~AboutDialog()
{
    *liveness_ = nullptr;
    stop_->press();
}

QString AboutDialog::text(std::string_view key) const
{
    return toQt(texts_.text(key));
}

void AboutDialog::show(const std::vector<pellar::InstalledTool>& tools)
{
    tools_->setRowCount(static_cast<int>(tools.size()));
    for (int row = 0; row < tools_->rowCount(); ++row) {
        const pellar::InstalledTool& tool = tools[static_cast<std::size_t>(row)];
        const QString version = !tool.isInstalled      ? text("not installed")
                                : tool.version.empty() ? text("unknown")
                                                       : toQtLine(tool.version);
        const QStringList cells{toQt(tool.name), version, toQt(tool.package)};
        for (int column = 0; column < cells.size(); ++column)
            tools_->setItem(row, column, new QTableWidgetItem(cells[column]));
    }
}

void AboutDialog::copy() const
{
    QString all = findChild<QLabel*>(QStringLiteral("aboutWords"))->text() + QLatin1Char('\n');
    for (int row = 0; row < tools_->rowCount(); ++row)
        all += tools_->item(row, 0)->text() + QLatin1Char(' ') + tools_->item(row, 1)->text() +
               QStringLiteral(" (") + tools_->item(row, 2)->text() + QStringLiteral(")\n");
    QApplication::clipboard()->setText(all);
}

}  // namespace orvane::desktop

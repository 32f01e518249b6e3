// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/MainWindow.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QApplication>
#include <QCloseEvent>
#include <QDropEvent>
#include <QFile>
#include <QMimeData>
#include <QTimer>
#include <QUrl>
#include <QVBoxLayout>

namespace orvane::desktop {
namespace {

constexpr QSize firstSize{1120, 720};

std::vector<std::filesystem::path> localFiles(const QMimeData* data)
{
    std::vector<std::filesystem::path> files;
    for (const QUrl& url : data->urls())
        if (url.isLocalFile())
            files.emplace_back(QFile::encodeName(url.toLocalFile()).toStdString());
    return files;
}

}  // namespace

MainWindow::MainWindow(const Translator& texts)
    : disks_(new DiskList(texts)),
      tabs_(new QTabWidget),
      splitter_(new QSplitter(Qt::Horizontal)),
      progress_(new ProgressArea(toQt(texts.text("Progress")), this))
{
    setObjectName(QStringLiteral("mainWindow"));
    setWindowTitle(QStringLiteral("Orvane"));
    setAcceptDrops(true);
    resize(firstSize);

    tabs_->setDocumentMode(true);
    tabs_->setAccessibleName(toQt(texts.text("What can be done")));
    splitter_->addWidget(disks_);
    splitter_->addWidget(tabs_);
    splitter_->setChildrenCollapsible(false);
    splitter_->setStretchFactor(0, 2);
    splitter_->setStretchFactor(1, 3);
    splitter_->setSizes({380, 740});

    auto* const content = new QWidget(this);
    auto* const layout = new QVBoxLayout(content);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addWidget(splitter_, 1);
    layout->addWidget(progress_);
    setCentralWidget(content);

    connect(tabs_, &QTabWidget::currentChanged, this, [this] { tellOfChange(); });
}

void MainWindow::tellOfChange()
{
    hadAttention_ = hasAttention();
    if (events_.changed)
        events_.changed();
}

bool MainWindow::hasAttention() const
{
    if (isMinimized())
        return false;
    // Who reads the help beside the window goes on working in the window.
    const QWidget* const active = QApplication::activeWindow();
    return active == nullptr || active == this || !active->isModal() ||
           (active->parentWidget() != nullptr && active->parentWidget()->window() == this);
}

// Which window is the active one is settled only when every window has heard of the change.
void MainWindow::changeEvent(QEvent* event)
{
    QMainWindow::changeEvent(event);
    if (event->type() == QEvent::ActivationChange || event->type() == QEvent::WindowStateChange)
        QTimer::singleShot(0, this, [this] {
            if (hasAttention() != hadAttention_)
                tellOfChange();
        });
}

void MainWindow::closeEvent(QCloseEvent* event)
{
    event->setAccepted(!events_.mayClose || events_.mayClose());
}

void MainWindow::dragEnterEvent(QDragEnterEvent* event)
{
    if (events_.canOpenFiles && events_.canOpenFiles() && !localFiles(event->mimeData()).empty())
        event->acceptProposedAction();
}

void MainWindow::dropEvent(QDropEvent* event)
{
    if (!events_.canOpenFiles || !events_.canOpenFiles())
        return;
    event->acceptProposedAction();
    events_.filesDropped(localFiles(event->mimeData()));
}

void MainWindow::paintEvent(QPaintEvent* event)
{
    QMainWindow::paintEvent(event);
    if (std::exchange(hasAppeared_, true))
        return;
    // Behind the rest of this painting, and behind its way to the screen.
    QTimer::singleShot(0, this, [this] {
        if (events_.appeared)
            events_.appeared();
    });
}

}  // namespace orvane::desktop

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/MainWindow.h"

#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QAbstractButton>
#include <QApplication>
#include <QCloseEvent>
#include <QDropEvent>
#include <QFile>
#include <QHBoxLayout>
#include <QMimeData>
#include <QTimer>
#include <QUrl>
#include <QVBoxLayout>

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

void keepRoomWhenHidden(QWidget& widget)
{
    QSizePolicy policy = widget.sizePolicy();
    policy.setRetainSizeWhenHidden(true);
    widget.setSizePolicy(policy);
    widget.hide();
}

constexpr QSize firstSize{1120, 720};

std::vector<std::filesystem::path> localFiles(const QMimeData* data)
{
    std::vector<std::filesystem::path> files;
    for (const QUrl& url : data->urls())
        if (url.isLocalFile())
            files.emplace_back(QFile::encodeName(url.toLocalFile()).toStdString());
    return files;
}

constexpr std::string_view geometryKey = "MainWindow.geometry";
constexpr std::string_view splitterKey = "MainWindow.splitter";

}  // namespace

ProgressArea::ProgressArea(const Translator& texts, QWidget* parent)
    : QWidget(parent),
      bar_(new QProgressBar(this)),
      label_(new ElidedLabel(this)),
      stopButton_(new QPushButton(toQtTitle(texts.text("Stop")), this))
{
    bar_->setObjectName(QStringLiteral("progressBar"));
    bar_->setAccessibleName(toQt(texts.text("Progress")));
    bar_->setTextVisible(false);
    label_->setObjectName(QStringLiteral("statusLine"));
    stopButton_->setObjectName(QStringLiteral("stopButton"));
    connect(stopButton_, &QPushButton::clicked, this, [this] { stop_(); });

    auto* const layout = new QHBoxLayout(this);
    layout->setContentsMargins(16, 4, 16, 4);
    layout->setSpacing(12);
    layout->addWidget(label_, 3);
    layout->addWidget(bar_, 2);
    layout->addWidget(stopButton_);
    stopButton_->hide();
    setMinimumHeight(layout->contentsMargins().top() + stopButton_->sizeHint().height() +
                     layout->contentsMargins().bottom());
    keepRoomWhenHidden(*bar_);
    keepRoomWhenHidden(*label_);
    hide();
}

void ProgressArea::adoptUse()
{
    setVisible(isBarActive_ || isTextActive_ || stop_);
}

void ProgressArea::setBarActive(bool isActive)
{
    isBarActive_ = isActive;
    bar_->setVisible(isActive);
    showRange();
    adoptUse();
}

void ProgressArea::setTextActive(bool isActive)
{
    isTextActive_ = isActive;
    label_->setVisible(isActive);
    adoptUse();
}

void ProgressArea::setIndeterminate(bool isIndeterminate)
{
    isIndeterminate_ = isIndeterminate;
    showRange();
}

void ProgressArea::setPercent(double percent)
{
    tenths_ = std::isfinite(percent)
                  ? static_cast<int>(std::lround(std::clamp(percent, 0.0, 100.0) * 10))
                  : 0;
    showRange();
}

// A bar without a range is animated for as long as it lives, also while it is hidden.
void ProgressArea::showRange()
{
    const bool isMoving = isIndeterminate_ && isBarActive_;
    bar_->setRange(0, isMoving ? 0 : 1000);
    if (!isMoving)
        bar_->setValue(tenths_);
}

void ProgressArea::setText(std::string_view text)
{
    label_->setFullText(toQtLine(text));
}

void ProgressArea::setStop(std::function<void()> stop)
{
    stop_ = std::move(stop);
    stopButton_->setVisible(static_cast<bool>(stop_));
    adoptUse();
}

MainWindow::MainWindow(const Translator& texts)
    : texts_(texts),
      commands_(new CommandBar(texts, this)),
      disks_(new DiskPanel(texts)),
      header_(new DiskHeader),
      banner_(new ResultBanner(texts)),
      tabs_(new QTabWidget),
      splitter_(new QSplitter(Qt::Horizontal)),
      progress_(new ProgressArea(texts, this)),
      dropNote_(new DropNote(this))
{
    setObjectName(QStringLiteral("mainWindow"));
    setWindowTitle(QStringLiteral("Orvane"));
    setAcceptDrops(true);
    resize(firstSize);
    // Less than its parts ask for while there is room: what it is made smaller for has them ask
    // less.
    constexpr int leastHeight = 24;  // lines
    setMinimumHeight(leastHeight * fontMetrics().height());

    addToolBar(commands_);
    setContextMenuPolicy(Qt::NoContextMenu);
    tabs_->setDocumentMode(true);
    tabs_->setTabBarAutoHide(true);
    tabs_->setAccessibleName(toQt(texts.text("What can be done")));
    auto* const work = new QWidget(this);
    auto* const rows = new QVBoxLayout(work);
    rows->setContentsMargins(0, 0, 0, 0);
    rows->setSpacing(0);
    rows->addWidget(header_);
    rows->addWidget(banner_);
    rows->addWidget(progress_);
    rows->addWidget(tabs_, 1);
    splitter_->addWidget(disks_);
    splitter_->addWidget(work);
    splitter_->setChildrenCollapsible(false);
    splitter_->setStretchFactor(0, 2);
    splitter_->setStretchFactor(1, 3);
    splitter_->setSizes({380, 740});

    setCentralWidget(splitter_);

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
    const auto files = localFiles(event->mimeData());
    if (!events_.canOpenFiles || !events_.canOpenFiles() || files.empty())
        return;
    event->acceptProposedAction();
    const auto count = static_cast<long>(files.size());
    dropNote_->tell(count == 1 ? toQtLine(texts_.sentence("Drop to open “%@”",
                                                          {files.front().filename().native()}))
                               : toQtLine(texts_.sentence("Drop to open %ld files", {count})));
}

void MainWindow::dragLeaveEvent(QDragLeaveEvent* event)
{
    dropNote_->hide();
    QMainWindow::dragLeaveEvent(event);
}

void MainWindow::dropEvent(QDropEvent* event)
{
    dropNote_->hide();
    if (!events_.canOpenFiles || !events_.canOpenFiles())
        return;
    event->acceptProposedAction();
    events_.filesDropped(localFiles(event->mimeData()));
}

// Buttons leave Return alone, outside of dialogs. Those who walk there by the keyboard expect it.
void MainWindow::keyPressEvent(QKeyEvent* event)
{
    auto* const button = qobject_cast<QAbstractButton*>(focusWidget());
    const bool isReturn = event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter;
    if (isReturn && button != nullptr && !event->isAutoRepeat())
        button->click();
    else
        QMainWindow::keyPressEvent(event);
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

void MainWindow::resizeEvent(QResizeEvent* event)
{
    QMainWindow::resizeEvent(event);
    adoptRoom();
}

// Measured in lines of text, for a large font takes the same room as a small window.
void MainWindow::adoptRoom()
{
    constexpr int roomyHeight = 40;  // lines
    constexpr int roomyWidth = 110;  // characters
    const QFontMetrics metrics = fontMetrics();
    const bool isCompact = height() < roomyHeight * metrics.height();
    commands_->setCompact(width() < roomyWidth * metrics.averageCharWidth());
    if (std::exchange(isCompact_, isCompact) == isCompact)
        return;
    disks_->setCompact(isCompact);
    header_->setCompact(isCompact);
    banner_->setCompact(isCompact);
    if (events_.roomChanged)
        events_.roomChanged(isCompact);
}

void MainWindow::restoreLayout(const contract::UserDefaults& settings)
{
    restoreGeometry(storedBytes(settings, geometryKey));
    splitter_->restoreState(storedBytes(settings, splitterKey));
}

void MainWindow::saveLayout(contract::UserDefaults& settings) const
{
    storeBytes(settings, geometryKey, saveGeometry());
    storeBytes(settings, splitterKey, splitter_->saveState());
}

}  // namespace orvane::desktop

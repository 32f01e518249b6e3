// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Help.h"

#include "contract/foundation/Format.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QAction>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>
#include <QShortcut>
#include <QStatusBar>
#include <QStyle>
#include <QTextDocument>
#include <QToolBar>
#include <QToolButton>
#include <QUrl>

namespace orvane::desktop {
namespace {

QString readPage(const QString& page)
{
    QFile file(page);
    return !page.isEmpty() && file.open(QIODevice::ReadOnly) ? QString::fromUtf8(file.readAll())
                                                             : QString();
}

constexpr QSize firstSize(720, 620);
constexpr int pageMargin = 16;  // pixels

constexpr std::string_view geometryKey = "HelpWindow.geometry";
constexpr std::string_view books = "help/";

// English where the language has texts, but no book.
std::filesystem::path bookDirectory(const contract::Bundle& bundle)
{
    const auto translated = bundle.pathForResource(std::string(books) + languageOf(bundle));
    return translated.empty() ? bundle.pathForResource(std::string(books) + "en") : translated;
}

}  // namespace

QString HelpBook::page(const QString& name) const
{
    // Without a directory, the name would be looked for wherever the program was started.
    return directory_.empty() ? QString() : QFile::decodeName((directory_ / fromQt(name)).c_str());
}

QString HelpBook::pageWith(std::string_view anchor) const
{
    if (!anchor.empty()) {
        const QString mark = QStringLiteral("<a name=\"%1\">").arg(toQt(anchor));
        for (const QString& candidate : pages())
            if (readPage(candidate).contains(mark))
                return candidate;
    }
    return contents();
}

QStringList HelpBook::pages() const
{
    const QString text = readPage(contents());
    if (text.isEmpty())
        return {};
    QStringList found{contents()};
    static const QRegularExpression link(QStringLiteral("<li><a href=\"([a-z]+\\.html)\">"));
    for (const QRegularExpressionMatch& match : link.globalMatch(text))
        found += page(match.captured(1));
    return found;
}

QString HelpBook::plainText(const QString& page)
{
    QTextDocument document;
    document.setHtml(readPage(page));
    return document.toPlainText();
}

HelpWindow::HelpWindow(HelpBook book, const contract::Bundle& texts,
                       contract::UserDefaults& settings)
    : book_(std::move(book)),
      texts_(texts),
      settings_(settings),
      browser_(new QTextBrowser(this)),
      findField_(new QLineEdit(this))
{
    setWindowTitle(text("Orvane Help"));
    setAttribute(Qt::WA_DeleteOnClose);
    // The program ends with its main window, whatever help is open.
    setAttribute(Qt::WA_QuitOnClose, false);
    resize(firstSize);
    restoreGeometry(storedBytes(settings_, geometryKey));
    browser_->setAccessibleName(windowTitle());
    browser_->setFrameShape(QFrame::NoFrame);
    browser_->document()->setDocumentMargin(pageMargin);
    browser_->setOpenLinks(false);
    connect(browser_, &QTextBrowser::anchorClicked, this, [this](const QUrl& url) { follow(url); });
    setCentralWidget(browser_);
    addTools();
    auto* const escape = new QShortcut(Qt::Key_Escape, this);
    connect(escape, &QShortcut::activated, this, &QWidget::close);
    browser_->setFocus();
}

QString HelpWindow::text(std::string_view key) const
{
    return toQt(texts_.localizedString(key));
}

QAction* HelpWindow::addCommand(QToolBar& bar, std::string_view title, QIcon icon, QKeySequence key)
{
    QAction* const action = bar.addAction(icon, text(title));
    action->setShortcut(key);
    action->setToolTip(text(title) +
                       QStringLiteral(" (%1)").arg(key.toString(QKeySequence::NativeText)));
    return action;
}

void HelpWindow::addTools()
{
    QToolBar* const bar = addToolBar(text("Navigation"));
    bar->setMovable(false);
    bar->setContextMenuPolicy(Qt::PreventContextMenu);
    const auto icon = [this](QStyle::StandardPixmap name) {
        return style()->standardIcon(name, nullptr, this);
    };
    QAction* const back = addCommand(*bar, "Back", icon(QStyle::SP_ArrowBack), QKeySequence::Back);
    QAction* const forward =
        addCommand(*bar, "Forward", icon(QStyle::SP_ArrowForward), QKeySequence::Forward);
    QAction* const contents = addCommand(*bar, "Contents", icon(QStyle::SP_DirHomeIcon),
                                         QKeySequence(Qt::ALT | Qt::Key_Home));
    if (auto* const button = qobject_cast<QToolButton*>(bar->widgetForAction(contents)))
        button->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
    connect(back, &QAction::triggered, browser_, &QTextBrowser::backward);
    connect(forward, &QAction::triggered, browser_, &QTextBrowser::forward);
    connect(contents, &QAction::triggered, this, [this] { open(""); });
    back->setEnabled(false);
    forward->setEnabled(false);
    connect(browser_, &QTextBrowser::backwardAvailable, back, &QAction::setEnabled);
    connect(browser_, &QTextBrowser::forwardAvailable, forward, &QAction::setEnabled);
    bar->addSeparator();
    addFindField(*bar);
}

void HelpWindow::addFindField(QToolBar& bar)
{
    findField_->setPlaceholderText(text("Find"));
    findField_->setAccessibleName(text("Find"));
    findField_->setClearButtonEnabled(true);
    bar.addWidget(findField_);
    const auto onKey = [this](const QKeySequence& key, auto action) {
        connect(new QShortcut(key, this), &QShortcut::activated, this, action);
    };
    onKey(QKeySequence::Find, [this] {
        findField_->setFocus();
        findField_->selectAll();
    });
    onKey(Qt::Key_F3, [this] { find(Direction::Forward); });
    onKey(Qt::SHIFT | Qt::Key_F3, [this] { find(Direction::Backward); });
    connect(findField_, &QLineEdit::returnPressed, this, [this] { find(Direction::Forward); });
}

void HelpWindow::open(std::string_view anchor)
{
    const QString page = book_.pageWith(anchor);
    if (!QFileInfo(page).isReadable()) {
        browser_->setPlainText(
            toQt(contract::format(texts_.localizedString("The help book %@ cannot be read."),
                                  {page.isEmpty() ? std::string("index.html") : fromQt(page)})));
        return;
    }
    QUrl place = QUrl::fromLocalFile(page);
    place.setFragment(toQt(anchor));
    browser_->setSource(place);
}

// A click that looks like turning a page must not lead to the network.
void HelpWindow::follow(const QUrl& link)
{
    const QUrl place = browser_->source().resolved(link);
    if (place.isLocalFile() && book_.pages().contains(place.toLocalFile()))
        browser_->setSource(place);
}

bool HelpWindow::findInPage(Direction direction)
{
    QTextDocument::FindFlags flags;
    flags.setFlag(QTextDocument::FindBackward, direction == Direction::Backward);
    return browser_->find(findField_->text(), flags);
}

void HelpWindow::find(Direction direction)
{
    const QString wanted = findField_->text();
    statusBar()->clearMessage();
    if (wanted.isEmpty() || findInPage(direction))
        return;
    const QStringList pages = book_.pages();
    const qsizetype step = direction == Direction::Forward ? 1 : pages.size() - 1;
    qsizetype at = std::max<qsizetype>(0, pages.indexOf(browser_->source().toLocalFile()));
    for (qsizetype i = 0; i < pages.size(); ++i) {
        at = (at + step) % pages.size();
        if (!HelpBook::plainText(pages[at]).contains(wanted, Qt::CaseInsensitive))
            continue;
        browser_->setSource(QUrl::fromLocalFile(pages[at]));
        browser_->moveCursor(direction == Direction::Forward ? QTextCursor::Start
                                                             : QTextCursor::End);
        findInPage(direction);
        return;
    }
    statusBar()->showMessage(
        toQt(contract::format(texts_.localizedString("“%@” was not found."), {fromQt(wanted)})));
}

void HelpWindow::closeEvent(QCloseEvent* event)
{
    storeBytes(settings_, geometryKey, saveGeometry());
    QMainWindow::closeEvent(event);
}

QtHelp::~QtHelp()
{
    delete window_;
}

void QtHelp::openHelpAnchor(std::string_view anchor)
{
    if (!window_)
        window_ = new HelpWindow(HelpBook(bookDirectory(bundle_)), bundle_, settings_);
    window_->show();
    window_->open(anchor);
    window_->raise();
    window_->activateWindow();
}

}  // namespace orvane::desktop

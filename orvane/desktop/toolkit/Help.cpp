// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Help.h"

#include "contract/foundation/Format.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QAction>
#include <QFile>
#include <QFileInfo>
#include <QListWidget>
#include <QRegularExpression>
#include <QShortcut>
#include <QSignalBlocker>
#include <QSplitter>
#include <QStatusBar>
#include <QStyle>
#include <QTextBlock>
#include <QTextDocument>
#include <QToolBar>
#include <QToolButton>
#include <QUrl>

#include <algorithm>
#include <functional>
#include <optional>

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

namespace {

constexpr double titleWeight = 100;
constexpr double headingWeight = 10;
constexpr int lineLength = 90;  // characters

/// What one word adds to a page's relevance; none where the page does not have it.
std::optional<double> relevanceOf(const QString& word, const QTextDocument& document)
{
    double relevance = 0;
    bool isThere = false;
    for (QTextBlock block = document.begin(); block.isValid(); block = block.next()) {
        const auto count = static_cast<double>(block.text().count(word, Qt::CaseInsensitive));
        if (count == 0)
            continue;
        const int level = block.blockFormat().headingLevel();
        const double weight = level == 1 ? titleWeight : level > 1 ? headingWeight : 1;
        const double place = static_cast<double>(block.position()) / document.characterCount();
        relevance += weight * count + (isThere ? 0 : 1 - place);
        isThere = true;
    }
    return isThere ? std::optional(relevance) : std::nullopt;
}

/// The text around the word, rather in the running text than in the title.
QString lineAround(const QString& word, const QTextDocument& document)
{
    QString line;
    for (QTextBlock block = document.begin(); block.isValid(); block = block.next()) {
        const qsizetype place = block.text().indexOf(word, 0, Qt::CaseInsensitive);
        if (place < 0)
            continue;
        const qsizetype from = std::max<qsizetype>(0, place - lineLength / 3);
        line = (from > 0 ? QStringLiteral("…") : QString()) +
               block.text().mid(from, lineLength).simplified() +
               (from + lineLength < block.text().size() ? QStringLiteral("…") : QString());
        if (block.blockFormat().headingLevel() != 1)
            break;
    }
    return line;
}

QString titleOf(const QTextDocument& document)
{
    for (QTextBlock block = document.begin(); block.isValid(); block = block.next())
        if (block.blockFormat().headingLevel() == 1)
            return block.text();
    return document.metaInformation(QTextDocument::DocumentTitle);
}

}  // namespace

std::vector<HelpHit> HelpBook::search(const QString& words) const
{
    const QStringList all = words.split(QLatin1Char(' '), Qt::SkipEmptyParts);
    std::vector<HelpHit> hits;
    for (const QString& page : all.isEmpty() ? QStringList() : pages()) {
        QTextDocument document;
        document.setHtml(readPage(page));
        HelpHit hit{page, titleOf(document), lineAround(all.front(), document)};
        const bool hasAll = std::ranges::all_of(all, [&](const QString& word) {
            const auto relevance = relevanceOf(word, document);
            hit.relevance += relevance.value_or(0);
            return relevance.has_value();
        });
        if (hasAll)
            hits.push_back(std::move(hit));
    }
    std::ranges::stable_sort(hits, std::ranges::greater(), &HelpHit::relevance);
    return hits;
}

HelpWindow::HelpWindow(HelpBook book, const contract::Bundle& texts,
                       contract::UserDefaults& settings)
    : book_(std::move(book)),
      texts_(texts),
      settings_(settings),
      browser_(new QTextBrowser(this)),
      findField_(new QLineEdit(this)),
      hits_(new QListWidget(this))
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
    hits_->setObjectName(QStringLiteral("helpHits"));
    hits_->setAccessibleName(text("Found pages"));
    hits_->setWordWrap(true);
    hits_->setMinimumWidth(fontMetrics().averageCharWidth() * lineLength / 3);
    hits_->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    hits_->hide();
    connect(hits_, &QListWidget::currentRowChanged, this, [this] { openHit(); });
    auto* const panes = new QSplitter(this);
    panes->addWidget(hits_);
    panes->addWidget(browser_);
    panes->setStretchFactor(1, 1);
    panes->setChildrenCollapsible(false);
    setCentralWidget(panes);
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
    connect(findField_, &QLineEdit::textChanged, this, [this] { listHits(); });
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

void HelpWindow::listHits()
{
    const QSignalBlocker still(hits_);
    const auto hits = book_.search(findField_->text());
    hits_->clear();
    for (const HelpHit& hit : hits) {
        auto* const item = new QListWidgetItem(hit.title + QLatin1Char('\n') + hit.line, hits_);
        item->setData(Qt::UserRole, hit.page);
    }
    hits_->setVisible(!hits.empty());
    statusBar()->clearMessage();
    if (hits.empty() && !findField_->text().trimmed().isEmpty())
        statusBar()->showMessage(toQt(contract::format(
            texts_.localizedString("“%@” was not found."), {fromQt(findField_->text())})));
}

void HelpWindow::openHit()
{
    const QListWidgetItem* const item = hits_->currentItem();
    if (item == nullptr)
        return;
    browser_->setSource(QUrl::fromLocalFile(item->data(Qt::UserRole).toString()));
    browser_->moveCursor(QTextCursor::Start);
    findInPage(Direction::Forward);
}

// All of it where it stands so on the page, else its first word.
bool HelpWindow::findInPage(Direction direction)
{
    QTextDocument::FindFlags flags;
    flags.setFlag(QTextDocument::FindBackward, direction == Direction::Backward);
    const QString wanted = findField_->text().simplified();
    return browser_->find(wanted, flags) ||
           browser_->find(wanted.section(QLatin1Char(' '), 0, 0), flags);
}

// Through the page first, then to the next of those that were found.
void HelpWindow::find(Direction direction)
{
    const int count = hits_->count();
    if (count == 0 || (hits_->currentRow() >= 0 && findInPage(direction)))
        return;
    const int step = direction == Direction::Forward ? 1 : count - 1;
    const int from = std::max(hits_->currentRow(), direction == Direction::Forward ? -1 : 0);
    const int row = (from + step) % count;
    if (row == hits_->currentRow())
        openHit();
    hits_->setCurrentRow(row);
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

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/SingleInstance.h"

#include <QDBusConnectionInterface>
#include <QDBusMessage>
#include <QFile>
#include <QUrl>

#include <filesystem>
#include <system_error>
#include <utility>

namespace orvane::desktop {
namespace {

const QString interface = QStringLiteral("org.freedesktop.Application");
const QString openAction = QStringLiteral("open");
const QString activationToken = QStringLiteral("activation-token");
constexpr int longestWait = 2000;  // milliseconds

/// The other program works in another directory.
std::string independent(const std::string& name)
{
    std::error_code error;
    if (!std::filesystem::exists(name, error))
        return name;
    const auto path = std::filesystem::absolute(name, error);
    return error ? name : path.string();
}

// Bytes that are no UTF-8 are kept as a URI keeps them.
QString toText(const std::string& name)
{
    return QString::fromLatin1(QUrl::toPercentEncoding(
        QString::fromLatin1(name.data(), static_cast<qsizetype>(name.size()))));
}

std::string fromText(const QString& text)
{
    return QUrl::fromPercentEncoding(text.toLatin1()).toLatin1().toStdString();
}

}  // namespace

SingleInstance::SingleInstance(const BusLookup& bus, const char* entry)
    : bus_(bus()),
      name_(QLatin1String(entry)),
      path_(QLatin1Char('/') + QString(name_).replace(QLatin1Char('.'), QLatin1Char('/')))
{
    if (!bus_)
        return;
    // Registered first: whoever finds the name finds the object as well.
    const bool isThere = bus_->registerObject(path_, this, QDBusConnection::ExportScriptableSlots);
    isOwner_ = isThere && bus_->registerService(name_);
    if (!isOwner_)
        bus_->unregisterObject(path_);
}

SingleInstance::~SingleInstance()
{
    if (!isOwner_)
        return;
    bus_->unregisterService(name_);
    bus_->unregisterObject(path_);
}

bool SingleInstance::handOver(const std::vector<std::string>& names)
{
    if (!bus_ || isOwner_)
        return false;
    QStringList texts;
    for (const std::string& name : names)
        texts += toText(independent(name));
    const QVariantMap platformData{{activationToken, qEnvironmentVariable("XDG_ACTIVATION_TOKEN")}};
    QDBusMessage call =
        QDBusMessage::createMethodCall(name_, path_, interface, QStringLiteral("ActivateAction"));
    call << openAction << QVariantList{texts} << platformData;
    return bus_->call(call, QDBus::Block, longestWait).type() == QDBusMessage::ReplyMessage;
}

void SingleInstance::setEvents(Events events)
{
    events_ = std::move(events);
    if (!early_.empty() && events_.opened)
        events_.opened(std::exchange(early_, {}));
}

void SingleInstance::Activate(const QVariantMap& platformData)
{
    tell({}, platformData);
}

void SingleInstance::Open(const QStringList& uris, const QVariantMap& platformData)
{
    std::vector<std::string> names;
    for (const QString& uri : uris)
        if (const QUrl url(uri); url.isLocalFile())
            names.push_back(QFile::encodeName(url.toLocalFile()).toStdString());
    tell(std::move(names), platformData);
}

void SingleInstance::ActivateAction(const QString& action, const QVariantList& parameters,
                                    const QVariantMap& platformData)
{
    std::vector<std::string> names;
    if (action == openAction && !parameters.isEmpty())
        for (const QString& text : parameters.front().toStringList())
            names.push_back(fromText(text));
    tell(std::move(names), platformData);
}

void SingleInstance::tell(std::vector<std::string> names, const QVariantMap& platformData)
{
    // Qt takes the token from there when the window is brought to the front.
    if (const QString token = platformData.value(activationToken).toString(); !token.isEmpty())
        qputenv("XDG_ACTIVATION_TOKEN", token.toUtf8());
    if (events_.activated)
        events_.activated();
    if (names.empty())
        return;
    if (events_.opened)
        events_.opened(names);
    else
        early_.insert(early_.end(), names.begin(), names.end());
}

}  // namespace orvane::desktop

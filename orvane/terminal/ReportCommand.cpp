// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/ReportEncoding.h"
#include "orvane/support/texts/Language.h"
#include "orvane/terminal/Commands.h"

#include <cstdio>

namespace orvane {
namespace {

/// NO when it cannot be written; the program tells that at its end.
bool write(const std::string& piece)
{
    return std::fwrite(piece.data(), 1, piece.size(), stdout) == piece.size();
}

std::string languageCode()
{
    const std::string language = currentLanguage();
    return language.empty() ? "en" : language.substr(0, language.find('_'));
}

}  // namespace

int runReport(const Request& request, Session& session)
{
    int status = 0;
    std::vector<AttachedImage> images;
    std::vector<std::shared_ptr<Disk>> disks;
    for (const NamedDisk& named : session.findDisks(request.disks, status)) {
        images.emplace_back(session, named.disk);
        disks.push_back(named.disk);
    }
    if (disks.empty())
        return status;
    SupportHost& host = session.host();
    Report report(disks, host,
                  {request.isLastRunAlone, host.sharedPreferences().showDetailsInFixwell()});
    const auto encoding = request.isHTML ? makeHTMLEncoding(languageCode()) : makeTextEncoding();
    bool isWritten = write(encoding->begin(report.title()));
    while (isWritten && !session.wasStopped()) {
        const auto line = report.next();
        if (!line)
            break;
        isWritten = write(encoding->add(*line));
    }
    static_cast<void>(write(encoding->end()));
    return session.wasStopped() ? status | exitStopped : status;
}

}  // namespace orvane

// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskIcons.h"

#include "fixwell/host/pellar/MessageKeys.h"

#include <QApplication>
#include <QStyle>

namespace orvane::desktop {
namespace {

QIcon icon(const char* themeName, QStyle::StandardPixmap standard)
{
    return QIcon::fromTheme(QLatin1String(themeName), QApplication::style()->standardIcon(standard));
}

}  // namespace

QIcon diskIcon(const DiskFacts& facts)
{
    switch (facts.type) {
        case diskType::opticalDisc: return icon("media-optical", QStyle::SP_DriveCDIcon);
        case diskType::diskImage: return icon("application-x-raw-disk-image", QStyle::SP_FileIcon);
        case diskType::volume:
        case diskType::bareVolume:
        case diskType::assembled: return icon("drive-harddisk-partition", QStyle::SP_DirIcon);
        default: return icon("drive-harddisk", QStyle::SP_DriveHDIcon);
    }
}

QIcon verdictIcon(std::string_view verdict)
{
    if (verdict == fixwell::kPLVerdictSound.text() || verdict == fixwell::kPLVerdictRepaired.text())
        return QApplication::style()->standardIcon(QStyle::SP_DialogApplyButton);
    if (verdict == fixwell::kPLVerdictDamaged.text())
        return icon("dialog-error", QStyle::SP_MessageBoxCritical);
    return icon("dialog-warning", QStyle::SP_MessageBoxWarning);
}

}  // namespace orvane::desktop

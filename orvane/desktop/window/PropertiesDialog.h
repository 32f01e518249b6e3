// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskProperties.h"

#include <QDialog>

#include <string>
#include <vector>

namespace orvane::desktop {

/// What is shown of a disk's properties.
struct ShownProperties {
    QString disk;  ///< its name, plain text
    QIcon icon;
    std::vector<DiskProperty> properties;
};

/// Shows all that is known of a disk beside the window, to be selected and copied. Returns at once
/// with the dialog, which goes away when it is closed; the window and the texts outlive it.
QDialog* showProperties(QWidget& window, const ShownProperties& shown, const Translator& texts);

}  // namespace orvane::desktop

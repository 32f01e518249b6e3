// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/support/texts/Language.h"

#include <gtest/gtest.h>

#include <QApplication>

#include <cstdlib>

int main(int argc, char** argv)
{
    ::setenv("QT_QPA_PLATFORM", "offscreen", 0);
    ::setenv("LC_ALL", "C.UTF-8", 1);
    ::unsetenv("LANGUAGE");
    orvane::adoptUserLocale();
    testing::InitGoogleTest(&argc, argv);
    const QApplication application(argc, argv);
    QApplication::setStyle(new orvane::desktop::FramedStyle);
    QApplication::setQuitOnLastWindowClosed(false);
    return RUN_ALL_TESTS();
}

// SPDX-License-Identifier: Apache-2.0
// Stands for fixwell where a shell's completions run it: the same, with the disks of a directory,
// in the environment's COMPLETION_DISKS.
#include "orvane/support/texts/Language.h"
#include "orvane/terminal/ManualCommands.h"

#include <clocale>
#include <cstdlib>

int main(int argc, char** argv)
{
    orvane::adoptUserLocale();
    const std::filesystem::path system = std::getenv("COMPLETION_DISKS");
    const orvane::DiskSources disks{system / "sys/block", system / "dev", system / "udev", {}, {}};
    return orvane::runCompletion({argv + 1, argv + argc}, HELP_PAGES, disks, {}).value_or(99);
}

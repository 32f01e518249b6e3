// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/Obstacles.h"

#include <cerrno>
#include <cstring>

namespace pellar {
namespace {

bool isMissingRight(int error)
{
    return error == EPERM || error == EACCES;
}

std::string textOf(int error)
{
    return ::strerrordesc_np(error);
}

}  // namespace

Judgement notAttached(const Tool& tool, int error)
{
    const std::string name(tool.name);
    const Sentence reason =
        isMissingRight(error)
            ? Sentence{"%1$@ needs the volume as a disk of its own, which only an administrator "
                       "may make of a part of an image",
                       name,
                       {}}
            : Sentence{"the volume could not be made a disk of its own for %1$@: %2$@", name,
                       textOf(error)};
    return {Verdict::Failed, contract::kPLErrorCannotOpen, error, reason};
}

Outcome notReplayed(int error)
{
    const Sentence reason =
        isMissingRight(error)
            ? Sentence{"its log has to be replayed by mounting it, which only an administrator may",
                       {},
                       {}}
            : Sentence{"its log could not be replayed by mounting it: %1$@", textOf(error), {}};
    return {Verdict::Inconclusive, contract::kPLErrorInconclusive, error, reason};
}

}  // namespace pellar

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/EventRoad.h"
#include "pellar/process/Stopping.h"

#include <functional>
#include <memory>

namespace pellar {

/// What a job does, on the thread that calls `run`. Whatever happens, it tells *started* once,
/// first, and *finished* once, last.
class Script {
public:
    virtual ~Script() = default;
    virtual void run() = 0;
};

/// Makes a script that heeds the switch and tells its events on the road. Both outlive it.
using ScriptMaker = std::function<std::unique_ptr<Script>(StopSwitch&, EventRoad&)>;

}  // namespace pellar

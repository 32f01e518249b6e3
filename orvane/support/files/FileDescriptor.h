// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

namespace orvane {

using pellar::FileDescriptor;

}  // namespace orvane

// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/Outbox.h"

namespace orvane {
namespace {

thread_local Outbox* current = nullptr;

}  // namespace

Outbox* Outbox::ofThisThread()
{
    return current;
}

Outbox::Scope::Scope(Outbox& outbox) : before_(current)
{
    current = &outbox;
}

Outbox::Scope::~Scope()
{
    current = before_;
}

}  // namespace orvane

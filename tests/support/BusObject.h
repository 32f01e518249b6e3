// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/BusCall.h"

#include <cstdlib>
#include <string>
#include <utility>

// What a service that a test plays is made of, with both versions of sdbus-c++.

namespace orvane::test {

/// The bus on which the system's services are looked for, until this object ends.
struct SystemBus {
    explicit SystemBus(const std::string& address)
    {
        ::setenv("DBUS_SYSTEM_BUS_ADDRESS", address.c_str(), 1);
    }
    ~SystemBus() { ::unsetenv("DBUS_SYSTEM_BUS_ADDRESS"); }
};

template <class Function>
void addMethod(sdbus::IObject& object, const char* interface, const char* name, Function function)
{
#if ORVANE_SDBUS == 2
    object.addVTable(sdbus::registerMethod(name).implementedAs(std::move(function)))
        .forInterface(std::string(interface));
#else
    object.registerMethod(name).onInterface(interface).implementedAs(std::move(function));
#endif
}

/// Adds properties of one interface, each with what gives its value.
template <class... Getter>
void addProperties(sdbus::IObject& object, const char* interface,
                   std::pair<const char*, Getter>... properties)
{
#if ORVANE_SDBUS == 2
    object.addVTable(sdbus::registerProperty(properties.first).withGetter(properties.second)...)
        .forInterface(std::string(interface));
#else
    (object.registerProperty(properties.first).onInterface(interface).withGetter(properties.second),
     ...);
#endif
}

/// What gives a property its value.
template <class Value>
auto always(Value value)
{
    return [value] {
        return value;
    };
}

/// When all has been added.
inline void finish([[maybe_unused]] sdbus::IObject& object)
{
#if ORVANE_SDBUS == 1
    object.finishRegistration();
#endif
}

}  // namespace orvane::test

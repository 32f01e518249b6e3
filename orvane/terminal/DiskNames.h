// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <string_view>

namespace orvane {

/// What the user called each disk. A volume inside an image is called by the image's name and
/// its number: "backup.img#2".
class DiskNames {
public:
    void add(const std::string& identifier, const std::string& name) { names_[identifier] = name; }

    /// The identifier itself for a disk that nobody named.
    std::string nameOf(std::string_view identifier) const;

    /// Whether the disk is the named one, or lies inside it.
    static bool isWithin(std::string_view identifier, std::string_view named);

private:
    std::map<std::string, std::string, std::less<>> names_;
};

}  // namespace orvane

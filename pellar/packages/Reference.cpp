// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/Reference.h"

#include <sys/stat.h>

#include <algorithm>
#include <utility>

namespace pellar {
namespace {

/// A full installation of a distribution has less than two million.
constexpr std::size_t mostFilesOfSystem = 3'000'000;

bool saysTheSame(const Reference& one, const Reference& other)
{
    return one.kind == other.kind && one.mode == other.mode && one.user == other.user &&
           one.group == other.group && one.capabilities == other.capabilities;
}

}  // namespace

bool lendsRights(const Reference& reference)
{
    const bool mayBeRegular = !reference.kind || *reference.kind == FileKind::Regular;
    const bool hasBits = (reference.mode & (S_ISUID | S_ISGID)) != 0;
    return mayBeRegular &&
           (hasBits || (reference.capabilities && !reference.capabilities->empty()));
}

bool ReferenceCollector::isFull() const
{
    return files_.size() + withoutSource_.size() >= mostFilesOfSystem;
}

void ReferenceCollector::add(Reference reference)
{
    if (isFull())
        return;
    const auto [known, isNew] = files_.try_emplace(reference.path, reference);
    if (isNew)
        return;
    if (known->second.doubt == Doubt::None)
        known->second.doubt = reference.doubt;
    if (known->second.doubt == Doubt::None && !saysTheSame(known->second, reference))
        known->second.doubt = Doubt::PackagesDiffer;
    if (known->second.digest != reference.digest)
        known->second.digest.clear();  // of two, neither is the file's own
}

void ReferenceCollector::addWithoutSource(const std::string& path)
{
    if (!isFull())
        withoutSource_.push_back(path);
}

void ReferenceCollector::override(Reference reference)
{
    overrides_[reference.path] = std::move(reference);
}

void ReferenceCollector::countPackage(bool hasSource)
{
    ++result_.packages;
    result_.packagesWithoutSource += hasSource ? 0 : 1;
}

References ReferenceCollector::take() &&
{
    for (auto& [path, override] : overrides_) {
        const auto known = files_.find(path);
        if (known != files_.end()) {
            override.kind = known->second.kind;
            override.digest = known->second.digest;
        }
        files_[path] = override;
    }
    for (auto& [path, reference] : files_)
        result_.files.push_back(std::move(reference));
    std::sort(result_.files.begin(), result_.files.end(),
              [](const Reference& a, const Reference& b) { return a.path < b.path; });
    for (std::string& path : withoutSource_)
        if (files_.count(path) == 0)
            result_.filesWithoutSource.push_back(std::move(path));
    std::vector<std::string>& rest = result_.filesWithoutSource;
    std::sort(rest.begin(), rest.end());
    rest.erase(std::unique(rest.begin(), rest.end()), rest.end());
    return std::move(result_);
}

}  // namespace pellar

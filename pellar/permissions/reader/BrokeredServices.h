// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/dpkg/DpkgReferences.h"
#include "pellar/permissions/reader/ReaderMessages.h"

namespace pellar {

/// The services of ReaderServices in the process that has no rights: each call asks the other one
/// and waits for its answer. When that is gone, this process ends.
class BrokeredServices final : public RootFiles, public KeptReferences {
public:
    BrokeredServices(int socket, const PathAliases& aliases) : socket_(socket), aliases_(aliases) {}

    FileDescriptor openFile(const std::string& path) const override;
    std::vector<std::string> names(const std::string& directory) const override;
    const PathAliases& aliases() const override { return aliases_; }
    FileDescriptor open(const std::string& digest) const override;
    void keep(const std::string& digest, std::string_view mtree) override;
    std::vector<FileDescriptor> fetch(std::span<const DpkgPackage> packages) const;
    bool progress(double percent) const;

private:
    ReaderMessage ask(Question question, std::string_view bytes, int descriptor = -1) const;
    FileDescriptor askForFile(Question question, std::string_view bytes) const;

    int socket_;
    const PathAliases& aliases_;
};

}  // namespace pellar

// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Name.h"

#include "contract/foundation/Storage.h"

#include <functional>
#include <mutex>
#include <unordered_map>

namespace contract {

struct Name::Table {
    std::mutex lock;
    std::unordered_map<std::string_view, Interned*> names;

    // Leaked on purpose: names are used by static objects until the very end of the process.
    static Table& shared()
    {
        static Table* const table = new Table;
        return *table;
    }
};

Name::Name(std::string_view text)
{
    Table& table = Table::shared();
    const std::lock_guard guard(table.lock);
    if (const auto found = table.names.find(text); found != table.names.end()) {
        node_ = found->second;
        return;
    }
    node_ = new Interned(text, std::hash<std::string_view>()(text));
    table.names.emplace(node_->text, node_);
}

std::string_view Name::text() const noexcept
{
    return node_->text;
}

bool Name::sameText(Name a, Name b) noexcept
{
    return a.node_->hash == b.node_->hash && a.node_->text == b.node_->text;
}

}  // namespace contract

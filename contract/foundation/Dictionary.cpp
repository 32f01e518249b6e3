// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Dictionary.h"

#include "contract/foundation/Storage.h"

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <memory>
#include <utility>

namespace contract {

Dictionary::Storage::~Storage()
{
    if (hasMany)
        std::destroy_at(&many);
    else
        std::destroy_n(few, fewCount);
}

std::span<Dictionary::Entry> Dictionary::Storage::entries() noexcept
{
    return hasMany ? std::span<Entry>(many) : std::span<Entry>(few, fewCount);
}

void Dictionary::Storage::append(Name key, Value value)
{
    if (!hasMany && fewCount < mostFew) {
        std::construct_at(few + fewCount, key, std::move(value));
        ++fewCount;
        return;
    }
    if (!hasMany) {
        std::vector<Entry> moved;
        moved.reserve(2 * mostFew);
        moved.assign(std::move_iterator(few), std::move_iterator(few + fewCount));
        std::destroy_n(few, fewCount);
        std::construct_at(&many, std::move(moved));
        hasMany = true;
    }
    many.push_back({key, std::move(value)});
}

void Dictionary::Storage::removeAt(std::size_t index) noexcept
{
    if (hasMany) {
        many.erase(many.begin() + static_cast<std::ptrdiff_t>(index));
        return;
    }
    std::move(few + index + 1, few + fewCount, few + index);
    std::destroy_at(few + --fewCount);
}

Dictionary::Storage* Dictionary::storage() const noexcept
{
    return static_cast<Storage*>(node_.get());
}

Dictionary Dictionary::make()
{
    // A log holds millions: a pointer more would cost sixteen bytes.
    static_assert(sizeof(Storage) == sizeof(Node) + Storage::mostFew * sizeof(Entry));
    return Dictionary(NodePointer<Node>::adopting(new Storage));
}

Dictionary Dictionary::of(std::initializer_list<Entry> entries)
{
    const Dictionary dictionary = make();
    for (const Entry& entry : entries)
        if (entry.value)
            dictionary.storage()->append(entry.key, entry.value);
    return dictionary;
}

Dictionary Dictionary::mutableCopy() const
{
    const Dictionary copy = make();
    for (const Entry& entry : entries())
        copy.storage()->append(entry.key, entry.value);
    return copy;
}

std::span<const Dictionary::Entry> Dictionary::entries() const noexcept
{
    if (!node_)
        return {};
    return storage()->entries();
}

const Dictionary::Entry* Dictionary::find(Name key) const noexcept
{
    // Most keys come from the table that the entries' keys come from: addresses tell.
    for (const Entry& entry : entries())
        if (entry.key.isSameNode(key))
            return &entry;
    for (const Entry& entry : entries())
        if (entry.key == key)
            return &entry;
    return nullptr;
}

Value Dictionary::operator[](Name key) const noexcept
{
    const Entry* const entry = find(key);
    return entry != nullptr ? entry->value : Value();
}

std::int64_t Dictionary::integer(Name key) const noexcept
{
    const Entry* const entry = find(key);
    return entry != nullptr ? entry->value.integer() : 0;
}

std::string_view Dictionary::string(Name key) const noexcept
{
    const Entry* const entry = find(key);
    return entry != nullptr ? entry->value.string() : std::string_view();
}

void Dictionary::set(Name key, Value value) const
{
    if (value.isNone()) {
        remove(key);
        return;
    }
    if (const Entry* const entry = find(key)) {
        const_cast<Entry*>(entry)->value = std::move(value);
        return;
    }
    storage()->append(key, std::move(value));
}

void Dictionary::remove(Name key) const
{
    if (const Entry* const entry = find(key))
        storage()->removeAt(static_cast<std::size_t>(entry - entries().data()));
}

}  // namespace contract

// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Dictionary.h"

#include "contract/foundation/Storage.h"

#include <memory>
#include <new>
#include <utility>

namespace contract {

Dictionary::Storage::~Storage()
{
    std::destroy_n(entries, count);
    if (capacity != inlineEntries)
        ::operator delete(entries);
}

void Dictionary::Storage::append(Name key, Value value)
{
    if (count == capacity) {
        auto* const larger =
            static_cast<Entry*>(::operator new (2 * std::size_t{capacity} * sizeof(Entry)));
        std::uninitialized_move_n(entries, count, larger);
        std::destroy_n(entries, count);
        if (capacity != inlineEntries)
            ::operator delete(entries);
        entries = larger;
        capacity *= 2;
    }
    new (entries + count) Entry{key, std::move(value)};
    ++count;
}

void Dictionary::Storage::removeAt(std::uint32_t index) noexcept
{
    std::move(entries + index + 1, entries + count, entries + index);
    std::destroy_at(entries + --count);
}

Dictionary::Storage* Dictionary::storage() const noexcept
{
    return static_cast<Storage*>(node_.get());
}

Dictionary Dictionary::make()
{
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
    return {storage()->entries, storage()->count};
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
        storage()->removeAt(static_cast<std::uint32_t>(entry - storage()->entries));
}

}  // namespace contract

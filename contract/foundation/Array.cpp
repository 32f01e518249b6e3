// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Array.h"

#include "contract/foundation/Storage.h"

namespace contract {

Array::Storage* Array::storage() const noexcept
{
    return static_cast<Storage*>(node_.get());
}

Array Array::make()
{
    return Array(NodePointer<Node>::adopting(new Storage));
}

Array Array::of(std::initializer_list<Value> values)
{
    Array array = make();
    array.storage()->values.assign(values);
    return array;
}

std::size_t Array::size() const noexcept
{
    return node_ ? storage()->values.size() : 0;
}

Value Array::at(std::size_t index) const noexcept
{
    return index < size() ? storage()->values[index] : Value();
}

const std::vector<Value>& Array::values() const noexcept
{
    static const std::vector<Value> none;
    return node_ ? storage()->values : none;
}

void Array::append(Value value) const
{
    storage()->values.push_back(std::move(value));
}

void Array::append(const Array& others) const
{
    if (others.isSameAs(*this)) {
        const std::vector<Value> twice = others.values();
        storage()->values.insert(storage()->values.end(), twice.begin(), twice.end());
        return;
    }
    storage()->values.insert(storage()->values.end(), others.values().begin(),
                             others.values().end());
}

void Array::removeFront() const
{
    if (!isEmpty())
        storage()->values.erase(storage()->values.begin());
}

void Array::removeAll() const
{
    storage()->values.clear();
}

}  // namespace contract

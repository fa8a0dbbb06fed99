// A small vector of key/value pairs kept in ascending key order, with unique
// keys: the ordered container behind the options register.
#ifndef QKCORE_SRC_PLATFORM_SORTED_VECTOR_H
#define QKCORE_SRC_PLATFORM_SORTED_VECTOR_H

#include <stddef.h>

#include <algorithm>
#include <vector>

namespace qk::platform {

template <typename Key, typename Value>
class SortedVector {
public:
    struct Item {
        Key key;
        Value value;
    };

    size_t size() const { return items_.size(); }
    // Items run from index 0 in ascending key order.
    const Item& itemAt(size_t index) const { return items_[index]; }

    // The index of the item with this key, or -1.
    ptrdiff_t indexOf(const Key& key) const {
        size_t index = lower_index(key);
        return index < items_.size() && items_[index].key == key ? static_cast<ptrdiff_t>(index) : -1;
    }

    // Puts the pair at its sorted place and returns its index. The key must
    // not be present yet (see indexOf). May throw std::bad_alloc.
    size_t add(const Key& key, const Value& value) {
        size_t index = lower_index(key);
        items_.insert(items_.begin() + static_cast<ptrdiff_t>(index), Item{key, value});
        return index;
    }

private:
    // The index of the first item whose key is not below `key`.
    size_t lower_index(const Key& key) const {
        auto it = std::lower_bound(items_.begin(), items_.end(), key,
                                   [](const Item& item, const Key& k) { return item.key < k; });
        return static_cast<size_t>(it - items_.begin());
    }

    std::vector<Item> items_;
};

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_SORTED_VECTOR_H

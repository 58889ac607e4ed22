// An ordered collection whose items are also reachable by a text key compared without regard to
// case, as the registry enumerations return them.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace vantorel {

bool EqualsIgnoringCase(std::string_view a, std::string_view b);

template <typename T>
class Collection {
public:
    // Adds `item` under `key`. A key already present keeps its first item; the new one is dropped.
    bool Add(std::string key, T item) {
        if (Find(key) != nullptr) return false;
        items_.emplace_back(std::move(key), std::move(item));
        return true;
    }

    std::size_t size() const { return items_.size(); }
    bool empty() const { return items_.empty(); }
    const T& operator[](std::size_t index) const { return items_[index].second; }
    const std::string& KeyAt(std::size_t index) const { return items_[index].first; }

    const T* Find(std::string_view key) const {
        for (const auto& entry : items_)
            if (EqualsIgnoringCase(entry.first, key)) return &entry.second;
        return nullptr;
    }

private:
    std::vector<std::pair<std::string, T>> items_;
};

}  // namespace vantorel

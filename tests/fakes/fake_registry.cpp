#include "fakes/fake_registry.h"

#include <algorithm>
#include <cctype>

namespace vantorel::testing {

using namespace platform;

FakeRegistry::FakeRegistry() {
    for (std::int32_t root : {kHkeyClassesRoot, kHkeyCurrentUser, kHkeyLocalMachine, kHkeyUsers})
        roots_[root] = std::make_unique<Node>();
}

std::string FakeRegistry::Lower(const std::string& text) {
    std::string lower = text;
    for (char& c : lower) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return lower;
}

FakeRegistry::Node* FakeRegistry::NodeOf(RegKey key) const {
    if (key >= static_cast<RegKey>(INT32_MIN) && key < 0) {
        auto root = roots_.find(static_cast<std::int32_t>(key));
        return root == roots_.end() ? nullptr : root->second.get();
    }
    auto handle = handles_.find(key);
    if (handle == handles_.end() || handle->second.node->deleted) return nullptr;
    return handle->second.node;
}

FakeRegistry::Node* FakeRegistry::Walk(Node* from, const std::string& path, bool create, std::int32_t& status) {
    std::vector<std::string> parts(1);
    for (char c : path) {
        if (c == '\\') parts.emplace_back();
        else parts.back().push_back(c);
    }
    while (!parts.empty() && parts.back().empty()) parts.pop_back();  // trailing separators name the same key
    Node* node = from;
    for (const std::string& name : parts) {
        if (name.empty()) {
            status = kErrorFileNotFound;
            return nullptr;
        }
        auto it = node->subkeys.find(Lower(name));
        if (it == node->subkeys.end()) {
            if (!create) {
                status = kErrorFileNotFound;
                return nullptr;
            }
            auto child = std::make_unique<Node>();
            child->name = name;
            child->parent = node;
            it = node->subkeys.emplace(Lower(name), std::move(child)).first;
        }
        node = it->second.get();
    }
    status = kErrorSuccess;
    return node;
}

RegKey FakeRegistry::NewHandle(Node* node, std::int32_t access) {
    RegKey key = nextHandle_;
    nextHandle_ += 4;
    handles_[key] = Handle{node, access};
    return key;
}

std::int32_t FakeRegistry::Open(RegKey parent, const std::string& path, std::int32_t access, RegKey& key, bool create) {
    Node* from = NodeOf(parent);
    if (from == nullptr) return 6;  // ERROR_INVALID_HANDLE
    std::int32_t status = kErrorSuccess;
    Node* node = Walk(from, path, create, status);
    if (node != nullptr) key = NewHandle(node, access);
    return status;
}

std::int32_t FakeRegistry::OpenKey(RegKey parent, const std::string& path, std::int32_t access, RegKey& key) {
    return Open(parent, path, access, key, false);
}

std::int32_t FakeRegistry::CreateKey(RegKey parent, const std::string& path, std::int32_t access, RegKey& key) {
    return Open(parent, path, access, key, true);
}

std::int32_t FakeRegistry::CloseKey(RegKey key) {
    if (key < 0) return kErrorSuccess;  // predefined roots
    return handles_.erase(key) == 1 ? kErrorSuccess : 6;
}

std::int32_t FakeRegistry::DeleteKey(RegKey parent, const std::string& path) {
    Node* from = NodeOf(parent);
    if (from == nullptr) return 6;
    std::int32_t status = kErrorSuccess;
    Node* node = Walk(from, path, false, status);
    if (node == nullptr || node == from) return kErrorFileNotFound;
    if (!node->subkeys.empty()) return kErrorAccessDenied;  // RegDeleteKey leaves keys with subkeys
    auto it = node->parent->subkeys.find(Lower(node->name));
    node->deleted = true;
    removed_.push_back(std::move(it->second));
    node->parent->subkeys.erase(it);
    return kErrorSuccess;
}

std::int32_t FakeRegistry::DeleteValue(RegKey key, const std::string& name) {
    Node* node = NodeOf(key);
    if (node == nullptr) return 6;
    return node->values.erase(Lower(name)) == 1 ? kErrorSuccess : kErrorFileNotFound;
}

std::int32_t FakeRegistry::QueryValue(RegKey key, const std::string& name, std::int32_t& type,
                                      std::vector<std::uint8_t>& data, std::uint32_t& count) {
    Node* node = NodeOf(key);
    if (node == nullptr) return 6;
    auto it = node->values.find(Lower(name));
    if (it == node->values.end()) return kErrorFileNotFound;
    return CopyOut(it->second, type, data, count);
}

std::int32_t FakeRegistry::CopyOut(const Value& value, std::int32_t& type, std::vector<std::uint8_t>& data,
                                   std::uint32_t& count) {
    type = value.type;
    auto size = static_cast<std::uint32_t>(value.data.size());
    std::uint32_t capacity = std::min<std::uint32_t>(count, static_cast<std::uint32_t>(data.size()));
    count = size;
    if (size > capacity) return kErrorMoreData;
    std::copy(value.data.begin(), value.data.end(), data.begin());
    return kErrorSuccess;
}

std::int32_t FakeRegistry::SetValue(RegKey key, const std::string& name, std::int32_t type, const std::uint8_t* data,
                                    std::uint32_t count) {
    auto handle = handles_.find(key);
    Node* node = NodeOf(key);
    if (node == nullptr) return 6;
    if (handle != handles_.end() && (handle->second.access & 0x2) == 0) return kErrorAccessDenied;  // KEY_SET_VALUE
    Value value{name, type, std::vector<std::uint8_t>(data, data + count)};
    bool isString = type == kRegSz || type == kRegExpandSz || type == kRegMultiSz;
    if (isString && count != 0 && data[count - 1] != 0) value.data.push_back(0);
    node->values[Lower(name)] = std::move(value);
    return kErrorSuccess;
}

std::int32_t FakeRegistry::EnumKey(RegKey key, std::uint32_t index, std::uint32_t nameCapacity, std::string& name) {
    Node* node = NodeOf(key);
    if (node == nullptr) return 6;
    if (index >= node->subkeys.size()) return kErrorNoMoreItems;
    auto it = std::next(node->subkeys.begin(), index);
    if (it->second->name.size() + 1 > nameCapacity) return kErrorMoreData;
    name = it->second->name;
    return kErrorSuccess;
}

std::int32_t FakeRegistry::EnumValue(RegKey key, std::uint32_t index, std::uint32_t nameCapacity, std::string& name,
                                     std::int32_t& type, std::vector<std::uint8_t>& data, std::uint32_t& count) {
    Node* node = NodeOf(key);
    if (node == nullptr) return 6;
    if (index >= node->values.size()) return kErrorNoMoreItems;
    const Value& value = std::next(node->values.begin(), index)->second;
    if (value.name.size() + 1 > nameCapacity) return kErrorMoreData;
    name = value.name;
    return CopyOut(value, type, data, count);
}

std::int32_t FakeRegistry::ConnectRegistry(const std::string& computer, RegKey root, RegKey& key) {
    if (!computer.empty()) return kErrorBadNetpath;  // no other computer is reachable
    Node* node = NodeOf(root);
    if (node == nullptr) return 6;
    key = NewHandle(node, kKeyAllAccess);
    return kErrorSuccess;
}

std::uint32_t FakeRegistry::ExpandEnvironment(const std::string& source, std::uint32_t capacity,
                                              std::string& expanded) {
    std::string result;
    for (std::size_t i = 0; i < source.size();) {
        std::size_t close = source[i] == '%' ? source.find('%', i + 1) : std::string::npos;
        if (close != std::string::npos) {
            auto it = environment_.find(Lower(source.substr(i + 1, close - i - 1)));
            if (it != environment_.end()) {
                result += it->second;
                i = close + 1;
                continue;
            }
            result += source.substr(i, close - i);
            i = close;
            continue;
        }
        result.push_back(source[i++]);
    }
    auto needed = static_cast<std::uint32_t>(result.size() + 1);
    if (needed <= capacity) expanded = result;
    return needed;
}

void FakeRegistry::PutRaw(std::int32_t root, const std::string& path, const std::string& name, std::int32_t type,
                          const std::vector<std::uint8_t>& data) {
    std::int32_t status = kErrorSuccess;
    Node* node = Walk(roots_[root].get(), path, true, status);
    node->values[Lower(name)] = Value{name, type, data};
}

}  // namespace vantorel::testing

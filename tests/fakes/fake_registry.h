// An in-memory registry that answers like the ANSI registry calls: status codes, more-data
// answers, a terminator counted in for string types, case-insensitive names sorted for
// enumeration, a doubled trailing backslash naming the same key.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "platform/registry.h"

namespace vantorel::testing {

class FakeRegistry final : public platform::Registry {
public:
    FakeRegistry();

    std::int32_t OpenKey(platform::RegKey parent, const std::string& path, std::int32_t access,
                         platform::RegKey& key) override;
    std::int32_t CreateKey(platform::RegKey parent, const std::string& path, std::int32_t access,
                           platform::RegKey& key) override;
    std::int32_t CloseKey(platform::RegKey key) override;
    std::int32_t DeleteKey(platform::RegKey parent, const std::string& path) override;
    std::int32_t DeleteValue(platform::RegKey key, const std::string& name) override;
    std::int32_t QueryValue(platform::RegKey key, const std::string& name, std::int32_t& type,
                            std::vector<std::uint8_t>& data, std::uint32_t& count) override;
    std::int32_t SetValue(platform::RegKey key, const std::string& name, std::int32_t type, const std::uint8_t* data,
                          std::uint32_t count) override;
    std::int32_t EnumKey(platform::RegKey key, std::uint32_t index, std::uint32_t nameCapacity,
                         std::string& name) override;
    std::int32_t EnumValue(platform::RegKey key, std::uint32_t index, std::uint32_t nameCapacity, std::string& name,
                           std::int32_t& type, std::vector<std::uint8_t>& data, std::uint32_t& count) override;
    std::int32_t ConnectRegistry(const std::string& computer, platform::RegKey root, platform::RegKey& key) override;
    std::uint32_t ExpandEnvironment(const std::string& source, std::uint32_t capacity, std::string& expanded) override;

    // Scripting: environment variables for expansion, a raw value stored as it stands (no
    // terminator added), and a count of handles still open.
    void SetEnvironment(const std::string& name, const std::string& value) { environment_[Lower(name)] = value; }
    void PutRaw(std::int32_t root, const std::string& path, const std::string& name, std::int32_t type,
                const std::vector<std::uint8_t>& data);
    std::size_t OpenHandles() const { return handles_.size(); }

private:
    struct Value {
        std::string name;
        std::int32_t type = 0;
        std::vector<std::uint8_t> data;
    };
    struct Node {
        std::string name;
        Node* parent = nullptr;
        std::map<std::string, std::unique_ptr<Node>> subkeys;  // by lower-case name
        std::map<std::string, Value> values;                   // by lower-case name
        bool deleted = false;
    };
    struct Handle {
        Node* node;
        std::int32_t access;
    };

    static std::string Lower(const std::string& text);
    Node* NodeOf(platform::RegKey key) const;
    // Walks `path` below `from`; creates missing keys when `create` is set. Null when missing.
    Node* Walk(Node* from, const std::string& path, bool create, std::int32_t& status);
    platform::RegKey NewHandle(Node* node, std::int32_t access);
    std::int32_t Open(platform::RegKey parent, const std::string& path, std::int32_t access, platform::RegKey& key,
                      bool create);
    static std::int32_t CopyOut(const Value& value, std::int32_t& type, std::vector<std::uint8_t>& data,
                                std::uint32_t& count);

    std::map<std::int32_t, std::unique_ptr<Node>> roots_;
    std::map<platform::RegKey, Handle> handles_;
    std::vector<std::unique_ptr<Node>> removed_;  // deleted keys stay valid for stale handles
    std::map<std::string, std::string> environment_;
    platform::RegKey nextHandle_ = 0x1000;
};

}  // namespace vantorel::testing

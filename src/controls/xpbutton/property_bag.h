// The container's per-control property store: named values kept between sessions. The main window
// fills one from its design; the button reads and writes its stored properties through it.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "platform/canvas.h"

namespace vantorel::xpbutton {

// Flags, 16- and 32-bit integers, texts, fonts and pictures (a null picture is "none").
using PropertyValue =
    std::variant<bool, std::int16_t, std::int32_t, std::string, platform::FontDesc, platform::PicturePtr>;

class PropertyBag {
public:
    void Write(const std::string& key, PropertyValue value);
    const PropertyValue* Find(const std::string& key) const;
    bool Contains(const std::string& key) const { return Find(key) != nullptr; }
    // The keys in the order they were first written.
    const std::vector<std::string>& Keys() const { return order_; }

    // Typed reads with the default taken for a missing key or a value of another kind (integers
    // of either width convert).
    bool ReadBool(const std::string& key, bool fallback) const;
    std::int32_t ReadInt32(const std::string& key, std::int32_t fallback) const;
    std::int16_t ReadInt16(const std::string& key, std::int16_t fallback) const;
    std::string ReadText(const std::string& key, const std::string& fallback) const;
    platform::FontDesc ReadFont(const std::string& key, const platform::FontDesc& fallback) const;
    platform::PicturePtr ReadPicture(const std::string& key, const platform::PicturePtr& fallback) const;

private:
    std::map<std::string, PropertyValue> values_;
    std::vector<std::string> order_;
};

}  // namespace vantorel::xpbutton

#include "controls/xpbutton/property_bag.h"

namespace vantorel::xpbutton {

void PropertyBag::Write(const std::string& key, PropertyValue value) {
    auto [it, inserted] = values_.insert_or_assign(key, std::move(value));
    if (inserted) order_.push_back(key);
}

const PropertyValue* PropertyBag::Find(const std::string& key) const {
    auto it = values_.find(key);
    return it == values_.end() ? nullptr : &it->second;
}

bool PropertyBag::ReadBool(const std::string& key, bool fallback) const {
    const PropertyValue* v = Find(key);
    if (v && std::holds_alternative<bool>(*v)) return std::get<bool>(*v);
    return fallback;
}

std::int32_t PropertyBag::ReadInt32(const std::string& key, std::int32_t fallback) const {
    const PropertyValue* v = Find(key);
    if (!v) return fallback;
    if (std::holds_alternative<std::int32_t>(*v)) return std::get<std::int32_t>(*v);
    if (std::holds_alternative<std::int16_t>(*v)) return std::get<std::int16_t>(*v);
    return fallback;
}

std::int16_t PropertyBag::ReadInt16(const std::string& key, std::int16_t fallback) const {
    const PropertyValue* v = Find(key);
    if (!v) return fallback;
    if (std::holds_alternative<std::int16_t>(*v)) return std::get<std::int16_t>(*v);
    if (std::holds_alternative<std::int32_t>(*v)) {
        std::int32_t n = std::get<std::int32_t>(*v);
        if (n >= INT16_MIN && n <= INT16_MAX) return static_cast<std::int16_t>(n);
    }
    return fallback;
}

std::string PropertyBag::ReadText(const std::string& key, const std::string& fallback) const {
    const PropertyValue* v = Find(key);
    if (v && std::holds_alternative<std::string>(*v)) return std::get<std::string>(*v);
    return fallback;
}

platform::FontDesc PropertyBag::ReadFont(const std::string& key, const platform::FontDesc& fallback) const {
    const PropertyValue* v = Find(key);
    if (v && std::holds_alternative<platform::FontDesc>(*v)) return std::get<platform::FontDesc>(*v);
    return fallback;
}

platform::PicturePtr PropertyBag::ReadPicture(const std::string& key, const platform::PicturePtr& fallback) const {
    const PropertyValue* v = Find(key);
    if (v && std::holds_alternative<platform::PicturePtr>(*v)) return std::get<platform::PicturePtr>(*v);
    return fallback;
}

}  // namespace vantorel::xpbutton

// The count of attempts intercepted and the status text that shows it.
#pragma once

#include <cstdint>
#include <string>

namespace vantorel {

// count + 1, wrapping from 2,147,483,647 to -2,147,483,648.
constexpr std::int32_t NextCount(std::int32_t count) {
    return static_cast<std::int32_t>(static_cast<std::uint32_t>(count) + 1u);
}

enum class CountForm {
    Plain,           // "5", "-5": after a teardown
    BlankBeforeSign  // " 5", "-5": at start-up and on the status tick
};

// "Vantorel - " + the count + " attempts intercepted".
std::string StatusText(std::int32_t count, CountForm form);

}  // namespace vantorel

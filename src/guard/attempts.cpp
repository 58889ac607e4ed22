#include "guard/attempts.h"

namespace vantorel {

std::string StatusText(std::int32_t count, CountForm form) {
    std::string number = std::to_string(count);
    if (form == CountForm::BlankBeforeSign && count >= 0) number.insert(0, 1, ' ');
    return "Vantorel - " + number + " attempts intercepted";
}

}  // namespace vantorel

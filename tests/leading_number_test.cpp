// Reading the leading number of version texts and header values, and rounding to 32 bits.
#include "download/leading_number.h"

#include <gtest/gtest.h>

#include <cmath>

namespace vantorel {
namespace {

TEST(LeadingNumber, ReadsTheNumberAtTheStartAndStopsWhereItCannotGoOn) {
    const std::pair<const char*, double> cases[] = {{"21", 21},
                                                    {"21\r\nsecond line 99", 21},
                                                    {"  \t 1.10", 1.1},
                                                    {"1.9beta", 1.9},
                                                    {"-5", -5},
                                                    {"+7x", 7},
                                                    {".5", 0.5},
                                                    {"1e3", 1000},
                                                    {"1e", 1} /* an exponent without digits is not taken */,
                                                    {"2E-1", 0.2},
                                                    {"0x10", 0} /* no hexadecimal form */,
                                                    {"<html>404</html>", 0},
                                                    {"", 0},
                                                    {".", 0}};
    for (auto [text, number] : cases) EXPECT_EQ(LeadingNumber(text), number) << text;
    EXPECT_TRUE(std::isinf(LeadingNumber("1e999")));
}

TEST(RoundToInt32, RoundsHalvesToEvenAndRefusesWhatDoesNotFit) {
    const std::pair<double, std::int32_t> fits[] = {
        {2.5, 2}, {3.5, 4}, {-2.5, -2}, {2147483647.0, 2147483647}, {-2147483648.0, -2147483647 - 1}};
    for (auto [value, rounded] : fits) {
        std::int32_t v = 0;
        EXPECT_TRUE(RoundToInt32(value, v) && v == rounded) << value;
    }
    for (double value : {2147483647.5 /* rounds to 2^31 */, 99999999999.0, -2147483649.0, double{INFINITY}}) {
        std::int32_t v = 42;
        EXPECT_FALSE(RoundToInt32(value, v)) << value;
        EXPECT_EQ(v, 42) << "a refused value leaves the result alone";
    }
}

}  // namespace
}  // namespace vantorel

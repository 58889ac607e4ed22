// Reading the leading number of version texts and header values, and rounding to 32 bits.
#include "download/leading_number.h"

#include <gtest/gtest.h>

#include <cmath>

namespace vantorel {
namespace {

TEST(LeadingNumber, ReadsTheNumberAtTheStartAndStopsWhereItCannotGoOn) {
    EXPECT_EQ(LeadingNumber("21"), 21.0);
    EXPECT_EQ(LeadingNumber("21\r\nsecond line 99"), 21.0);
    EXPECT_EQ(LeadingNumber("  \t 1.10"), 1.1);
    EXPECT_EQ(LeadingNumber("1.9beta"), 1.9);
    EXPECT_EQ(LeadingNumber("-5"), -5.0);
    EXPECT_EQ(LeadingNumber("+7x"), 7.0);
    EXPECT_EQ(LeadingNumber(".5"), 0.5);
    EXPECT_EQ(LeadingNumber("5."), 5.0);
    EXPECT_EQ(LeadingNumber("1e3"), 1000.0);
    EXPECT_EQ(LeadingNumber("1e"), 1.0) << "an exponent without digits is not part of the number";
    EXPECT_EQ(LeadingNumber("2E-1"), 0.2);
    EXPECT_EQ(LeadingNumber("0x10"), 0.0) << "no hexadecimal form";
    EXPECT_EQ(LeadingNumber("<html>404</html>"), 0.0);
    EXPECT_EQ(LeadingNumber(""), 0.0);
    EXPECT_EQ(LeadingNumber("-"), 0.0);
    EXPECT_EQ(LeadingNumber("."), 0.0);
    EXPECT_TRUE(std::isinf(LeadingNumber("1e999")));
}

TEST(RoundToInt32, RoundsHalvesToEvenAndRefusesWhatDoesNotFit) {
    std::int32_t v = 0;
    ASSERT_TRUE(RoundToInt32(2.5, v));
    EXPECT_EQ(v, 2);
    ASSERT_TRUE(RoundToInt32(3.5, v));
    EXPECT_EQ(v, 4);
    ASSERT_TRUE(RoundToInt32(-2.5, v));
    EXPECT_EQ(v, -2);
    ASSERT_TRUE(RoundToInt32(2147483647.0, v));
    EXPECT_EQ(v, 2147483647);
    ASSERT_TRUE(RoundToInt32(-2147483648.0, v));
    EXPECT_EQ(v, -2147483647 - 1);
    v = 42;
    EXPECT_FALSE(RoundToInt32(2147483647.5, v)) << "rounds to 2^31";
    EXPECT_FALSE(RoundToInt32(99999999999.0, v));
    EXPECT_FALSE(RoundToInt32(-2147483649.0, v));
    EXPECT_FALSE(RoundToInt32(1.0 / 0.0, v));
    EXPECT_EQ(v, 42) << "a refused value leaves the result alone";
}

}  // namespace
}  // namespace vantorel

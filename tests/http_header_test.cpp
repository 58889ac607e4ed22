// Reading one field out of a raw response header, as both transfers do for "Content-Length".
#include "platform/http_header.h"

#include <gtest/gtest.h>

namespace vantorel::platform {
namespace {

TEST(HeaderField, FindsTheFirstFieldByNameWhateverItsCase) {
    const std::string header =
        "HTTP/1.1 206 Partial Content\r\nServer: nginx\r\ncontent-length:  5000 \r\nX-Empty:\r\n"
        "Content-Length: 7\r\nLast: no line end";
    EXPECT_EQ(HeaderField(header, "Content-Length"), "5000");
    EXPECT_EQ(HeaderField(header, "SERVER"), "nginx");
    EXPECT_EQ(HeaderField(header, "X-Empty"), "");
    EXPECT_EQ(HeaderField(header, "Last"), "no line end");
    EXPECT_EQ(HeaderField(header, "Content"), "") << "a prefix of a name is not the name";
    EXPECT_EQ(HeaderField(header, "Content-Range"), "");
    EXPECT_EQ(HeaderField("Content-Length: 5\r\n", "Content-Length"), "") << "the first line is the status line";
    EXPECT_EQ(HeaderField("", "Content-Length"), "");
    EXPECT_EQ(HeaderField("HTTP/1.1 200 OK\r\nBroken line\r\nContent-Length: 3\r\n\r\n", "Content-Length"), "3");
}

}  // namespace
}  // namespace vantorel::platform

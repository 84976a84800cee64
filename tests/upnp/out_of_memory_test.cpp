#include <gtest/gtest.h>

#include "agents.h"
#include "support/failing_allocator.h"
#include "support/http_server.h"

namespace {

/* Three parts of a body, of 3, 5 and 2 bytes. */
const http_server::Reply kParts{
    "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n3\r\nabc\r\n5\r\ndefgh\r\n2\r\nij\r\n"
    "0\r\n\r\n"};

TEST(AgentOutOfMemory, DropsWhatCameBeforeAndGoesOn) {
    struct {
        std::size_t failing;
        unsigned size;
        std::string response;
    } cases[] = {
        {0, 10, "abcdefghij"},
        {4, 7, "defghij"},
        {9, 5, ""},  // the first three bytes are lost, their place is not
        {11, 8, "(null)"},
    };
    const http_server::Server server(kParts);
    for (const auto &row : cases) {
        SCOPED_TRACE(row.failing);
        DMAGet get(DMAGENT_ACTION_GETSYSTEMUPDATEID, server.url());
        failing_allocator::failOnSize(row.failing);
        EXPECT_EQ(get.Perform(), 0);
        EXPECT_EQ(failing_allocator::hasFailed(), row.failing != 0);
        EXPECT_EQ(get.responseSize, row.size);
        EXPECT_EQ(upnp_test::takeResponse(get), row.response);
    }
}

}  // namespace

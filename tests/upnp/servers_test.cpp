/* What servers do that they should not. */
#include <gtest/gtest.h>

#include "agents.h"
#include "support/failing_allocator.h"
#include "support/http_server.h"

namespace {

using http_server::Reply;
using http_server::reply;
using http_server::Server;
using http_server::Then;
using upnp_test::isUnderWay;
using upnp_test::takeResponse;

TEST(Servers, GiveWhateverTheyGive) {
    struct {
        const char *text;
        int result;
        unsigned size;
        const char *response;
        const char *status = "200 OK";
    } cases[] = {
        // Closed in mid-body, longer than it says, a length of letters, a broken chunk.
        {"Content-Length: 90\r\n\r\n&lt;a", 18, 5, "<a"},
        {"Content-Length: 3\r\n\r\nabcdef", 0, 3, "abc"},
        {"Content-Length: x\r\n\r\nabc", 8, 0, "(null)"},
        {"Transfer-Encoding: chunked\r\n\r\n3\r\nabc\r\nq\r\n", 56, 3, "abc"},
        {"Content-Length: 4\r\n\r\ngone", 0, 4, "gone", "404 Not Found"},
    };
    for (const auto &row : cases) {
        SCOPED_TRACE(row.text);
        const Server server(Reply{std::string("HTTP/1.1 ") + row.status + "\r\n" + row.text});
        DMABrowse browse(DMAGENT_BROWSE_METADATA, server.url());
        EXPECT_EQ(browse.Perform(), row.result);
        EXPECT_EQ(browse.responseSize, row.size);
        EXPECT_EQ(takeResponse(browse), row.response);
    }
}

/* Of a part that finds no memory, in a body of parts of 3, 5 and 2 bytes. */
TEST(Servers, PartsWithoutMemoryAreDroppedWithWhatCameBefore) {
    const std::tuple<std::size_t, unsigned, const char *> cases[] = {
        {0, 10, "abcdefghij"},
        {4, 7, "defghij"},
        {9, 5, ""},  // the first three bytes are lost, their place is not
        {11, 8, "(null)"},
    };
    const Server server(Reply{
        "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n3\r\nabc\r\n5\r\ndefgh\r\n2\r\nij"
        "\r\n0\r\n\r\n"});
    for (const auto &[failing, size, response] : cases) {
        DMAGet get(DMAGENT_ACTION_GETSYSTEMUPDATEID, server.url());
        failing_allocator::failOnSize(failing);
        EXPECT_EQ(get.Perform(), 0);
        EXPECT_EQ(failing_allocator::hasFailed(), failing != 0);
        EXPECT_EQ(get.responseSize, size);
        EXPECT_EQ(takeResponse(get), response) << failing;
    }
}

TEST(Servers, MayNotBeThere) {
    std::string closed;
    {
        const Server server(reply(""));
        closed = server.url();
    }
    const std::pair<std::string, int> cases[] = {
        {closed, 7}, {"", 3}, {"no-such-scheme://x/", 1}, {"http://", 3}};
    for (const auto &[url, result] : cases) {
        DMABrowse browse(DMAGENT_BROWSE_METADATA, url);
        EXPECT_EQ(browse.Perform(), result) << url;
        EXPECT_EQ(takeResponse(browse), "(null)") << url;
    }
}

TEST(Servers, AreWaitedForWithoutALimit) {
    constexpr unsigned long kMuch = 4UL << 20;
    const auto ask = [](const Server &server) {
        return [&server] { DMABrowse(DMAGENT_BROWSE_METADATA, server.url()).Perform(); };
    };
    const Reply never[] = {{"", Then::Wait},
                           {"HTTP/1.1 200 OK\r\nContent-Length: 9\r\n\r\nabc", Then::Wait}};
    for (const Reply &row : never) {
        const Server server(row);
        EXPECT_TRUE(isUnderWay(ask(server), [&] {
            return !server.requests().empty() && server.sent() == row.bytes.size();
        })) << row.bytes;
    }
    const Server endless(
        Reply{"HTTP/1.0 200 OK\r\n\r\n" + std::string(1 << 20, 'x'), Then::Repeat});
    EXPECT_TRUE(isUnderWay(ask(endless), [&] { return endless.sent() > kMuch; }));
}

}  // namespace

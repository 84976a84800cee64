/* What servers do that they should not. */
#include <gtest/gtest.h>

#include "agents.h"
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
        const char *name;
        Reply reply;
        int result;
        unsigned size;
        const char *response;
    } cases[] = {
        {"closed in mid-body", {"HTTP/1.1 200 OK\r\nContent-Length: 90\r\n\r\n&lt;a"}, 18, 5, "<a"},
        {"longer than it says",
         {"HTTP/1.1 200 OK\r\nContent-Length: 3\r\n\r\nabcdef"},
         0,
         3,
         "abc"},
        {"length of letters", {"HTTP/1.1 200 OK\r\nContent-Length: x\r\n\r\nabc"}, 8, 0, "(null)"},
        {"broken chunk",
         {"HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n3\r\nabc\r\nq\r\n"},
         56,
         3,
         "abc"},
        {"not found", reply("gone", "404 Not Found"), 0, 4, "gone"},
    };
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        const Server server(row.reply);
        DMABrowse browse(DMAGENT_BROWSE_METADATA, server.url());
        EXPECT_EQ(browse.Perform(), row.result);
        EXPECT_EQ(browse.responseSize, row.size);
        EXPECT_EQ(takeResponse(browse), row.response);
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

#include <gtest/gtest.h>

#include <csignal>
#include <cstring>

#include "agents.h"

namespace {

using upnp_test::isUnderWay;
using upnp_test::takeResponse;

std::string decoded(const std::string &text) {
    DMAGet agent(DMAGENT_ACTION_GETSYSTEMUPDATEID, "");
    agent.response = strdup(text.c_str());
    agent.responseSize = static_cast<unsigned>(text.size());
    agent.DecodeRDataHTML();
    EXPECT_EQ(agent.responseSize, text.size());
    return takeResponse(agent);
}

TEST(Decoder, DecodesTheSixEntitiesOnce) {
    const std::pair<const char *, const char *> cases[] = {
        {"&lt;DIDL-Lite&gt;", "<DIDL-Lite>"},
        {"&lt;&gt;", "<>"},
        {"&gt;&lt;", "><"},
        {"&apos;&quot;&nbsp;&lt;&gt;&amp;", "'\" <>&"},
        {"&amp;&gt;&lt;&nbsp;&quot;&apos;", "&>< \"'"},
        {"&amp;amp;", "&amp;"},
        {"&amp;lt;&amp;#39;", "&lt;&#39;"},
        {"&lt;a b=&quot;it&apos;s&quot;&gt;R &amp;amp; B\xC3\xA9&lt;/a&gt;",
         "<a b=\"it's\">R &amp; B\xC3\xA9</a>"},
    };
    for (const auto &[text, expected] : cases) {
        EXPECT_EQ(decoded(text), expected) << text;
    }
    EXPECT_EQ(decoded(std::string("a&lt;\0&#1;", 10)), "a<") << "it ends at a NUL";
}

TEST(Decoder, LeavesAnAgentWithoutResponseAlone) {
    DMAGet agent(DMAGENT_ACTION_GETSYSTEMUPDATEID, "");
    agent.DecodeRDataHTML();
    EXPECT_EQ(agent.response, nullptr);
    char text[] = "&lt;";
    agent.response = text;
    agent.DecodeRDataHTML();
    EXPECT_STREQ(text, "&lt;");
}

DMAgent *stuck = nullptr;

/* Puts another byte in the place of the last "&". */
void freeStuck(int) {
    *std::strrchr(stuck->response, '&') = '+';
}

TEST(Decoder, LooksAtAnUnknownEntityForEver) {
    for (const char *text : {"&#39;", "AC & DC", "&lt;&eacute;", "&LT;", "&amp", "&"}) {
        EXPECT_TRUE(isUnderWay([&] { decoded(text); })) << text;
    }
}

TEST(Decoder, GoesOnWhenAnotherByteStandsThere) {
    DMAGet agent(DMAGENT_ACTION_GETSYSTEMUPDATEID, "");
    agent.response = strdup("&lt;R & B>");
    agent.responseSize = 10;
    stuck = &agent;
    std::signal(SIGALRM, freeStuck);
    ualarm(1000, 0);
    agent.DecodeRDataHTML();
    EXPECT_EQ(takeResponse(agent), "<R + B>");
}

}  // namespace

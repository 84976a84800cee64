#include <curl/curl.h>
#include <gtest/gtest.h>

#include "agents.h"
#include "support/http_server.h"

namespace {

using upnp_test::takeResponse;

const char *const kFilter =
    "\t\t\t<Filter>res,res@resolution,res@protocolInfo,res@size,res@duration,res@bitrate,"
    "res@sampleFrequency,res@bitsPerSample,res@nrAudioChannels,dc:creator,dc:date,upnp:genre,"
    "upnp:album,upnp:originalTrackNumber,upnp:channelNr,upnp:scheduledStartTime,"
    "upnp:scheduledEndTime,upnp:icon,upnp:albumArtURI,upnp:artist,@childCount</Filter>\r\n";

std::string envelope(const std::string &action, const std::string &arguments) {
    return "<?xml version=\"1.0\"?>\r\n"
           "<s:Envelope xmlns:s=\"http://schemas.xmlsoap.org/soap/envelope/\" \r\n"
           "\t\ts:encodingStyle=\"http://schemas.xmlsoap.org/soap/encoding/\">\r\n"
           "\t<s:Body>\r\n"
           "\t\t<u:" +
           action + " xmlns:u=\"urn:schemas-upnp-org:service:ContentDirectory:1\">\r\n" +
           arguments + "\t\t</u:" + action + ">\r\n\t</s:Body>\r\n</s:Envelope>";
}

std::string browseEnvelope(const std::string &id, const std::string &flag = "BrowseDirectChildren",
                           const std::string &start = "0", const std::string &count = "0") {
    return envelope("Browse", "\t\t\t<ObjectID>" + id + "</ObjectID>\r\n\t\t\t<BrowseFlag>" + flag +
                                  "</BrowseFlag>\r\n" + kFilter + "\t\t\t<StartingIndex>" + start +
                                  "</StartingIndex>\r\n\t\t\t<RequestedCount>" + count +
                                  "</RequestedCount>\r\n\t\t\t<SortCriteria></SortCriteria>\r\n");
}

class Agent : public testing::Test {
  protected:
    /* With so many lines "Content-Length". */
    std::string request(const std::string &action, const std::string &body, int lines = 1) const {
        std::string text = "POST /control HTTP/1.1\r\nHost: " + server_.url("").substr(7) +
                           "\r\nUser-Agent: Vorelix/2.0 UPnP/1.0 DLNADOC/1.50\r\nAccept: */*\r\n"
                           "Content-Type: text/xml; charset=\"utf-8\"\r\nSOAPACTION: \"urn:"
                           "schemas-upnp-org:service:ContentDirectory:1#" +
                           action + "\"\r\n";
        for (int i = 0; i < lines; ++i) {
            text += "Content-Length: " + std::to_string(body.size()) + "\r\n";
        }
        return text + "\r\n" + body;
    }

    /* The request that the agent sends. */
    std::string sent(DMAgent &agent) const {
        EXPECT_EQ(agent.Perform(), 0);
        EXPECT_EQ(agent.responseSize, 10U);
        EXPECT_EQ(takeResponse(agent), "a <b> c");
        return server_.requests().back();
    }

    const http_server::Server server_{http_server::reply("a &lt;b> c")};
};

TEST_F(Agent, SendsABrowseByteForByte) {
    DMABrowse browse(DMAGENT_BROWSE_METADATA, server_.url());
    EXPECT_EQ(browse.response, nullptr);
    EXPECT_EQ(sent(browse), request("Browse", browseEnvelope("", "BrowseMetadata")));

    DMABrowse children(static_cast<DMAGENT_BROWSETYPE>(2), server_.url());
    children.objectID = "64$<&>\xC3\xA9%s";
    children.startingIndex = -5;
    children.requestedCount = 2147483647;
    const std::string body =
        browseEnvelope("64$<&>\xC3\xA9%s", "BrowseDirectChildren", "-5", "2147483647");
    EXPECT_EQ(sent(children), request("Browse", body));
    EXPECT_EQ(sent(children), request("Browse", body, 2)) << "a line more for every send";
}

TEST_F(Agent, SendsActionsWithoutArguments) {
    for (const auto &[action, name] :
         {std::pair{DMAGENT_ACTION_BROWSE, "Browse"},
          {DMAGENT_ACTION_GETSEARCHCAPABILITIES, "GetSearchCapabilities"},
          {DMAGENT_ACTION_GETSORTCAPABILITIES, "GetSortCapabilities"},
          {DMAGENT_ACTION_GETSYSTEMUPDATEID, "GetSystemUpdateID"}}) {
        DMAGet get(action, server_.url());
        EXPECT_EQ(sent(get), request(name, envelope(name, "")));
    }
    const char *const former = szSOAPAction[DMAGENT_ACTION_GETSYSTEMUPDATEID];
    szSOAPAction[DMAGENT_ACTION_GETSYSTEMUPDATEID] = "X_Other";
    DMAGet other(DMAGENT_ACTION_GETSYSTEMUPDATEID, server_.url());
    szSOAPAction[DMAGENT_ACTION_GETSYSTEMUPDATEID] = former;
    EXPECT_NE(sent(other).find("#X_Other\""), std::string::npos);
}

TEST_F(Agent, CutsTheEnvelopeAt4095Bytes) {
    DMABrowse browse(DMAGENT_BROWSE_DIRECTCHILDREN, server_.url());
    const size_t usual = browseEnvelope("first").size();
    for (const size_t size : {size_t{4095}, size_t{4096}, size_t{9000}}) {
        SCOPED_TRACE(size);
        browse.objectID = "first" + std::string(size - usual, 'x');
        const std::string whole = browseEnvelope(browse.objectID);
        ASSERT_EQ(whole.size(), size);
        const std::string request = sent(browse);
        EXPECT_EQ(request.substr(request.find("\r\n\r\n") + 4), whole.substr(0, 4095));
    }
}

TEST_F(Agent, MakesHeaderLinesOfNamesAndValues) {
    DMAGet get(DMAGENT_ACTION_GETSYSTEMUPDATEID, server_.url());
    get.addHeader("X-Name", "and: value");
    get.addHeader("X-Bare", "");
    const curl_slist *const line = get.headers->next->next;
    EXPECT_STREQ(line->data, "X-Name: and: value");
    EXPECT_STREQ(line->next->data, "X-Bare");
    EXPECT_NE(sent(get).find("\r\nX-Name: and: value\r\n"), std::string::npos);
}

}  // namespace

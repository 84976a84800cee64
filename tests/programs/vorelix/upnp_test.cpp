/* The commands that ask media servers, against one that does what it should not. */
#include <gtest/gtest.h>

#include <functional>
#include <memory>

#include "command_line.h"
#include "support/files.h"
#include "support/http_server.h"
#include "support/json.h"

namespace command_line {
namespace {

using http_server::Reply;
using http_server::reply;
using http_server::Server;
using http_server::Then;
using text::repeated;

std::string escaped(const std::string &text) {
    std::string out;
    for (const char byte : text) {
        out += byte == '&'   ? "&amp;"
               : byte == '<' ? "&lt;"
               : byte == '>' ? "&gt;"
                             : std::string(1, byte);
    }
    return out;
}

/* An answer with this text in its DIDL-Lite document. */
std::string answer(const std::string &didl, int total = 1) {
    return "<?xml version=\"1.0\"?><s:Envelope "
           "xmlns:s=\"http://schemas.xmlsoap.org/soap/envelope/\">"
           "<s:Body><u:BrowseResponse xmlns:u=\"urn:schemas-upnp-org:service:ContentDirectory:1\">"
           "<Result>" +
           escaped("<DIDL-Lite xmlns=\"urn:n\" xmlns:dc=\"urn:d\">" + didl + "</DIDL-Lite>") +
           "</Result><NumberReturned>1</NumberReturned><TotalMatches>" + std::to_string(total) +
           "</TotalMatches></u:BrowseResponse></s:Body></s:Envelope>";
}

std::string item(int id, const std::string &title = "Song") {
    return "<item id=\"" + std::to_string(id) + "\"><dc:title>" + title + "</dc:title></item>";
}

/* The number in an element of the request. */
int asked(const std::string &request, const std::string &element) {
    const size_t place = request.find("<" + element + ">");
    return place == std::string::npos ? -1 : std::stoi(request.substr(place + element.size() + 2));
}

/* A server without a description that gives these replies to one request after the other, and the
 * last one for ever. */
std::unique_ptr<Server> serverOf(std::vector<Reply> replies) {
    auto number = std::make_shared<size_t>(0);
    return std::make_unique<Server>([replies, number](const std::string &request) {
        if (request.starts_with("GET")) {
            return reply("", "404 Not Found");
        }
        const size_t place = std::min((*number)++, replies.size() - 1);
        return replies[place];
    });
}

Ended browse(const std::string &url, const char *seconds, std::vector<std::string> more = {}) {
    more.insert(more.begin(), {"upnp", "browse", url, "--timeout", seconds});
    return run({more});
}

/* Of what is said, a part each; "" for nothing. */
void expectBrowsed(const std::vector<Reply> &replies, const std::string &out,
                   const std::string &err) {
    SCOPED_TRACE(out + err);
    const auto server = serverOf(replies);
    const bool isLate = replies[0].then != Then::Close;
    const Ended ended = browse(server->url(), isLate ? "1" : "60");
    EXPECT_EQ(ended.status, err.empty() ? 0 : 1);
    EXPECT_EQ(ended.out.empty(), out.empty());
    EXPECT_TRUE(contains(ended.out, out));
    EXPECT_TRUE(contains(ended.err, err));
    EXPECT_EQ(ended.err.starts_with("vorelix: " + server->url()), !err.empty()) << ended.err;
    EXPECT_FALSE(contains(ended.out + ended.err, "a secret"));
}

std::string entityBomb() {
    std::string text = "<!DOCTYPE a [<!ENTITY e0 \"haha\">";
    for (int i = 1; i < 12; ++i) {
        text += "<!ENTITY e" + std::to_string(i) + " \"" +
                repeated(10, "&e" + std::to_string(i - 1) + ";") + "\">";
    }
    return text + "]><a>&e11;</a>";
}

TEST(MediaServers, ThatMisbehaveAreReported) {
    const Server elsewhere(reply(answer(item(1, "Elsewhere"))));
    const files::Folder folder;
    files::write(folder.path("secret"), "a secret");
    const std::string external = "<!DOCTYPE a [<!ENTITY e SYSTEM \"file://" +
                                 folder.path("secret") + "\"><!ENTITY f SYSTEM \"" +
                                 elsewhere.url("/x") + "\">]>";
    const std::string fault =
        "<s:Fault><detail><UPnPError><errorCode>701</errorCode><errorDescription>No such object"
        "</errorDescription></UPnPError></detail></s:Fault>";
    const std::string half = "HTTP/1.1 200 OK\r\nContent-Length: 90\r\n\r\n<a>half";
    const std::string cdata = "<BrowseResponse><Result><![CDATA[<DIDL-Lite>" + item(1, "x") +
                              "</DIDL-Lite>]]></Result></BrowseResponse>";
    const std::string entities =
        "<DIDL-Lite xmlns:dc=\"urn:d\">" + item(1, "It&#39;s &foo; &") + "</DIDL-Lite>";
    const std::string broken = item(1) + "<item id=\"2\"><b></item>" + item(3, "Third");
    const std::string error501 = "<s:Fault><detail><errorCode>501</errorCode>";
    const std::pair<std::vector<Reply>, const char *> failures[] = {
        {{{""}}, ": it closed the connection without an answer"},
        {{{"hello\r\n\r\n"}}, ": it does not speak HTTP"},
        {{{half}}, ": it closed the connection in the middle of the answer; it sent 7 bytes: '<a>"},
        {{{"", Then::Wait}}, ": no whole answer in 1 s (--timeout gives it more); it sent nothing"},
        {{{half, Then::Wait}}, "; it sent 7 bytes: '<a>half'"},
        {{{"HTTP/1.0 200 OK\r\n\r\n" + std::string(1 << 20, 'x'), Then::Repeat}}, "bytes: 'xxx"},
        {{{"HTTP/1.1 200 OK\r\nContent-Length: 3\r\n\r\n<?xml"}},
         "no list of objects; it sent 3 bytes: '<?x'"},
        {{reply(fault, "500 Error")}, ": it answered with error 701 (No such object)"},
        {{reply("<html>No</html>", "503 Busy")}, "it sent 15 bytes: '<html>No"},
        {{reply("", "302 Found", "Location: " + elsewhere.url() + "\r\n")}, "it sent nothing"},
        {{reply("\x1F\x8B\x08 packed", "200 OK", "Content-Encoding: gzip\r\n")}, "'␟�␈ packed'"},
        {{reply(entityBomb())}, "no list of objects; it sent "},
    };
    for (const auto &[replies, error] : failures) {
        expectBrowsed(replies, "", error);
    }
    const std::pair<std::vector<Reply>, const char *> answers[] = {
        {{reply(answer(item(1, "Caf\xE9")))}, " Caf�\n"},
        {{reply(answer(item(1, "R & B\x01 < C")))}, " R & B < C\n"},
        {{reply(answer("<?xml version=\"1.0\"?>" + item(1)))}, " Song\n"},
        {{reply(cdata)}, " x\n"},
        {{reply(entities)}, " It's &foo; &\n"},
        {{reply(external + "<DIDL-Lite>" + item(1, "&e;&f;") + "</DIDL-Lite>")}, "1   item"},
        {{reply(answer(repeated(1000, "<a>") + item(1, "Deep") + repeated(1000, "</a>")))},
         " Deep\n"},
        {{reply("busy", "503 Busy"), reply(error501), reply(answer(item(1))), reply(answer(""))},
         "objects 1-1 of 1\n"},
        // The same page again, and totals that never come true.
        {{reply(answer(item(1) + item(2), 999))}, "objects 1-2 of 2\n"},
        {{reply(answer(item(1), 1'000'000)), reply(answer("", 1'000'000))}, "objects 1-1 of 1\n"},
        {{reply(answer(item(1))), reply(answer(item(2))), reply(answer(""))}, "objects 1-2 of 2\n"},
        {{reply(answer("", 5))}, "no objects\n"},
    };
    for (const auto &[replies, out] : answers) {
        expectBrowsed(replies, out, "");
    }
    expectBrowsed({reply(answer(broken))}, " Third\n", ": 1 object of it could not be read");
    expectBrowsed({reply(answer(item(1), 9)), reply("gone", "404 Not Found")}, "objects 1-1 of 9",
                  "it sent 4 bytes: 'gone'");
    EXPECT_TRUE(elsewhere.requests().empty());
}

TEST(MediaServers, LoseAnObjectThatIsTooLarge) {
    const std::string large = "<item id=\"1\" a=\"" + std::string(10'000'100, 'x') + "\"/>";
    const auto server = serverOf({reply(answer(large + item(2)))});
    const Ended ended = browse(server->url(), "60");
    EXPECT_TRUE(contains(ended.out, "\n2   item  Song\n"));
    EXPECT_EQ(ended.err, "vorelix: " + server->url() + ": 1 object of it could not be read\n");
}

TEST(MediaServers, ThatAreNotThereAreReported) {
    std::string closed;
    { closed = Server(reply("")).url(); }
    for (const char *command : {"browse", "caps", "tree"}) {
        const Ended ended = run({{"upnp", command, closed}});
        EXPECT_EQ(ended.status, 1);
        EXPECT_EQ(ended.err, "vorelix: " + closed + ": it refused the connection\n");
    }
    const Server silent(Reply{"", Then::Wait});
    const Ended ended = browse(silent.url(), "1");
    EXPECT_EQ(ended.err, "vorelix: " + silent.url() + ": no whole answer in 1 s\n");
    EXPECT_EQ(silent.requests().size(), 1U);
}

/* As many of 25 objects as are asked for, but never more than 4. */
Reply fewAtATime(const std::string &request) {
    std::string objects;
    const int start = asked(request, "StartingIndex");
    for (int i = start; i < std::min({start + 4, start + asked(request, "RequestedCount"), 25});
         ++i) {
        objects += item(i);
    }
    return reply(answer(objects, 25));
}

TEST(MediaServers, AreAskedBehindWhatTheyReturned) {
    const Server server(fewAtATime);
    const struct {
        std::vector<std::string> arguments;
        const char *line;
        std::vector<int> starts;
    } cases[] = {
        {{"--all"}, "25 objects", {0, 4, 8, 12, 16, 20, 24, 25}},
        {{"--page-size", "6", "--page", "2"}, "objects 7-12 of 25 (page 2 of 5; next: ", {6, 10}},
        {{"--offset", "20", "--limit", "9"}, "objects 21-25 of 25\n", {20, 24, 25}},
        {{"--offset", "30"}, "no objects here: there are 25 in all\n", {30}},
    };
    for (const auto &row : cases) {
        const size_t before = server.requests().size();
        const Ended ended = browse(server.url(), "9", row.arguments);
        EXPECT_TRUE(contains(ended.out, row.line)) << ended.err;
        std::vector<int> starts;
        const std::vector<std::string> requests = server.requests();
        for (size_t i = before; i < requests.size(); ++i) {
            if (requests[i].starts_with("POST")) {
                starts.push_back(asked(requests[i], "StartingIndex"));
            }
        }
        EXPECT_EQ(starts, row.starts) << row.line;
    }
}

TEST(MediaServers, WithoutAnEndAreLeftAtTheMost) {
    const Server server([](const std::string &request) {
        std::string objects;
        const int start = asked(request, "StartingIndex");
        for (int i = 0; i < 40000; ++i) {
            objects += "<item id=\"" + std::to_string(start + i) + "\"/>";
        }
        return reply(answer(objects, -1));
    });
    const Ended ended = run({{"upnp", "browse", server.url(), "--all", "--timeout", "60"}});
    EXPECT_TRUE(contains(ended.out, "\n100000 objects, the most that are listed\n")) << ended.err;
}

/* A device with these elements, and a service with these. */
std::string description(const std::string &device, const std::string &control,
                        const std::string &root = "") {
    return "<root xmlns=\"urn:schemas-upnp-org:device-1-0\">" + root +
           "<device><friendlyName>Outside</friendlyName><deviceList><device>" + device +
           "<serviceList><service><serviceType>urn:schemas-upnp-org:service:ConnectionManager:1"
           "</serviceType><controlURL>/wrong</controlURL></"
           "service><service><serviceType>urn:schemas"
           "-upnp-org:service:ContentDirectory:1</serviceType><controlURL>" +
           control + "</controlURL></service></serviceList></device></deviceList></device></root>";
}

TEST(MediaServers, AreFoundByTheirDescription) {
    std::string text;
    const Server server([&](const std::string &request) {
        if (request.starts_with("GET")) {
            return reply(text);
        }
        const bool isRight = request.starts_with("POST /d/control?a=1 ");
        return isRight ? reply(answer(item(1), 1)) : reply("", "404 Not Found");
    });
    const std::string plain =
        "<friendlyName> R & B </friendlyName><manufacturer>Maker</manufacturer>"
        "<modelName>Box</modelName><UDN>uuid:1</UDN>";
    const std::string url = server.url("/d/desc.xml");
    const std::string base = "<URLBase>" + server.url("/d/") + "</URLBase>";
    for (const std::string &found :
         {description(plain, "control?a=1"), description(plain, "/d/control?a=1"),
          description(plain, server.url("/d/control?a=1")),
          description(plain, "control?a=1", base)}) {
        text = found;
        const Json::Value document = json::parsed(run({{"upnp", "browse", url, "--json"}}).out);
        EXPECT_EQ(document["server"]["name"], "R & B") << text;
        EXPECT_EQ(document["objects"][0]["values"]["title"], "Song");
        EXPECT_EQ(document["total"], 1);
    }
    // The address is taken for the one of control.
    for (const std::string &none :
         {description(plain, "file:///etc/passwd"), description(plain, ""), std::string("<root/>"),
          std::string()}) {
        text = none;
        const std::string error = run({{"upnp", "browse", url, "--json"}}).err;
        EXPECT_TRUE(error.starts_with("vorelix: " + url + ": ")) << error;
    }
}

/* Containers in containers, of which one is its own ancestor and one cannot be listed. */
Reply folders(const std::string &request) {
    const auto container = [](const char *id) {
        return "<container id=\"" + std::string(id) + "\"><dc:title>" + id +
               "</dc:title></container>";
    };
    const std::pair<const char *, std::string> inside[] = {
        {"<ObjectID>0<", container("a") + container("bad") + container("c&amp;d")},
        {"<ObjectID>a<", container("0") + item(1)},
        {"<ObjectID>c&amp;d<", item(2) + container("e")},
        {"<ObjectID>e<", item(3)},
    };
    for (const auto &[id, objects] : inside) {
        if (request.find(id) != std::string::npos) {
            return reply(answer(asked(request, "StartingIndex") == 0 ? objects : ""));
        }
    }
    return reply("<errorCode>710</errorCode>", "500 Error");
}

TEST(MediaServers, AreShownAsATree) {
    const Server server(folders);
    const Ended all = run({{"upnp", "tree", server.url()}});
    EXPECT_EQ(all.out, "a/\n  0/\n  Song\nbad/\nc&d/\n  e/\n    Song\n  Song\n");
    EXPECT_EQ(all.err, "vorelix: 'bad': " + server.url() + ": it answered with error 710\n");
    const Ended some = run({{"upnp", "tree", server.url(), "c&d", "--depth", "1"}});
    EXPECT_EQ(some.out, "e/\nSong\n") << "containers first";
    EXPECT_EQ(some.status, 0);
}

TEST(MediaServers, TellWhatTheyCanSearchAndSortBy) {
    const Server server([](const std::string &request) {
        const std::pair<const char *, const char *> answers[] = {
            {"#GetSearchCapabilities\"", "<SearchCaps>dc:title,@id</SearchCaps>"},
            {"#GetSortCapabilities\"", "<SortCaps></SortCaps>"},
            {"#GetSystemUpdateID\"", "<Id>7</Id>"}};
        for (const auto &[action, text] : answers) {
            if (request.find(action) != std::string::npos) {
                return reply("<a>" + std::string(text) + "</a>");
            }
        }
        return reply("", "404 Not Found");
    });
    EXPECT_EQ(run({{"upnp", "caps", server.url()}}).out,
              "Search by  dc:title, @id\nSort by    -\nUpdate ID  7\n");
    const auto other = serverOf({reply("<html/>")});
    EXPECT_EQ(run({{"upnp", "caps", other->url()}}).err,
              "vorelix: " + other->url() +
                  ": it does not answer GetSearchCapabilities; it sent 7 bytes: '<html/>'\n");
}

}  // namespace
}  // namespace command_line

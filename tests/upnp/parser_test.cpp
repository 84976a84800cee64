#include <gtest/gtest.h>
#include <libxml/xmlmemory.h>
#include <sys/inotify.h>
#include <unistd.h>
#include <vorelix/upnp/dmaparser.h>

#include <cstring>
#include <filesystem>
#include <fstream>

#include "support/http_server.h"
#include "support/item_lists.h"

namespace {

/* Also releases what the parser made, as its callers do. */
class Parser : public DMAParser {
  public:
    ~Parser() override {
        item_lists::release(containers);
        item_lists::release(items);
    }
    int parse(const std::string &text) { return Parse(text.data(), static_cast<int>(text.size())); }
};

/* What the library prints of both lists. */
std::string dump(const Parser &parser) {
    testing::internal::CaptureStdout();
    parser.containers->PrintContent();
    std::string text = testing::internal::GetCapturedStdout();
    testing::internal::CaptureStdout();
    parser.items->PrintContent();
    return text + "--\n" + testing::internal::GetCapturedStdout();
}

std::string dumpOf(const std::string &text) {
    Parser parser;
    EXPECT_EQ(parser.parse(text), 0) << text.substr(0, 300);
    return dump(parser);
}

std::string repeated(const std::string &text, int times) {
    std::string made;
    for (int i = 0; i < times; ++i) {
        made += text;
    }
    return made;
}

/* Declarations of entities of which each is ten times the one before; "%" makes them parameter
 * entities. */
std::string bomb(const std::string &kind, const std::string &first, int levels) {
    const std::string declare = "<!ENTITY " + (kind == "%" ? kind + " " : "") + "e";
    std::string text = declare + "0 \"" + first + "\">";
    for (int i = 1; i < levels; ++i) {
        text += declare + std::to_string(i) + " \"" +
                repeated((kind == "%" ? "&#37;e" : "&e") + std::to_string(i - 1) + ";", 10) + "\">";
    }
    return text;
}

/* As a server sends it and an agent decodes it. */
std::string answer(const std::string &didl, const std::string &counts = "") {
    return "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<s:Envelope "
           "xmlns:s=\"http://schemas.xmlsoap.org/soap/envelope/\"><s:Body>"
           "<u:BrowseResponse xmlns:u=\"urn:schemas-upnp-org:service:ContentDirectory:1\"><Result>"
           "<DIDL-Lite xmlns:dc=\"urn:d\" xmlns:upnp=\"urn:u\" xmlns=\"urn:n\">\n" +
           didl + "\n</DIDL-Lite></Result>" + counts +
           "<UpdateID>7</UpdateID></u:BrowseResponse></s:Body></s:Envelope>";
}

TEST(Parser, MakesMapsOfContainersItemsAndResources) {
    const std::string text = answer(
        "<container id=\"64\" parentID=\"0\" childCount=\"\"><dc:title>All &amp; more</dc:title>"
        "<container id=\"inner\"/></container>\n<item id=\"1\" parentID=\"64\" restricted=\"1\"> x"
        "<dc:title>One</dc:title><!-- c --><dc:creator/><upnp:artist role=\"a\">A</upnp:artist>"
        "<upnp:artist role=\"b\">B</upnp:artist><id>other</id><empty><b>t</b></empty>"
        "<res protocolInfo=\"p\" size=\"5\">http://a/1.mp3</res>"
        "<res size=\"6\" res=\"attribute\">http://a/1.wav<res duration=\"1\"/></res>"
        "<container id=\"unseen\"/></item><other><item id=\"2\"/></other>");
    EXPECT_EQ(dumpOf(text),
              "[0]:\n0: childCount=  \n1: container=  \n2: id=64  \n3: parentID=0  \n"
              "4: title=All & more  \n\n"
              "--\n"
              "[0]:\n0: artist=A  \n1: container=  \n2: creator=  \n3: empty=  \n4: id=1  \n"
              "5: parentID=64  \n6: restricted=1  \n7: title=One  \n-- child item --\n"
              "[0]:\n0: protocolInfo=p  \n1: res=http://a/1.mp3  \n2: size=5  \n\n"
              "[1]:\n0: res=http://a/1.wav  \n1: size=6  \n-- child item --\n"
              "[0]:\n0: duration=1  \n\n\n\n"
              "[1]:\n0: id=2  \n\n");
}

TEST(Parser, FindsValuesInANodeAndThenInItsResources) {
    Parser parser;
    ASSERT_EQ(parser.parse(answer("<item id=\"1\"><dc:creator/><res size=\"\" creator=\"c\">first"
                                  "</res><res size=\"7\" bitrate=\"8\">second</res></item>")),
              0);
    ItemNode &item = *parser.items->front();
    const std::pair<const char *, const char *> cases[] = {
        {"id", "1"},      {"creator", ""}, {"res", "first"}, {"size", "7"},
        {"bitrate", "8"}, {"none", ""},    {"", ""},
    };
    for (const auto &[key, value] : cases) {
        EXPECT_EQ(item.getValueByKey(key), value) << key;
    }
    EXPECT_EQ(ItemNode().getValueByKey("id"), "");
}

TEST(Parser, KeepsTheLaterOfTheTwoCounts) {
    const std::tuple<const char *, int> cases[] = {
        {"<NumberReturned>3</NumberReturned><TotalMatches>10</TotalMatches>", 10},
        {"<TotalMatches>10</TotalMatches><NumberReturned>3</NumberReturned>", 3},
        {"<TotalMatches>10</TotalMatches><NumberReturned/>", 10},
        {"<TotalMatches>10</TotalMatches><NumberReturned><b>3</b></NumberReturned>", 0},
        {"<TotalMatches> -4x</TotalMatches>", -4},
        {"<TotalMatches>many</TotalMatches>", 0},
        {"<TotalMatches>99999999999</TotalMatches>", 2147483647},
        {"", 0},
    };
    Parser parser;
    for (const auto &[counts, total] : cases) {
        parser.numberReturned = 9;
        ASSERT_EQ(parser.parse(answer("", counts)), 0) << counts;
        EXPECT_EQ(parser.totalMatches, total) << counts;
        EXPECT_EQ(parser.numberReturned, 0) << counts;
    }
}

TEST(Parser, AddsToItsListsAndLeavesThemAloneWhenThereIsNoDocument) {
    Parser parser;
    ASSERT_EQ(parser.parse(answer("<item id=\"1\"/>", "<TotalMatches>1</TotalMatches>")), 0);
    testing::internal::CaptureStderr();
    for (const std::string &bad :
         {std::string(), std::string("no XML"), answer("<item>R & B</item>"),
          answer("<item id=\"2\">"), answer("<item id=\"2\"/>\xE9\xFF"),
          answer("<item id=\"2\"/>\x01"), answer(repeated("<a>", 300) + repeated("</a>", 300)),
          answer("<item id=\"2\"/><?xml version=\"1.0\"?>"), std::string("<!DOCTYPE a>")}) {
        EXPECT_EQ(parser.parse(bad), -1) << bad.substr(0, 500);
    }
    EXPECT_EQ(parser.Parse(nullptr, 0), -1);
    EXPECT_EQ(parser.Parse(nullptr, 5), -1);
    EXPECT_EQ(parser.Parse("<item id=\"2\"/>", -1), -1);
    EXPECT_NE(testing::internal::GetCapturedStderr(), "") << "libxml2 says why";
    EXPECT_EQ(parser.totalMatches, 1);
    ASSERT_EQ(parser.parse("<item id=\"3\"/>"), 0);
    EXPECT_EQ(dump(parser), "--\n[0]:\n0: id=1  \n\n[1]:\n0: id=3  \n\n");
}

TEST(Parser, ReadsTheResponseOfABrowse) {
    DMABrowse browse(DMAGENT_BROWSE_METADATA, "");
    Parser parser;
    EXPECT_EQ(parser.Parse(&browse), -1);
    // Decoded in place: behind the end of the text stand bytes of the longer one that was there.
    char text[] = "<Result>&lt;item id=&quot;1&quot;/&gt;&lt;item/&gt;</Result>\n";
    browse.response = text;
    browse.responseSize = sizeof text - 1;
    browse.DecodeRDataHTML();
    EXPECT_EQ(parser.Parse(&browse), 0);
    EXPECT_EQ(dump(parser), "--\n[0]:\n0: id=1  \n\n[1]:\n\n");
}

TEST(Parser, KnowsNodesOfAnyTypeByTheirName) {
    EXPECT_EQ(
        dumpOf("<a><?item x?><!--item--><?container?><item id=\"1\"><?id 2?></item></a><?item?>"),
        "[0]:\n\n--\n[0]:\n\n[1]:\n0: id=1  \n\n[2]:\n\n");
    // A declared entity's text is read as markup where it stands by itself, as it is in a value.
    const std::string declared =
        "<!DOCTYPE a [<!ELEMENT item (#PCDATA)><!ENTITY t \"Mot&#246;r\">"
        "<!ENTITY e \"<item id='e'><t>&t;</t></item>\"><!ENTITY TotalMatches \"7\">"
        "<!ENTITY item \"<t>x</t>\">]>";
    EXPECT_EQ(dumpOf(declared + "<a>&e;</a>"),
              "--\n[0]:\n0: id=e  \n1: t=Mot\u00f6r  \n\n[1]:\n\n");
    EXPECT_EQ(dumpOf(declared + "<item id=\"&t;\"><t>&t;</t><u>x&t;</u></item>"),
              "--\n[0]:\n0: id=Mot\u00f6r  \n1: t=Mot\u00f6r  \n2: u=x  \n\n");
    EXPECT_EQ(dumpOf(declared + "<a>&item;</a>"), "--\n[0]:\n\n");
    Parser parser;
    ASSERT_EQ(parser.parse(declared + "<a>&TotalMatches;</a>"), 0);
    EXPECT_EQ(parser.totalMatches, 7);
}

TEST(Parser, TakesNoMoreThroughEntitiesThanWasSent) {
    const std::string declared = "<!DOCTYPE a [" + bomb("", "<item id='e'/>", 20);
    testing::internal::CaptureStderr();
    Parser few;
    ASSERT_EQ(few.parse(declared + "]><a>&e1;<item id=\"1\"/></a>"), 0);
    EXPECT_LE(few.items->size(), declared.size() / 7);
    EXPECT_EQ(few.items->front()->getValueByKey("id"), "e");
    EXPECT_EQ(few.items->back()->getValueByKey("id"), "1");
    few.parse(declared + "]><a>&e19;<item id=\"&e19;\"/></a>");
    few.parse("<!DOCTYPE a [<!ENTITY a \"&b;\"><!ENTITY b \"&a;\">]><a>&a;<item>&b;</item></a>");
    // Each declaration leads on to the next, and that one back to the first.
    few.parse("<!DOCTYPE a [<!ENTITY a \"<x/>\"><!ENTITY b \"&a;\">]><a>&b;&a;</a>");

    const std::string text(10000, 'x');
    Parser parser;
    ASSERT_EQ(parser.parse("<!DOCTYPE a [<!ENTITY e \"" + text + "\">]><a>" +
                           repeated("<item id=\"&e;\"/>", 1000) + "</a>"),
              0);
    testing::internal::GetCapturedStderr();
    EXPECT_EQ(parser.items->size(), 1000U);
    EXPECT_EQ(parser.items->front()->getValueByKey("id"), text);
    EXPECT_EQ(parser.items->back()->getValueByKey("id"), "");

    // Declarations that are passed by are not taken, and what is short enough still is.
    std::string passed = "<!DOCTYPE a [<!ENTITY l \"" + text + "\">";
    for (int i = 0; i < 253; ++i) {
        passed += "<!ENTITY n" + std::to_string(i) + " \"&#200;\">";
    }
    Parser other;
    ASSERT_EQ(
        other.parse(passed + "]><a>&n0;&n0;&n0;&n0;&n0;&n0;<item id=\"&l;\"/><item id=\"&l;\"/>"
                             "<item id=\"&n5;\"/></a>"),
        0);
    EXPECT_EQ(other.items->front()->getValueByKey("id"), text);
    EXPECT_EQ(other.items->back()->getValueByKey("id"), "\u00c8");
}

/* How many bytes libxml2 asks for while it reads a text. */
std::size_t bytesFor(const std::string &text) {
    static std::size_t bytes;
    bytes = 0;
    const auto allocate = [](std::size_t size) {
        bytes += size;
        return std::malloc(size);
    };
    Parser parser;
    testing::internal::CaptureStderr();
    xmlGcMemSetup(std::free, allocate, allocate, std::realloc, strdup);
    parser.parse(text);
    xmlGcMemSetup(std::free, std::malloc, std::malloc, std::realloc, strdup);
    testing::internal::GetCapturedStderr();
    return bytes;
}

/* What a document type adds to each element, or to itself, again and again. */
TEST(Parser, GrowsNoFurtherThanATextWithoutADocumentType) {
    const std::string large(100000, 'x');
    std::string many;
    for (int i = 0; i < 500; ++i) {
        many += " xmlns:p" + std::to_string(i) + " CDATA \"\"";
    }
    const std::string items = repeated("<item/>", 5000);
    const std::size_t usual = 20 * bytesFor("<a t=\"" + large + "\">" + items + "</a>");
    for (const std::string &declared :
         {"<!ATTLIST item xmlns:q CDATA \"" + large + "\">",
          "<!ATTLIST item xmlns:q CDATA \"" + large + "\" xmlns CDATA \"\">",
          "<!ATTLIST item xmlns:" + large.substr(0, 40000) + " CDATA \"x\">",
          "<!ATTLIST item" + many + ">",
          "<!ENTITY % p \"" + large.substr(0, 7000) + "\">" + repeated("%p;", 5000)}) {
        EXPECT_LT(bytesFor("<!DOCTYPE a [" + declared + "]><a>" + items + "</a>"), usual)
            << declared.substr(0, 60);
    }
    // Ends, and tells no endless story of it.
    EXPECT_LT(bytesFor("<!DOCTYPE a [" + bomb("%", "<?x?>", 5) + "%e4;]><a/>"), usual);
    Parser parser;
    ASSERT_EQ(parser.parse("<!DOCTYPE a [<!ENTITY % p \"<!ENTITY e 'x'>\">%p;]><item id=\"&e;\"/>"),
              0);
    EXPECT_EQ(parser.items->front()->getValueByKey("id"), "x");
}

TEST(Parser, FetchesNothingAndOpensNoFile) {
    const http_server::Server server(http_server::reply("<item id=\"fetched\"/>"));
    const std::string file = testing::TempDir() + "upnp_entity_" + std::to_string(getpid());
    std::ofstream(file) << "<item id=\"read\"/>";
    const int watch = inotify_init1(IN_NONBLOCK);
    inotify_add_watch(watch, file.c_str(), IN_OPEN | IN_ACCESS);
    testing::internal::CaptureStderr();
    for (const std::string &uri : {server.url("/x.dtd"), "file://" + file, file}) {
        for (const std::string &type :
             {"a SYSTEM \"" + uri + "\"", "a [<!ENTITY e SYSTEM \"" + uri + "\">]",
              "a [<!ENTITY % e SYSTEM \"" + uri + "\"> %e;]"}) {
            Parser parser;
            parser.parse("<!DOCTYPE " + type +
                         "><a xmlns:xi=\"http://www.w3.org/2001/XInclude\"><xi:include href=\"" +
                         uri + "\"/><item id=\"1\"><t>&e;</t></item></a>");
            const std::string found = dump(parser);
            EXPECT_EQ(found.find("read"), std::string::npos) << type;
            EXPECT_EQ(found.find("fetched"), std::string::npos) << type;
        }
    }
    testing::internal::GetCapturedStderr();
    char event[4096];
    EXPECT_EQ(read(watch, event, sizeof event), -1) << "the file was opened";
    EXPECT_TRUE(server.requests().empty());
    close(watch);
    std::filesystem::remove(file);
}

TEST(Parser, TakesDeepAndLargeAnswers) {
    EXPECT_EQ(dumpOf(repeated("<a>", 100) + "<item id=\"deep\"/>" + repeated("</a>", 100)),
              "--\n[0]:\n0: id=deep  \n\n");
    Parser parser;
    ASSERT_EQ(parser.parse("<item id=\"deep\">" + repeated("<res>1", 101) +
                           repeated("</res>", 101) + "</item>"),
              0);
    int depth = 0;
    for (const ItemNode *node = parser.items->front(); node->children != nullptr; ++depth) {
        node = node->children->front();
    }
    EXPECT_EQ(depth, 101);

    const std::string large(9900000, 'x');
    ASSERT_EQ(parser.parse(answer("<item title=\"" + large + "\"/>")), 0);
    EXPECT_EQ(parser.items->back()->getValueByKey("title"), large);
    testing::internal::CaptureStderr();
    EXPECT_EQ(parser.parse(answer("<item title=\"" + large + large + "\"/>")), -1);
    testing::internal::GetCapturedStderr();
    EXPECT_EQ(parser.items->size(), 2U);
}

}  // namespace

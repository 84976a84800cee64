/* usage: upnp_bench [Google Benchmark's options]
 *
 * Decodes and parses a Browse answer of 5 000 items through the library, beside the least that does
 * the same with libxml2: a walk over the tree of the text as it is once decoded, which makes the
 * same maps. And beside gupnp-av, where that was found, from the same bytes to
 * the same values; and its parser alone, which gets the DIDL-Lite document by itself. */
#include <benchmark/benchmark.h>
#include <libxml/parser.h>
#include <libxml/tree.h>
#include <vorelix/upnp/dmaparser.h>

#include <cstdlib>
#include <cstring>
#include <functional>
#include <list>
#include <map>
#include <memory>
#include <string>
#include <vector>

#ifdef VORELIX_GUPNP_AV
#include <libgupnp-av/gupnp-av.h>
#endif

#include "report.h"
#include "support/item_lists.h"

namespace {

constexpr int kItems = 5000;

std::string didl() {
    std::string text =
        "<DIDL-Lite xmlns:dc=\"http://purl.org/dc/elements/1.1/\" "
        "xmlns:upnp=\"urn:schemas-upnp-org:metadata-1-0/upnp/\" "
        "xmlns=\"urn:schemas-upnp-org:metadata-1-0/DIDL-Lite/\">";
    for (int i = 0; i < kItems; ++i) {
        const std::string number = std::to_string(i);
        text +=
            "<item id=\"1$4$" + number + "\" parentID=\"1$4\" restricted=\"1\" refID=\"64$0$" +
            number + "\"><dc:title>Rhythm &amp; Blues No. " + number +
            " (\"Live\")</dc:title><upnp:class>object.item.audioItem.musicTrack</upnp:class>"
            "<dc:creator>Some Artist</dc:creator><dc:date>2008-01-01</dc:date><upnp:artist>Some "
            "Artist</upnp:artist><upnp:album>An Album of Theirs</upnp:album><upnp:genre>Blues"
            "</upnp:genre><upnp:originalTrackNumber>" +
            std::to_string(i % 12 + 1) +
            "</upnp:originalTrackNumber><upnp:albumArtURI>http://192.0.2.7:8200/AlbumArt/" +
            number +
            ".jpg</upnp:albumArtURI><res size=\"5213412\" duration=\"0:03:37.000\" "
            "bitrate=\"24000\" sampleFrequency=\"44100\" nrAudioChannels=\"2\" protocolInfo=\""
            "http-get:*:audio/mpeg:DLNA.ORG_PN=MP3;DLNA.ORG_OP=01;DLNA.ORG_CI=0\">"
            "http://192.0.2.7:8200/MediaItems/" +
            number + ".mp3</res></item>";
    }
    return text + "</DIDL-Lite>";
}

std::string escaped(const std::string &text) {
    const std::map<char, const char *> entities = {
        {'&', "&amp;"}, {'<', "&lt;"}, {'>', "&gt;"}, {'"', "&quot;"}};
    std::string out;
    for (const char byte : text) {
        const auto found = entities.find(byte);
        found == entities.end() ? out += byte : out += found->second;
    }
    return out;
}

std::string answer(const std::string &result) {
    const std::string count = std::to_string(kItems);
    return "<?xml version=\"1.0\" encoding=\"utf-8\"?>\r\n<s:Envelope "
           "xmlns:s=\"http://schemas.xmlsoap.org/soap/envelope/\"><s:Body><u:BrowseResponse "
           "xmlns:u=\"urn:schemas-upnp-org:service:ContentDirectory:1\"><Result>" +
           result + "</Result><NumberReturned>" + count + "</NumberReturned><TotalMatches>" +
           count + "</TotalMatches><UpdateID>0</UpdateID></u:BrowseResponse></s:Body></s:Envelope>";
}

/* In bytes of all keys and values, so that the ways can be compared. */
std::size_t sizeOf(const std::map<std::string, std::string> &values) {
    std::size_t size = 0;
    for (const auto &[key, value] : values) {
        size += key.size() + value.size();
    }
    return size;
}

std::size_t throughLibrary(const std::string &body) {
    DMABrowse browse(DMAGENT_BROWSE_DIRECTCHILDREN, "");
    browse.response = static_cast<char *>(std::malloc(body.size() + 1));
    browse.responseSize = static_cast<unsigned int>(body.size());
    std::memcpy(browse.response, body.c_str(), body.size() + 1);
    browse.DecodeRDataHTML();
    DMAParser parser;
    parser.Parse(&browse);
    std::free(browse.response);
    std::size_t size = 0;
    for (const ItemNode *const item : *parser.items) {
        size += sizeOf(*item) + sizeOf(*item->children->front());
    }
    item_lists::release(parser.items);
    item_lists::release(parser.containers);
    return size;
}

struct Item {
    std::map<std::string, std::string> values;
    std::list<Item> resources;
};

std::string textOf(const xmlNode *node) {
    return node != nullptr && node->content != nullptr
               ? reinterpret_cast<const char *>(node->content)
               : "";
}

void read(const xmlNode &element, Item &item) {
    const auto nameOf = [](const xmlChar *name) { return reinterpret_cast<const char *>(name); };
    for (const xmlAttr *row = element.properties; row != nullptr; row = row->next) {
        item.values.emplace(nameOf(row->name), textOf(row->children));
    }
    for (const xmlNode *child = element.children; child != nullptr; child = child->next) {
        if (child->type != XML_ELEMENT_NODE) {
            continue;
        }
        if (std::strcmp(nameOf(child->name), "res") == 0) {
            Item &resource = item.resources.emplace_back();
            resource.values.emplace("res", textOf(child->children));
            read(*child, resource);
        } else {
            item.values.emplace(nameOf(child->name), textOf(child->children));
        }
    }
}

void walk(const xmlNode *node, std::list<Item> &items) {
    for (; node != nullptr; node = node->next) {
        if (std::strcmp(reinterpret_cast<const char *>(node->name), "item") == 0) {
            read(*node, items.emplace_back());
        } else {
            walk(node->children, items);
        }
    }
}

std::size_t throughLibxml(const std::string &text) {
    const std::unique_ptr<xmlDoc, decltype(&xmlFreeDoc)> document(
        xmlReadMemory(text.data(), static_cast<int>(text.size()), "", nullptr, 0), &xmlFreeDoc);
    std::list<Item> items;
    walk(xmlDocGetRootElement(document.get()), items);
    std::size_t size = 0;
    for (const Item &item : items) {
        size += sizeOf(item.values) + sizeOf(item.resources.front().values);
    }
    return size;
}

#ifdef VORELIX_GUPNP_AV
std::size_t lengthOf(const char *text) {
    return text != nullptr ? std::strlen(text) : 0;
}

/* Asks for what the maps of the other ways hold. */
void takeItem(GUPnPDIDLLiteParser *, GUPnPDIDLLiteObject *item, gpointer lengths) {
    std::size_t length = 0;
    for (const char *const text :
         {gupnp_didl_lite_object_get_id(item), gupnp_didl_lite_object_get_parent_id(item),
          gupnp_didl_lite_object_get_title(item), gupnp_didl_lite_object_get_upnp_class(item),
          gupnp_didl_lite_object_get_creator(item), gupnp_didl_lite_object_get_date(item),
          gupnp_didl_lite_object_get_artist(item), gupnp_didl_lite_object_get_album(item),
          gupnp_didl_lite_object_get_genre(item), gupnp_didl_lite_object_get_album_art(item),
          gupnp_didl_lite_item_get_ref_id(GUPNP_DIDL_LITE_ITEM(item))}) {
        length += lengthOf(text);
    }
    length += static_cast<std::size_t>(gupnp_didl_lite_object_get_track_number(item));
    GList *const resources = gupnp_didl_lite_object_get_resources(item);
    for (const GList *node = resources; node != nullptr; node = node->next) {
        auto *const resource = GUPNP_DIDL_LITE_RESOURCE(node->data);
        length += lengthOf(gupnp_didl_lite_resource_get_uri(resource));
        length += static_cast<std::size_t>(gupnp_didl_lite_resource_get_size64(resource) +
                                           gupnp_didl_lite_resource_get_duration(resource) +
                                           gupnp_didl_lite_resource_get_bitrate(resource) +
                                           gupnp_didl_lite_resource_get_sample_freq(resource) +
                                           gupnp_didl_lite_resource_get_audio_channels(resource));
        char *const protocol =
            gupnp_protocol_info_to_string(gupnp_didl_lite_resource_get_protocol_info(resource));
        length += lengthOf(protocol);
        g_free(protocol);
    }
    g_list_free_full(resources, g_object_unref);
    static_cast<std::vector<std::size_t> *>(lengths)->push_back(length);
}

/* The number of items. */
std::size_t didlThroughGupnp(const char *text, GCallback take) {
    std::vector<std::size_t> lengths;
    const std::unique_ptr<GUPnPDIDLLiteParser, decltype(&g_object_unref)> parser(
        gupnp_didl_lite_parser_new(), &g_object_unref);
    g_signal_connect(parser.get(), "item-available", take, &lengths);
    gupnp_didl_lite_parser_parse_didl(parser.get(), text, nullptr);
    return lengths.size();
}

/* The envelope as gupnp takes it apart: by libxml2, which undoes the escaping. */
std::size_t throughGupnp(const std::string &body) {
    const std::unique_ptr<xmlDoc, decltype(&xmlFreeDoc)> document(
        xmlReadMemory(body.data(), static_cast<int>(body.size()), "", nullptr, 0), &xmlFreeDoc);
    const xmlNode *result = xmlDocGetRootElement(document.get());
    while (std::strcmp(reinterpret_cast<const char *>(result->name), "Result") != 0) {
        result = result->children;
    }
    xmlChar *const didl = xmlNodeGetContent(result);
    const std::size_t items =
        didlThroughGupnp(reinterpret_cast<const char *>(didl), G_CALLBACK(takeItem));
    xmlFree(didl);
    return items;
}

/* Objects that nobody asks for anything. */
void countItem(GUPnPDIDLLiteParser *, GUPnPDIDLLiteObject *, gpointer lengths) {
    static_cast<std::vector<std::size_t> *>(lengths)->push_back(0);
}
#endif

void add(const std::string &name, std::size_t wanted, const std::function<std::size_t()> &way) {
    benchmark::RegisterBenchmark(name.c_str(),
                                 [way, wanted](benchmark::State &state) {
                                     for (auto unused : state) {
                                         static_cast<void>(unused);
                                         if (way() != wanted) {
                                             state.SkipWithError("not what is in the answer");
                                         }
                                     }
                                 })
        ->Unit(benchmark::kMillisecond)
        ->UseRealTime()
        ->Repetitions(9);
}

}  // namespace

int main(int argc, char **argv) {
    const std::string document = didl();
    const std::string body = answer(escaped(document));
    const std::string decoded = answer(document);
    const std::size_t size = throughLibrary(body);
    add("5000 items, beside libxml2/library", size, [&] { return throughLibrary(body); });
    add("5000 items, beside libxml2/raw", size, [&] { return throughLibxml(decoded); });
#ifdef VORELIX_GUPNP_AV
    add("5000 items, beside gupnp-av/library", size, [&] { return throughLibrary(body); });
    add("5000 items, beside gupnp-av/raw", kItems, [&] { return throughGupnp(body); });
    add("5000 items, beside gupnp-av without the envelope and any value/library", size,
        [&] { return throughLibrary(body); });
    add("5000 items, beside gupnp-av without the envelope and any value/raw", kItems,
        [&] { return didlThroughGupnp(document.c_str(), G_CALLBACK(countItem)); });
#endif
    benchmark::Initialize(&argc, argv);
    zano::bench::RatioReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    return 0;
}

/* The classes and commands against a media server as it comes, over real tagged files. */
#include <gtest/gtest.h>
#include <json/reader.h>
#include <vorelix/upnp/dmaparser.h>

#include <chrono>
#include <cstdint>
#include <set>
#include <sstream>
#include <thread>

#include "command_line.h"
#include "minidlna.h"
#include "support/item_lists.h"

namespace integration {
namespace {

constexpr const char *kAllMusic = "1$4";

struct Music {
    int files = 0;
    std::uintmax_t bytes = 0;
};

/* What MiniDLNA takes of the demo music: all but Opus. */
Music music() {
    Music music;
    for (const auto &file : std::filesystem::recursive_directory_iterator(VORELIX_MUSIC)) {
        if (file.is_regular_file() && file.path().extension() != ".opus") {
            ++music.files;
            music.bytes += file.file_size();
        }
    }
    EXPECT_GT(music.files, 20) << "make-demo-music has run";
    return music;
}

/* The answer to one request. */
class Answer : public DMAParser {
  public:
    Answer(const std::string &control, const std::string &id, int start = 0, int count = 0) {
        DMABrowse browse(DMAGENT_BROWSE_DIRECTCHILDREN, control);
        browse.objectID = id;
        browse.startingIndex = start;
        browse.requestedCount = count;
        isWhole = browse.Perform() == 0 && Parse(&browse) == 0;
        std::free(browse.response);
    }
    ~Answer() override {
        item_lists::release(containers);
        item_lists::release(items);
    }

    std::vector<std::string> values(ItemList *list, const char *key) const {
        std::vector<std::string> values;
        for (ItemNode *const node : *list) {
            values.push_back(node->getValueByKey(key));
        }
        return values;
    }

    bool isWhole;
};

/* Whether the scan has come to all files, some time soon. */
bool hasAll(const MiniDlna &server, int files) {
    for (int i = 0; i < 600; ++i) {
        const Answer answer(server.control(), kAllMusic, 0, 1);
        if (answer.isWhole && answer.totalMatches == files) {
            return true;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
    return false;
}

/* As they are tagged. */
const std::set<std::string> kTitles = {"She Said \"Hello\" & It's Fine",
                                       "<img src=x onerror=alert(1)>",
                                       "Rock & Roll & <b>Bold</b>",
                                       "'; DROP TABLE songs; --",
                                       "C:\\Music\\New Folder\\",
                                       "Crème Brûlée",
                                       "Straße nach Süden",
                                       "ΣΊΣΥΦΟΣ",
                                       "Ёлки и звёзды",
                                       "春の歌",
                                       "ドライブ"};

class MiniDlnaTest : public testing::Test {
  protected:
    void SetUp() override { ASSERT_TRUE(hasAll(server_, music_.files)) << server_.log(); }

    const Music music_ = music();
    const MiniDlna server_{VORELIX_MUSIC};
};

TEST_F(MiniDlnaTest, AnswersTheClasses) {
    const Answer root(server_.control(), "0");
    ASSERT_TRUE(root.isWhole);
    EXPECT_EQ(root.values(root.containers, "title"),
              (std::vector<std::string>{"Browse Folders", "Music", "Pictures", "Video"}));
    EXPECT_EQ(root.values(root.containers, "parentID"), std::vector<std::string>(4, "0"));
    EXPECT_EQ(root.totalMatches, 4);
    EXPECT_TRUE(root.items->empty());

    std::set<std::string> ids;
    std::set<std::string> titles;
    std::uintmax_t bytes = 0;
    for (int start = 0; start < music_.files; start += 7) {
        const Answer page(server_.control(), kAllMusic, start, 7);
        ASSERT_EQ(page.items->size(), static_cast<size_t>(std::min(7, music_.files - start)));
        EXPECT_EQ(page.totalMatches, music_.files);
        for (ItemNode *const item : *page.items) {
            ids.insert(item->getValueByKey("id"));
            titles.insert(item->getValueByKey("title"));
            bytes += std::stoull(item->getValueByKey("size"));
            EXPECT_EQ(item->getValueByKey("class"), "object.item.audioItem.musicTrack");
            EXPECT_EQ(item->getValueByKey("res").find(server_.url("/MediaItems/")), 0U);
            EXPECT_EQ(item->getValueByKey("protocolInfo").find("http-get:*:audio/"), 0U);
            EXPECT_EQ(item->getValueByKey("duration").find("0:00:0"), 0U);
        }
    }
    EXPECT_EQ(ids.size(), static_cast<size_t>(music_.files));
    EXPECT_EQ(bytes, music_.bytes) << "each file once";
    for (const std::string &title : kTitles) {
        EXPECT_EQ(titles.count(title), 1U) << title;
    }
}

Json::Value document(const std::string &text) {
    Json::Value value;
    std::istringstream(text) >> value;
    return value;
}

TEST_F(MiniDlnaTest, AnswersTheCommands) {
    const std::string url = server_.url("/rootDesc.xml");
    const auto run = [](std::vector<std::string> words) {
        words.insert(words.begin(), "upnp");
        const command_line::Ended ended = command_line::run({words});
        EXPECT_EQ(ended.status, 0) << ended.err;
        EXPECT_EQ(ended.err, "");
        return ended.out;
    };
    // The network may lose a question or its answer.
    Json::Value found;
    for (int i = 0; i < 5 && found.isNull(); ++i) {
        const Json::Value all = document(run({"servers", "--interface", "lo", "--json"}));
        for (const Json::Value &row : all["servers"]) {
            found = row["name"] == server_.name() ? row : found;
        }
    }
    EXPECT_EQ(found["controlUrl"], server_.control());
    EXPECT_NE(found["model"].asString().find("MiniDLNA"), std::string::npos);

    const Json::Value all = document(
        run({"browse", server_.name(), kAllMusic, "--all", "--interface", "lo", "--json"}));
    EXPECT_EQ(all["objects"].size(), static_cast<unsigned>(music_.files));
    EXPECT_EQ(all["total"], music_.files);
    EXPECT_EQ(all["repaired"], false);
    std::set<std::string> titles;
    for (const Json::Value &object : all["objects"]) {
        titles.insert(object["title"].asString());
    }
    for (const std::string &title : kTitles) {
        EXPECT_EQ(titles.count(title), 1U) << title;
    }
    const std::string count = std::to_string(music_.files);
    EXPECT_NE(run({"browse", url, kAllMusic, "--page-size", "5", "--page", "2"})
                  .find("\nobjects 6-10 of " + count + " (page 2 of "),
              std::string::npos);
    const std::string tree = run({"tree", url, "64", "--depth", "3"});
    EXPECT_NE(tree.find("春野/\n  夜曲集/\n    春の歌\n"), std::string::npos) << tree;
    EXPECT_NE(run({"caps", url}).find("Search by  dc:creator, "), std::string::npos);

    const command_line::Ended none = command_line::run({{"upnp", "browse", url, "nowhere"}});
    EXPECT_EQ(none.err, "vorelix: '" + server_.name() + "' at " + server_.control() +
                            ": it answered with error 701 (No such object error)\n");
}

}  // namespace
}  // namespace integration

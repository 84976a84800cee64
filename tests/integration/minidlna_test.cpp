/* The commands against a media server as it comes, over real tagged files. */
#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <cstdint>
#include <set>
#include <thread>

#include "command_line.h"
#include "support/files.h"
#include "support/json.h"
#include "support/program.h"

namespace integration {
namespace {

using command_line::run;

constexpr const char *kAllMusic = "1$4";

/* A MiniDLNA of a test's own, over the demo music: on the loopback interface and a free port, with
 * its database in a folder that goes with it. It ends with the test, however that ends. */
class MiniDlna {
  public:
    MiniDlna() {
        files::write(folder_.path("minidlna.conf"),
                     "port=" + std::to_string(port_) +
                         "\nnetwork_interface=lo\nmedia_dir=A," VORELIX_MUSIC "\nfriendly_name=" +
                         name() + "\ndb_dir=" + folder_.path("") + "\nlog_dir=" + folder_.path("") +
                         "\ninotify=no\nnotify_interval=60\n");
    }

    std::string name() const { return "R & B " + std::to_string(port_); }
    std::string url(const std::string &path) const {
        return "http://127.0.0.1:" + std::to_string(port_) + path;
    }
    /* Of the ContentDirectory. */
    std::string control() const { return url("/ctl/ContentDir"); }
    /* What it has to say, for messages of tests that fail. */
    std::string log() const { return files::read(folder_.path("minidlna.log")); }
    /* In the foreground, as system managers want it. */
    program::Start start() const {
        return {.path = VORELIX_MINIDLNAD,
                .argv = {"minidlnad", "-S", "-f", folder_.path("minidlna.conf"), "-P",
                         folder_.path("pid")},
                .output = program::Stream::Nowhere,
                .errors = program::Stream::Nowhere};
    }

  private:
    const files::Folder folder_;
    const int port_ = program::freePort();
};

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

class MiniDlnaTest : public testing::Test {
  protected:
    /* Waits until the scan has come to all files. */
    void SetUp() override {
        const std::string all = "objects 1-1 of " + std::to_string(music_.files) + " ";
        constexpr int kLooks = 600;
        for (int i = 0; i < kLooks; ++i) {
            const auto look =
                run({{"upnp", "browse", server_.control(), kAllMusic, "--limit", "1"}});
            if (look.out.find(all) != std::string::npos) {
                return;
            }
            std::this_thread::sleep_for(std::chrono::milliseconds(100));
        }
        FAIL() << server_.log();
    }

    /* What a command says that has to succeed. */
    static std::string says(std::vector<std::string> words) {
        words.insert(words.begin(), "upnp");
        const command_line::Ended ended = run({words});
        EXPECT_EQ(ended.status, 0) << ended.err;
        EXPECT_EQ(ended.err, "");
        return ended.out;
    }

    void TearDown() override { process_.stop(SIGTERM); }

    const Music music_ = music();
    const MiniDlna server_;
    program::Process process_{server_.start()};
};

TEST_F(MiniDlnaTest, AnswersTheCommands) {
    const std::string url = server_.url("/rootDesc.xml");
    // The network may lose a question or its answer.
    Json::Value found;
    for (int i = 0; i < 5 && found.isNull(); ++i) {
        const Json::Value all = json::parsed(says({"servers", "--interface", "lo", "--json"}));
        for (const Json::Value &row : all["servers"]) {
            found = row["name"] == server_.name() ? row : found;
        }
    }
    EXPECT_EQ(found["controlUrl"], server_.control());
    EXPECT_NE(found["model"].asString().find("MiniDLNA"), std::string::npos);

    const Json::Value all = json::parsed(
        says({"browse", server_.name(), kAllMusic, "--all", "--interface", "lo", "--json"}));
    EXPECT_EQ(all["objects"].size(), static_cast<unsigned>(music_.files));
    EXPECT_EQ(all["total"], music_.files);
    EXPECT_EQ(all["repaired"], false);
    std::set<std::string> ids;
    std::set<std::string> titles;
    std::uintmax_t bytes = 0;
    for (const Json::Value &object : all["objects"]) {
        ids.insert(object["id"].asString());
        titles.insert(object["title"].asString());
        EXPECT_EQ(object["values"]["class"], "object.item.audioItem.musicTrack");
        const Json::Value &file = object["resources"][0];
        bytes += std::stoull(file["size"].asString());
        EXPECT_EQ(file["res"].asString().find(server_.url("/MediaItems/")), 0U);
        EXPECT_EQ(file["protocolInfo"].asString().find("http-get:*:audio/"), 0U);
        EXPECT_EQ(file["duration"].asString().find("0:00:0"), 0U);
    }
    EXPECT_EQ(ids.size(), static_cast<size_t>(music_.files));
    EXPECT_EQ(bytes, music_.bytes) << "each file once";
    for (const char *title :
         {"She Said \"Hello\" & It's Fine", "<img src=x onerror=alert(1)>",
          "Rock & Roll & <b>Bold</b>", "'; DROP TABLE songs; --", "C:\\Music\\New Folder\\",
          "Crème Brûlée", "Straße nach Süden", "ΣΊΣΥΦΟΣ", "Ёлки и звёзды", "春の歌", "ドライブ"}) {
        EXPECT_EQ(titles.count(title), 1U) << title;
    }
    const std::string count = std::to_string(music_.files);
    EXPECT_NE(says({"browse", url, kAllMusic, "--page-size", "5", "--page", "2"})
                  .find("\nobjects 6-10 of " + count + " (page 2 of "),
              std::string::npos);
    const std::string tree = says({"tree", url, "64", "--depth", "3"});
    EXPECT_NE(tree.find("春野/\n  夜曲集/\n    春の歌\n"), std::string::npos) << tree;
    EXPECT_NE(says({"caps", url}).find("Search by  dc:creator, "), std::string::npos);

    const command_line::Ended none = run({{"upnp", "browse", url, "nowhere"}});
    EXPECT_EQ(none.err, "vorelix: '" + server_.name() + "' at " + server_.control() +
                            ": it answered with error 701 (No such object error)\n");
}

}  // namespace
}  // namespace integration

/* The commands of whole media databases. */
#include "command_line.h"
#include "support/files.h"
#include "system_paths_internal.h"

namespace command_line {
namespace {

class Databases : public CommandLine {
  protected:
    Databases() : copy_("sqlite:" + (folder_ / "copy.db").string()) {}

    void fillDatabase() const {
        std::vector<zano::mediadb::Song> songs(3);
        for (size_t i = 0; i < songs.size(); ++i) {
            songs[i].path = folder_ / std::to_string(i);
        }
        fill(songs);
    }

    const std::string copy_;
};

TEST_F(Databases, AreCopiedCheckedAndBroughtUpToDate) {
    fillDatabase();
    const Ended copied = run({{"db", "copy", location_, copy_}});
    EXPECT_EQ(copied.out, copy_ + ": 3 songs, 0 playlists, copied from " + location_ + "\n");
    EXPECT_EQ(copied.err, "") << "no terminal";
    EXPECT_EQ(run({{"db", "check", copy_}}).out, copy_ + ": 3 songs, 0 playlists, no damage\n");
    EXPECT_EQ(run({{"db", "migrate"}}).out, location_ + ": schema 2 is up to date\n");

    const Ended refused = run({{"db", "copy", location_, copy_}});
    EXPECT_EQ(refused.status, 1);
    EXPECT_EQ(refused.err, "vorelix: " + copy_ +
                               ": it holds 3 songs and 0 playlists already; --force replaces it\n");
    Json::Value answer = answerOf({"db", "copy", location_, copy_, "--force"});
    EXPECT_EQ(answer["to"], copy_);
    EXPECT_EQ(answer["songs"], 3);
    answer = answerOf({"db", "check"});
    EXPECT_EQ(answer["location"], location_);
    EXPECT_EQ(answer["isIndexed"], true);
    answer = answerOf({"db", "migrate"});
    EXPECT_EQ(answer["schema"], 2);
    EXPECT_EQ(answer["changed"], false);
}

TEST_F(Databases, ThatAreMissingOrBadAreComplaintsAndStayAsTheyAre) {
    files::write(database_, "text");
    for (const std::string command : {"check", "migrate"}) {
        const Ended ended = run({{"db", command, "sqlite:" + database_.string()}});
        EXPECT_EQ(ended.status, 1) << command;
        EXPECT_NE(ended.err.find(database_.string() + ": "), std::string::npos) << ended.err;
        EXPECT_EQ(run({{"db", command, copy_}}).status, 1) << command;
        EXPECT_FALSE(std::filesystem::exists(folder_ / "copy.db")) << command;
        const Ended unreachable =
            run({{"db", command, "postgresql://me:secret@/music?host=/missing"}});
        EXPECT_EQ(unreachable.status, 1);
        EXPECT_EQ(unreachable.err.find("vorelix: postgresql://me:***@/music?host=/missing: "), 0U)
            << unreachable.err;
    }
    EXPECT_EQ(files::read(database_), "text");
    EXPECT_EQ(run({{"db", "copy", copy_}}).status, 2);
}

}  // namespace
}  // namespace command_line

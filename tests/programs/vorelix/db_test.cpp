/* The commands of whole media databases. */
#include "command_line.h"

namespace command_line {
namespace {

class Databases : public CommandLine {
  protected:
    Databases() : CommandLine({"db"}), copy_("sqlite:" + (folder_ / "copy.db").string()) {}

    const std::string copy_;
};

TEST_F(Databases, AreCopiedCheckedAndBroughtUpToDate) {
    fillWithLetters(3, folder_);
    EXPECT_EQ(says({"copy", location_, copy_}),
              copy_ + ": 3 songs, 0 playlists, copied from " + location_ + "\n");
    EXPECT_EQ(says({"check", copy_}), copy_ + ": 3 songs, 0 playlists, no damage\n");
    const int schema = location_.starts_with("sqlite:") ? 2 : 3;
    EXPECT_EQ(says({"migrate"}),
              location_ + ": schema " + std::to_string(schema) + " is up to date\n");
    EXPECT_EQ(
        fails({"copy", location_, copy_}),
        "vorelix: " + copy_ + ": it holds 3 songs and 0 playlists already; --force replaces it\n");
    Json::Value answer = answerOf({"copy", location_, copy_, "--force"});
    EXPECT_EQ(answer["to"], copy_);
    EXPECT_EQ(answer["songs"], 3);
    answer = answerOf({"check"});
    EXPECT_EQ(answer["location"], location_);
    EXPECT_EQ(answer["isIndexed"], true);
    answer = answerOf({"migrate"});
    EXPECT_EQ(answer["schema"], schema);
    EXPECT_EQ(answer["changed"], false);
}

TEST_F(Databases, ThatAreMissingOrBadAreComplaintsAndStayAsTheyAre) {
    files::write(database_, "text");
    for (const std::string command : {"check", "migrate"}) {
        EXPECT_TRUE(
            contains(fails({command, "sqlite:" + database_.string()}), database_.string() + ": "));
        fails({command, copy_});
        EXPECT_FALSE(std::filesystem::exists(folder_ / "copy.db")) << command;
        EXPECT_TRUE(contains(fails({command, "postgresql://me:secret@/music?host=/missing"}),
                             "vorelix: postgresql://me:***@/music?host=/missing: "));
    }
    EXPECT_EQ(files::read(database_), "text");
}

}  // namespace
}  // namespace command_line

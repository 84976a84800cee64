#include <vorelix/library/musiclib.h>

#include "support/platform_stand_in.h"

namespace {

using stand_in::outcome;
using stand_in::row;
using stand_in::script;

/* What comes of telling the indexer counts for the removal alone. */
class PlaylistRows : public stand_in::Test {
  protected:
    PlaylistRows() { script().noticed = -5; }

    const ZANO_MEDIA_INFO playlist = row(7, "a.m3u");
};

TEST_F(PlaylistRows, Inserted) {
    const std::string saved = "save(3, 7 a.m3u /volume1/music/a.m3u)\n";
    EXPECT_EQ(outcome(ZANOPlaylistDBSave(&playlist)),
              "0 " + saved + "notice(\"/volume1/music/a.m3u\", null, 1)\n");
    script().saved = -1;
    EXPECT_EQ(outcome(ZANOPlaylistDBSave(&playlist)),
              "-1 " + saved + "3 musiclib.cpp:499 Failed to insert into playlist table.\n");
}

TEST_F(PlaylistRows, Updated) {
    const std::string updated = "update(3, 7 a.m3u /volume1/music/a.m3u)\n";
    EXPECT_EQ(outcome(ZANOPlaylistDBUpdate(&playlist, nullptr)),
              "0 " + updated + "notice(\"/volume1/music/a.m3u\", null, 5)\n");
    EXPECT_EQ(outcome(ZANOPlaylistDBUpdate(&playlist, "/b.m3u")),
              "0 " + updated + "notice(\"/volume1/music/a.m3u\", \"/b.m3u\", 4)\n");
    script().updated = -1;
    EXPECT_EQ(outcome(ZANOPlaylistDBUpdate(&playlist, "/b.m3u")),
              "-1 " + updated + "3 musiclib.cpp:525 Failed to update playlist in DB.\n");
}

TEST_F(PlaylistRows, DeletedByTheDatabaseOrElseByTheIndexer) {
    const std::string deleted = "-5 delete(3, \"/a b.m3u\")\n";
    const std::string noticed = "notice(\"/a b.m3u\", null, 2)\n";
    EXPECT_EQ(outcome(ZANOPlaylistDBDelete("/a b.m3u")), deleted + noticed);
    script().deleted = -1;
    EXPECT_EQ(
        outcome(ZANOPlaylistDBDelete("/a b.m3u")),
        deleted + "exec " ZANO_ROOT "/usr/zano/bin/zanoindex \"-d\" \"/a b.m3u\"\n" + noticed);
}

}  // namespace

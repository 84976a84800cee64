#include <vorelix/library/musiclib.h>

#include "support/platform_stand_in.h"

namespace {

using stand_in::row;
using stand_in::script;
using stand_in::takeTrace;

class PlaylistRows : public stand_in::Test {};

TEST_F(PlaylistRows, Inserted) {
    const ZANO_MEDIA_INFO playlist = row(7, "a.m3u");
    script().noticed = -1;
    EXPECT_EQ(ZANOPlaylistDBSave(&playlist), 0);
    EXPECT_EQ(takeTrace(),
              "save(3, 7 a.m3u /volume1/music/a.m3u)\n"
              "notice(\"/volume1/music/a.m3u\", null, 1)\n");
    script().saved = -1;
    EXPECT_EQ(ZANOPlaylistDBSave(&playlist), -1);
    EXPECT_EQ(takeTrace(),
              "save(3, 7 a.m3u /volume1/music/a.m3u)\n"
              "3 musiclib.cpp:499 Failed to insert into playlist table.\n");
}

TEST_F(PlaylistRows, Updated) {
    const ZANO_MEDIA_INFO playlist = row(7, "a.m3u");
    script().noticed = -1;
    EXPECT_EQ(ZANOPlaylistDBUpdate(&playlist, nullptr), 0);
    EXPECT_EQ(takeTrace(),
              "update(3, 7 a.m3u /volume1/music/a.m3u)\n"
              "notice(\"/volume1/music/a.m3u\", null, 5)\n");
    EXPECT_EQ(ZANOPlaylistDBUpdate(&playlist, "/b.m3u"), 0);
    EXPECT_EQ(takeTrace(),
              "update(3, 7 a.m3u /volume1/music/a.m3u)\n"
              "notice(\"/volume1/music/a.m3u\", \"/b.m3u\", 4)\n");
    script().updated = -1;
    EXPECT_EQ(ZANOPlaylistDBUpdate(&playlist, "/b.m3u"), -1);
    EXPECT_EQ(takeTrace(),
              "update(3, 7 a.m3u /volume1/music/a.m3u)\n"
              "3 musiclib.cpp:525 Failed to update playlist in DB.\n");
}

TEST_F(PlaylistRows, DeletedByTheDatabaseOrElseByTheIndexer) {
    script().noticed = -5;
    EXPECT_EQ(ZANOPlaylistDBDelete("/a b.m3u"), -5);
    EXPECT_EQ(takeTrace(), "delete(3, \"/a b.m3u\")\nnotice(\"/a b.m3u\", null, 2)\n");
    script().deleted = -1;
    script().noticed = 0;
    EXPECT_EQ(ZANOPlaylistDBDelete("/a b.m3u"), 0);
    EXPECT_EQ(takeTrace(), "delete(3, \"/a b.m3u\")\nexec " ZANO_ROOT
                           "/usr/zano/bin/zanoindex \"-d\" \"/a b.m3u\"\n"
                           "notice(\"/a b.m3u\", null, 2)\n");
}

}  // namespace

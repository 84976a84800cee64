#include <vorelix/playlists/playlist.h>

#include <climits>
#include <functional>
#include <sstream>
#include <string>
#include <tuple>
#include <vector>

#include "families.h"
#include "support/failing_allocator.h"
#include "support/files.h"
#include "support/platform_stand_in.h"

namespace {

using playlists::Family;
using playlists::kFamilies;
using stand_in::outcome;
using stand_in::script;
using stand_in::takeTrace;

/* Each name is a song beside the playlist; names are parted by blanks. */
class Edit : public stand_in::Test,
             public testing::WithParamInterface<Family>,
             protected files::Folder {
  protected:
    Edit() {
        script().rows = {stand_in::row(12, "")};
        file.copy(script().rows[0].path, file.size());
        script().rows[0].path[file.size()] = '\0';
    }

    std::vector<ZANO_MEDIA_INFO> songs(const std::string &names) const {
        std::vector<ZANO_MEDIA_INFO> made;
        std::istringstream words(names);
        for (std::string name; words >> name;) {
            made.push_back(stand_in::row(1, ""));
            path(name).copy(made.back().path, sizeof made.back().path - 1);
        }
        return made;
    }

    void given(const std::string &names) const {
        script().entries = songs(names);
        files::write(file, "before");
    }

    std::string contents() const {
        std::string text = files::read(file);
        if (text.rfind("#EXTM3U\r\n", 0) == 0) {
            text.erase(0, 9);
        }
        for (auto end = text.find("\r\n"); end != std::string::npos; end = text.find("\r\n")) {
            text.replace(end, 2, end + 2 == text.size() ? "" : " ");
        }
        return text;
    }

    const char *playlist() const { return GetParam().isShared ? "12" : file.c_str(); }

    int remove(const char *selection) const {
        return GetParam().removeSongs(playlist(), selection);
    }
    int removeMissing() const { return GetParam().removeMissing(playlist()); }
    int update(const std::string &names, int start, int count) const {
        return withRecords(names, [&](ZANO_PLAYLIST_REC *records) {
            return GetParam().updateSongs(playlist(), records, start, count);
        });
    }
    int append(const std::string &names, int count) const {
        return withRecords(names, [&](ZANO_PLAYLIST_REC *records) {
            return GetParam().appendSongs(playlist(), records, count);
        });
    }

    /* What an edit asks for before it changes anything. */
    static std::string looked() {
        return GetParam().isShared ? "open(3, \"path\", \"id = 12\", null, null, 0, 0, 0)\nclose\n"
                                   : "";
    }
    std::string parsed(const std::string &fields) const {
        return "parse(" + (GetParam().isShared ? "id \"12\"" : "\"" + file + "\"") + ", 0, 0, \"" +
               fields + "\", 1)\n";
    }
    static std::string line(const std::string &shared, const std::string &personal,
                            const std::string &text) {
        return "3 playlist.cpp" + (GetParam().isShared ? shared : personal) + " " + text + "\n";
    }

    const std::string file = path("l.m3u");

  private:
    int withRecords(const std::string &names,
                    const std::function<int(ZANO_PLAYLIST_REC *)> &edit) const {
        std::vector<ZANO_PLAYLIST_REC> nodes;
        for (const ZANO_MEDIA_INFO &song : songs(names)) {
            nodes.push_back({song, {nullptr}});
        }
        for (std::size_t index = 1; index < nodes.size(); ++index) {
            nodes[index - 1].next = &nodes[index];
        }
        return edit(nodes.empty() ? nullptr : nodes.data());
    }
};

INSTANTIATE_TEST_SUITE_P(, Edit, testing::ValuesIn(kFamilies));

const std::string kSorted = "sort(0 items, 1)\n";
const char *const kRemovalFields = "id, path, title, album";

TEST_P(Edit, RemovesPositionsOfTheFileAsItWas) {
    const std::tuple<const char *, const char *, const char *> cases[] = {
        {"a b c", "1", "a c"},
        {"a b c", "0,0,9", "b c"},
        {"a b c", "2,1,0", ""},
        {"a b c", " 1,01,+1,1x,,-1,4294967297", "a b c"},
        {"a b c d e f g h i j k", "10,2,0", "b d e f g h i j"},
    };
    for (const auto &[entries, selection, left] : cases) {
        given(entries);
        EXPECT_EQ(outcome(remove(selection)), "0 " + looked() + kSorted + parsed(kRemovalFields));
        EXPECT_EQ(contents(), left) << selection;
    }
    // An empty selection is a success.
    given("a b");
    const std::string expected =
        "0 " + looked() + kSorted + line(" (999)", " (1518)", "There is no selected item.");
    for (const bool splitFails : {false, true}) {
        script().splitFails = splitFails;
        EXPECT_EQ(outcome(remove("")), expected);
        EXPECT_EQ(contents(), "before");
    }
}

TEST_P(Edit, ReplacesARun) {
    const std::tuple<const char *, const char *, int, int, const char *> cases[] = {
        {"a b c", "x", 1, 0, "a x b c"},
        {"a b c", "x", 1, 1, "a x c"},
        {"a b c", "x y", 1, 1, "a x y c"},
        {"a b c", "x", 0, 2, "x c"},
        {"a b c", "x y z", 0, 3, "x y z"},
        {"a b c", "x", 3, 0, "a b c x"},
        {"a b c", "x", 1, INT_MAX, "a x"},
        // A size that is too small for all of it.
        {"a b c", "x y", 3, 1, "a b c x"},
        {"a b", "x y z", 1, 0, "a x y"},
        {"a", "x y z", 0, 0, "x y z"},
        // Starts and counts below 0.
        {"a b c", "x", -1, 0, "x a b c"},
        {"a b c", "x", -1, 2, "x b c"},
        {"a b c", "x", -2, 1, "x a b"},
        {"a b c", "x", INT_MIN, -1, "x a b c"},
        {"a b c", "x", 2, -2, "a b x a b c"},
    };
    for (const auto &[entries, records, start, count, expected] : cases) {
        given(entries);
        EXPECT_EQ(outcome(update(records, start, count)), "0 " + looked() + parsed("*"));
        EXPECT_EQ(contents(), expected)
            << entries << " | " << records << " " << start << " " << count;
    }
    given("a b c");
    for (const auto &[start, count, total] : {std::tuple{3, 1, 3}, {4, 0, 4}, {INT_MAX, 0, 4}}) {
        EXPECT_EQ(outcome(update("x", start, count)),
                  "-1 " + looked() + parsed("*") +
                      line(":1096", ":1687",
                           "Bad parameters. Start[" + std::to_string(start) + "] > TotalRow[" +
                               std::to_string(total) + "]"));
        EXPECT_EQ(contents(), "before") << start;
    }
}

TEST_P(Edit, AppendsAsManyAsCounted) {
    const std::tuple<const char *, int, const char *> cases[] = {
        {"a b", 2, "a b x y"},   {"a b", 1, "a b x"},   {"a b", 0, "a b"}, {"a b", -7, "a b"},
        {"a b", INT_MIN, "a b"}, {"a b", 9, "a b x y"}, {"", 2, "x y"},
    };
    for (const auto &[entries, count, expected] : cases) {
        given(entries);
        EXPECT_EQ(outcome(append("x y", count)), "0 " + looked() + parsed("*"));
        EXPECT_EQ(contents(), expected) << entries << count;
    }
}

TEST_P(Edit, KeepsTracksAddressesAndUsb) {
    given("kept gone");
    script().entries[0].id = -1;
    script().entries[1].id = 0;
    for (const char *path : {"HTTP://host/x", "https://host/x", "/usb/a.mp3", "http:/a", ""}) {
        script().entries.push_back({});
        std::string(path).copy(script().entries.back().path, 100);
    }
    EXPECT_EQ(outcome(removeMissing()), "0 " + looked() + parsed("*"));
    EXPECT_EQ(contents(), "kept HTTP://host/x /usb/a.mp3");

    given("gone");
    script().entries[0].id = 0;
    EXPECT_EQ(removeMissing(), 0);
    EXPECT_EQ(contents(), "");
}

/* Although the parser gives more entries than it counts. */
TEST_P(Edit, NothingIsWrittenBehindTheArray) {
    script().missingFromTotal = 2;
    for (const auto &[edit, expected] :
         {std::pair<std::function<int()>, const char *>{[&] { return append("x", 1); }, "a b"},
          {[&] { return update("x", 0, 0); }, "x a"},
          {[&] { return removeMissing(); }, "a"}}) {
        given("a b c");
        EXPECT_EQ(edit(), 0) << expected;
        EXPECT_EQ(contents(), expected);
    }
    takeTrace();
    script().missingFromTotal = 4;
    EXPECT_EQ(outcome(update("x", 0, 0)),
              "-1 " + looked() + parsed("*") + line(":1077", ":1668", "Failed to parse playlist."));
}

TEST_P(Edit, PlaylistsThatCannotBeRead) {
    given("");
    const std::string read = "-1 " + looked() + parsed("*");
    EXPECT_EQ(outcome(remove("0")), "-1 " + looked() + kSorted + parsed(kRemovalFields) +
                                        line(" (1006)", " (1525)", "pMusicRec is null."));
    EXPECT_EQ(outcome(update("x", 0, 0)),
              read + line(":1077", ":1668", "Failed to parse playlist."));
    const std::string shown = GetParam().isShared ? " (12, " + file + ")" : ": " + file;
    EXPECT_EQ(outcome(removeMissing()),
              read + line(":1271", ":1598", "Parse playlist" + shown + " return NULL."));
    EXPECT_EQ(contents(), "before");
}

TEST_P(Edit, FilesThatCannotBeWritten) {
    given("a b c");
    std::filesystem::remove(file);
    std::filesystem::create_directory(file);
    const std::string notOpened = ": Failed to open " + file + ".\n";
    const std::string notUpdated = "Failed to update playlist.(" + file + ")";
    const std::string read = "-1 " + looked() + parsed("*") + "3 playlist.cpp(861)" + notOpened;
    EXPECT_EQ(outcome(remove("0")), "-1 " + looked() + kSorted + parsed(kRemovalFields) +
                                        "3 playlist.cpp(732)" + notOpened +
                                        line(" (1042)", " (1561)", notUpdated));
    EXPECT_EQ(outcome(update("x", 0, 0)), read + line(" (1138)", " (1729)", notUpdated));
    EXPECT_EQ(outcome(append("x", 1)), read + line(" (1199)", " (1471)", notUpdated));
    EXPECT_EQ(outcome(removeMissing()),
              read + line(":1296", ":1623", "Failed to write playlist.(" + file + ")"));
}

TEST_P(Edit, OutOfMemory) {
    given("a b c");
    const std::string noList = line(" (992)", " (1511)", "Failed to malloc list.");
    script().splitFails = true;
    EXPECT_EQ(outcome(remove("0")), "-1 " + looked() + kSorted + noList);
    script().stringListFails = true;
    EXPECT_EQ(outcome(remove("0")), "-1 " + looked() + noList);

    const std::tuple<std::function<int()>, std::size_t, std::string> cases[] = {
        {[&] { return update("x", 9, 0); }, 5, line(":1090", ":1681", "Failed to calloc()")},
        {[&] { return append("x", 4); }, 8, ""},
        {[&] { return removeMissing(); }, 4, ""},
    };
    for (const auto &[edit, pointers, logged] : cases) {
        failing_allocator::failOnSize(pointers * sizeof(void *));
        EXPECT_EQ(outcome(edit()), "-1 " + looked() + parsed("*") + logged);
        EXPECT_TRUE(failing_allocator::hasFailed()) << pointers;
    }
    EXPECT_EQ(contents(), "before");
}

TEST_P(Edit, BadParameters) {
    const auto bad = [](const std::string &shared, const std::string &personal) {
        return "-1 " + line(shared, personal, "Bad parameter.");
    };
    ZANO_PLAYLIST_REC record{};
    EXPECT_EQ(outcome(GetParam().removeSongs(nullptr, "0")), bad(" (979)", " (1505)"));
    EXPECT_EQ(outcome(remove(nullptr)), bad(" (979)", " (1505)"));
    EXPECT_EQ(outcome(GetParam().updateSongs(nullptr, &record, 0, 0)), bad(" (1065)", " (1661)"));
    EXPECT_EQ(outcome(update("", 0, 0)), bad(" (1065)", " (1661)"));
    EXPECT_EQ(outcome(GetParam().appendSongs(nullptr, &record, 1)), bad(" (1161)", " (1438)"));
    EXPECT_EQ(outcome(append("", 0)), bad(" (1161)", " (1438)"));
    EXPECT_EQ(outcome(GetParam().removeMissing(nullptr)), bad(":1258", ":1592"));
}

class SharedPlaylist : public Edit {};
INSTANTIATE_TEST_SUITE_P(, SharedPlaylist, testing::Values(kFamilies[0]));

/* The removals ask for the file whatever the lookup gave, the others for what it gave. */
TEST_P(SharedPlaylist, IdsWithoutAFile) {
    const std::string unit = "-1 " + looked() + "3 playlist.cpp";
    const auto expectRemovalsToMiss = [&](const std::string &shown) {
        const std::string text = " Playlist(12, " + shown + ") does not exist.\n";
        EXPECT_EQ(outcome(remove("0")), unit + " (986)" + text);
        EXPECT_EQ(outcome(removeMissing()), unit + ":1265" + text);
    };
    script().entries = songs("a");
    expectRemovalsToMiss(file);
    EXPECT_EQ(outcome(append("x", 1)), "0 " + looked() + parsed("*"));
    script().rows.clear();
    expectRemovalsToMiss("");
    EXPECT_EQ(outcome(update("x", 0, 0)), unit + " (1070) Failed to get playlist path.\n");
    EXPECT_EQ(outcome(append("x", 1)), unit + " (1166) Failed to get playlist path.\n");
}

}  // namespace

/* Takes the place of the media database, of the playlist parser, of the music link, of programs
 * started, of volumes and of the system log.
 *
 * A test program that compiles platform_stand_in.cpp in supplies these functions itself, and the
 * library reaches them over the dynamic symbol table, as it reaches the platform. The escaping
 * functions and the string list stay the platform's own, but can be told to fail. What the
 * library asks for and logs is kept as text, one line for each call:
 *
 *     open(0, "*", null, null, "RANDOM()", 0, 50, 0)
 *     close
 *     count(0, "id", null, 0, 0)
 *     3 musiclib.cpp (84) Bad parameter.
 */
#pragma once

#include <gtest/gtest.h>
#include <vorelix/records.h>

#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

namespace stand_in {

/* What the stand-ins answer. */
struct Script {
    std::vector<ZANO_MEDIA_INFO> rows;
    int rowCount = 0;  // the fourth field of a result
    int count = 0;     // the answer of MediaInfoDBGetCount
    bool openFails = false;
    std::string musicRoot = "/volume1/music";
    int linkError = 0;  // errno of a music link that cannot be read
    bool quotesFail = false;
    bool backslashesFail = false;
    int backslashSize = 0;  // kept here: the size that ZANODBEscapeBackslash was given
    bool templateFails = false;
    bool stringListFails = false;
    bool splitFails = false;  // KLIBCStrSep
    bool textFails = false;   // KLIBCStrGet
    int saved = 0;            // the answers of MediaInfoDBSave, Update and Delete
    int updated = 0;
    int deleted = 0;
    int volumeResult = 0;  // the answer of VolumePathParse, and the type that it gives all paths
    int volumeType = 1;    // but those below /usb, which are on a USB volume
    bool unlockFails = false;
    int noticed = 0;                       // the answer of KLIBZanoFileIndexAdd
    std::vector<ZANO_MEDIA_INFO> entries;  // of every playlist; without any the parser gives null
    int missingFromTotal = 0;              // how many of them the parser does not count
};
Script &script();

/* The calls since the last one, a line feed behind each. A program that the library starts is not
 * run; its line is: exec PROGRAM "first" "second". */
std::string takeTrace();

/* The result of a call and a blank, and the calls and lines of it: "-1 3 musiclib.cpp (84) ..." */
std::string outcome(int result);

/* The number of results that were opened and not closed; counts from 0 again after it. */
int takeOpenResults();

/* A row with an id and a title; the title also stands in the path. */
ZANO_MEDIA_INFO row(int id, const std::string &title);

/* All of a row, to compare. */
std::string bytes(const ZANO_MEDIA_INFO &row);

/* "id title, id title" of songs; "id title album path", a line for each, of playlists. */
std::string textOf(const ZANO_PLAYLIST_REC *list);
std::string textOf(const ZANO_PLAYLIST *list);

/* A list head that releases its list. */
template <typename Node>
class ListOf {
  public:
    ListOf() = default;
    ~ListOf() {
        while (head_ != nullptr) {
            std::free(std::exchange(head_, head_->next));
        }
    }
    ListOf(const ListOf &) = delete;
    ListOf &operator=(const ListOf &) = delete;
    Node **address() { return &head_; }
    Node *head() const { return head_; }
    std::string text() const { return textOf(head_); }

  private:
    Node *head_ = nullptr;
};
using List = ListOf<ZANO_PLAYLIST_REC>;
using Playlists = ListOf<ZANO_PLAYLIST>;

/* Starts from a new script; at the end no result may be open. */
class Test : public testing::Test {
  protected:
    Test();
    void TearDown() override;
};

}  // namespace stand_in

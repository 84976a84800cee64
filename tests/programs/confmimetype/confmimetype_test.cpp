#include <gtest/gtest.h>
#include <vorelix/misc/misc.h>

#include <array>
#include <fstream>
#include <map>
#include <set>
#include <sstream>
#include <string>

#include "support/files.h"
#include "support/process.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;

/* Exit status, a colon, and all that the program writes, errors first. */
std::string run(const std::string &arguments) {
    const process::Outcome outcome = process::run("'" CONFMIMETYPE "' " + arguments);
    return std::to_string(outcome.status) + ":" + outcome.text;
}

std::string typeOf(const std::string &extension) {
    std::array<char, 256> out{};
    EXPECT_EQ(ZANOAudioGetMimetype(extension.c_str(), out.data(), out.size()), 0) << extension;
    return out.data();
}

/* The program stands where the library looks for it, and the mapping is not made yet. */
class Confmimetype : public testing::Test {
  protected:
    std::string dataFile(const std::string &text) const {
        files::write(folder_.path("data"), text);
        return "'" + folder_.path("data") + "'";
    }

  private:
    const files::Places places_{ZANO_PATH_MIME_MAPPING, ZANO_PATH_MIME_GENERATOR};
    const files::Folder folder_;
};

/* What the system's two files have for each extension. */
std::map<std::string, std::set<std::string>> systemTypes() {
    std::map<std::string, std::set<std::string>> types;
    std::ifstream globs("/usr/share/mime/globs2");
    for (std::string line; std::getline(globs, line);) {
        const auto type = line.find(':') + 1;
        const auto glob = line.find(":*.", type);
        if (glob != std::string::npos) {
            types[line.substr(glob + 3, line.find(':', glob + 1) - glob - 3)].insert(
                line.substr(type, glob - type));
        }
    }
    std::ifstream lists("/etc/mime.types");
    for (std::string line; std::getline(lists, line);) {
        std::istringstream words(line.substr(0, line.find('#')));
        std::string type;
        words >> type;
        for (std::string extension; words >> extension;) {
            types[extension].insert(type);
        }
    }
    return types;
}

TEST_F(Confmimetype, GivesEveryAudioAndPlaylistExtensionItsOwnType) {
    fs::create_symlink(CONFMIMETYPE, ZANO_PATH_MIME_GENERATOR);
    const std::set<std::string> further = {"asf", "asx", "m3u", "m3u8",
                                           "mp4", "pls", "wpl", "xspf"};
    std::size_t asked = 0;
    const auto known = systemTypes();
    for (const auto &[extension, types] : known) {
        const bool isAudio = types.lower_bound("audio/") != types.lower_bound("audio0");
        if (isAudio || further.count(extension) == 1) {
            EXPECT_EQ(types.count(typeOf(extension)), 1U) << extension << " " << typeOf(extension);
            ++asked;
        }
    }
    EXPECT_GT(asked, 80U);

    const std::pair<const char *, const char *> sure[] = {
        {"mp3", "audio/mpeg"},   {"flac", "audio/flac"},   {"ogg", "audio/ogg"},
        {"opus", "audio/ogg"},   {"m4a", "audio/mp4"},     {"pls", "audio/x-scpls"},
        {"aif", "audio/x-aiff"}, {"aiff", "audio/x-aiff"}, {"wpl", "application/vnd.ms-wpl"},
    };
    for (const auto &[extension, type] : sure) {
        EXPECT_EQ(typeOf(extension), type) << extension;
    }
}

TEST_F(Confmimetype, PutsEveryAudioAndPlaylistExtensionIntoItsEntryFirst) {
    const std::string text = run("").substr(2);
    std::istringstream lines(text);
    std::size_t at = 0;
    std::size_t looked = 0;
    for (std::string line; std::getline(lines, line); at += line.size() + 1) {
        const bool isPlaylist = line.find("\"m3u") == 0 || line.find("\"wpl") == 0;
        if (line.find("\" \"audio/") == std::string::npos && !isPlaylist) {
            continue;
        }
        std::istringstream extensions(line.substr(1, line.find('"', 1) - 1));
        for (std::string extension; extensions >> extension; ++looked) {
            const std::size_t first = text.find(extension);
            EXPECT_GE(first, at) << extension;
            EXPECT_LT(first, at + line.size()) << extension;
        }
    }
    EXPECT_GT(looked, 80U);
}

TEST_F(Confmimetype, OrdersEntriesOfWhichOneIsPartOfTheOther) {
    const std::string unknown = " \"application/octet-stream\"\n";
    const std::string first =
        "0:\"application/octet-stream\" \"application/octet-stream\"" + unknown;
    const std::string data = dataFile(
        "# comment\n"
        "50:audio/x-speex+ogg:*.ogg\n50:audio/ogg:*.ogg\n60:video/x:*.high\n50:audio/x:*.high\n"
        "50:text/x-c:*.C:cs\n50:text/plain:readme*\n50:audio/b:*.part.ext\nno weight:audio/c:*.c\n"
        "audio/basic\tau ogg\naudio/aa-ogg\toga\nno-type ext\naudio/empty\n"
        "audio/qu\"ote qu\nimage/au au2\n");
    EXPECT_EQ(run(data), first + "\"au\" \"audio/basic\"" + unknown + "\"ogg\" \"audio/ogg\"" +
                             unknown + "\"oga\" \"audio/aa-ogg\"" + unknown +
                             "\"high\" \"video/x\"" + unknown + "\"au2\" \"image/au\"" + unknown +
                             "\"C\" \"text/x-c\"" + unknown);
}

TEST_F(Confmimetype, SaysWhatItCannotDo) {
    const std::string hidden = run(dataFile("audio/two one\naudio/one two\n") + " 2>&1");
    EXPECT_TRUE(hidden.starts_with("1:")) << hidden;
    EXPECT_NE(hidden.find("confmimetype: a search for \"one\" finds the entry of another type\n"),
              std::string::npos)
        << hidden;
    EXPECT_EQ(run("/no/such/file 2>&1"),
              "1:confmimetype: no mime types in /no/such/file; install the package "
              "shared-mime-info or media-types\n");
    EXPECT_EQ(run("2>&1 >/dev/full"), "1:confmimetype: the mapping could not be written\n");
    EXPECT_EQ(run("--no-such-option 2>&1"),
              "2:confmimetype: unknown option --no-such-option; see confmimetype --help\n");
    EXPECT_TRUE(run("--help").starts_with("0:usage: confmimetype"));
}

TEST_F(Confmimetype, MakesATypeOfWhatIsOnlyPartOfAnotherType) {
    fs::create_symlink(CONFMIMETYPE, ZANO_PATH_MIME_GENERATOR);
    for (const char *text : {"asic", "octet", "x-aif", "MP3", "no such"}) {
        EXPECT_EQ(typeOf(text), "application/octet-stream") << text;
    }
}

}  // namespace

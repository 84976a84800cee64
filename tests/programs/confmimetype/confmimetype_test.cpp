#include <gtest/gtest.h>
#include <vorelix/misc/misc.h>

#include <array>
#include <string>

#include "support/files.h"
#include "support/process.h"
#include "support/text.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;
using text::contains;

/* Exit status, a colon, and all that the program writes, errors first. */
std::string run(const std::string &arguments) {
    const process::Outcome outcome = process::run("'" CONFMIMETYPE "' " + arguments);
    return std::to_string(outcome.status) + ":" + outcome.text;
}

constexpr const char *kUnknown = "application/octet-stream";

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

/* The program itself looks whether a search for any audio or playlist extension finds its entry. */
TEST_F(Confmimetype, GivesAudioAndPlaylistExtensionsTheirTypes) {
    EXPECT_TRUE(run("").starts_with("0:"));
    fs::create_symlink(CONFMIMETYPE, ZANO_PATH_MIME_GENERATOR);
    const std::pair<const char *, const char *> cases[] = {
        {"mp3", "audio/mpeg"},
        {"flac", "audio/flac"},
        {"ogg", "audio/ogg"},
        {"opus", "audio/ogg"},
        {"m4a", "audio/mp4"},
        {"pls", "audio/x-scpls"},
        {"aif", "audio/x-aiff"},
        {"aiff", "audio/x-aiff"},
        {"wpl", "application/vnd.ms-wpl"},
        // of what is only a part of a type
        {"asic", kUnknown},
        {"octet", kUnknown},
        {"x-aif", kUnknown},
        {"MP3", kUnknown},
        {"no such", kUnknown},
    };
    for (const auto &[extension, type] : cases) {
        std::array<char, 256> out{};
        EXPECT_EQ(ZANOAudioGetMimetype(extension, out.data(), out.size()), 0) << extension;
        EXPECT_STREQ(out.data(), type) << extension;
    }
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
    EXPECT_TRUE(
        contains(hidden, "confmimetype: a search for \"one\" finds the entry of another type\n"));
    EXPECT_EQ(run("/no/such/file 2>&1"),
              "1:confmimetype: no mime types in /no/such/file; install the package "
              "shared-mime-info or media-types\n");
    EXPECT_EQ(run("2>&1 >/dev/full"), "1:confmimetype: the mapping could not be written\n");
    EXPECT_EQ(run("--no-such-option 2>&1"),
              "2:confmimetype: unknown option --no-such-option; see confmimetype --help\n");
    EXPECT_TRUE(run("--help").starts_with("0:usage: confmimetype"));
}

}  // namespace

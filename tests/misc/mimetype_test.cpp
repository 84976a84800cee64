// This file defines what a fortified build would turn into other calls.
#undef _FORTIFY_SOURCE

#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>
#include <vorelix/misc/misc.h>

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "support/failing_allocator.h"
#include "support/files.h"
#include "support/platform_stand_in.h"
#include "system_paths_internal.h"

namespace {

bool readsShort = false;

}  // namespace

// Takes the place of the system's function for this program.
extern "C" __attribute__((visibility("default"))) ssize_t read(int file, void *out, size_t size) {
    return syscall(SYS_read, file, out, readsShort ? size / 2 : size);
}

namespace {

namespace fs = std::filesystem;
using stand_in::takeTrace;

class Mimetype : public stand_in::Test {
  protected:
    Mimetype() {
        // None, and above all not that of an empty file.
        failing_allocator::failOnSize(SIZE_MAX);
    }
    static void map(const std::string &text) { files::write(ZANO_PATH_MIME_MAPPING, text); }
    static void generateWith(const std::string &script) {
        files::write(ZANO_PATH_MIME_GENERATOR, "#!/bin/sh\n" + script);
        fs::permissions(ZANO_PATH_MIME_GENERATOR, fs::perms::owner_all);
    }
    /* The type, or the result of a failure. */
    static std::string typeOf(const char *extension) {
        std::array<char, 64> out{};
        const int result = ZANOAudioGetMimetype(extension, out.data(), out.size());
        return result == 0 ? out.data() : std::to_string(result);
    }

  private:
    const files::Places places_{ZANO_PATH_MIME_MAPPING, ZANO_PATH_MIME_GENERATOR};
};

TEST_F(Mimetype, IsTheSecondQuotedTextBehindTheFirstPlaceOfTheExtension) {
    const std::string unknown = "application/octet-stream";
    const std::pair<const char *, std::string> cases[] = {
        {"\"mp3\" \"audio/mpeg\"\n", "audio/mpeg"},
        {"\"ogg\" \"audio/ogg\"\n\"mp3\"=\"audio/mpeg\"", "audio/mpeg"},
        {"\"xmp3x\" \"wrong\"\n\"mp3\" \"right\"", "wrong"},
        {"\"mp3\" \"audio/to the end", "audio/to the end"},
        {"\"mp3\" \"", ""},
        {"\"mp3\" ", unknown},
        {"mp3", unknown},
        {"\"mp\" \"a\"", unknown},
        {"", unknown},
    };
    for (const auto &[mapping, type] : cases) {
        map(mapping);
        EXPECT_EQ(typeOf("mp3"), type) << mapping;
    }
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Mimetype, IsCutToItsBuffer) {
    map("\"mp3\" \"audio/mpeg\"");
    for (const auto &[size, type] : {std::pair{6, "audio"}, {11, "audio/mpeg"}, {1, ""}}) {
        std::vector<char> out(static_cast<std::size_t>(size), '?');
        EXPECT_EQ(ZANOAudioGetMimetype("mp3", out.data(), size), 0);
        EXPECT_STREQ(out.data(), type);
    }
    std::array<char, 1> untouched{'?'};
    EXPECT_EQ(ZANOAudioGetMimetype("mp3", untouched.data(), 0), 0);
    EXPECT_EQ(ZANOAudioGetMimetype("mp3", untouched.data(), -1), 0);
    EXPECT_EQ(ZANOAudioGetMimetype(nullptr, untouched.data(), 1), -1);
    EXPECT_EQ(untouched[0], '?');
    EXPECT_EQ(ZANOAudioGetMimetype("mp3", nullptr, 1), -1);
}

TEST_F(Mimetype, ComesFromAMappingThatIsMadeOnce) {
    generateWith("echo '\"mp3\" \"audio/made\"'\n");
    EXPECT_EQ(typeOf("mp3"), "audio/made");
    generateWith("echo '\"mp3\" \"audio/again\"'\n");
    EXPECT_EQ(typeOf("mp3"), "audio/made");
    fs::remove(ZANO_PATH_MIME_MAPPING);
    EXPECT_EQ(typeOf("mp3"), "audio/again");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Mimetype, FailsWhereTheMappingCannotBeMadeOrRead) {
    fs::create_directory(ZANO_PATH_MIME_MAPPING);
    EXPECT_EQ(typeOf("mp3"), "-1");
    EXPECT_EQ(takeTrace(), "3 misc:239 Could not generat the mimetype mapping file\n");
    fs::remove(ZANO_PATH_MIME_MAPPING);

    map("\"mp3\" \"audio/mpeg\"");
    rlimit limit{};
    ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &limit), 0);
    const rlimit none{0, limit.rlim_max};
    ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &none), 0);
    const std::string type = typeOf("mp3");
    ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &limit), 0);
    EXPECT_EQ(type, "-1");
    EXPECT_EQ(takeTrace(), "3 misc:244 Could not open the mimetype mapping file\n");

    failing_allocator::failOnSize(fs::file_size(ZANO_PATH_MIME_MAPPING));
    EXPECT_EQ(typeOf("mp3"), "-1");
    EXPECT_TRUE(failing_allocator::hasFailed());
    EXPECT_EQ(takeTrace(), "3 misc:252 Malloc memory failed\n");

    readsShort = true;
    EXPECT_EQ(typeOf("mp3"), "-1");
    readsShort = false;
    EXPECT_EQ(takeTrace(), "3 misc:258 Failed to read file\n");
    EXPECT_EQ(typeOf("mp3"), "audio/mpeg");
}

}  // namespace

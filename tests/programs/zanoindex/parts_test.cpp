#include <gtest/gtest.h>
#include <unistd.h>
#include <fstream>
#include <limits>
#include <random>

#include "descriptor.h"
#include "folder_watch.h"
#include "formats.h"
#include "progress.h"
#include "support/files.h"
#include "support/text.h"
#include "text.h"
#include "wire.h"

namespace zano::index {
namespace {

TEST(IndexText, StorableText) {
    const std::string a4096(4096, 'a');
    const std::pair<std::string, std::string> cases[] = {
        {"plain", "plain"},
        {"  blanks  ", "blanks"},
        {"Beyonc\xC3\xA9", "Beyoncé"},
        {"Beyonc\xE9", "Beyoncé"},
        {"\x93quoted\x94 \x80", "“quoted” €"},
        {"cut \xE6\x98", "cut æ˜"},
        {"one bad \xC3\xA9\xFF\xC3\xA9", "one bad éÿé"},
        {"surrogate \xED\xA0\x80", "surrogate í\xC2\xA0€"},
        {"tab\tline\r\nend", "tab line  end"},
        {std::string("nul\0bell\a\x7F", 9), "nulbell"},
        {"C1 \xC2\x85 control", "C1  control"},
        {"\n \t", ""},
        {a4096 + "b", a4096},
        {std::string(4095, 'a') + "é", std::string(4095, 'a')},
        {std::string(3 << 20U, '\xE9'), text::repeated(2048, "é")},
    };
    for (const auto &[bytes, text] : cases) {
        EXPECT_EQ(storableText(bytes), text) << "of " << printable(bytes.substr(0, 80));
    }
}

TEST(IndexText, TitleOfPath) {
    const std::pair<const char *, const char *> cases[] = {
        {"/music/One Song.mp3", "One Song"}, {"/a.b/c.d.flac", "c.d"}, {"/m/Bj\xF6rk.ogg", "Björk"},
        {"/m/two\nlines.mp3", "two lines"},  {"/m/ .mp3", ".mp3"},     {"/m/\x01.mp3", ".mp3"},
    };
    for (const auto &[path, title] : cases) {
        EXPECT_EQ(titleOfPath(path), title);
    }
}

TEST(IndexText, PrintableObeysNoTerminal) {
    EXPECT_EQ(printable("a\n\x1B[31m\xFF\xC2\x9B é"), "a\\n\\x1B[31m\\xFF\\xC2\\x9B é");
}

TEST(IndexFormats, Suffixes) {
    const std::pair<const char *, Format> cases[] = {
        {"a.mp3", Format::kMpeg},   {"a.MP3", Format::kMpeg}, {"a.b.FlaC", Format::kFlac},
        {"a.wv", Format::kWavPack}, {"a.mp", Format::kNone},  {"a.mp33", Format::kNone},
        {"a.flacs", Format::kNone}, {"a.", Format::kNone},    {"mp3", Format::kNone},
        {".mp3", Format::kNone},    {"", Format::kNone},
    };
    for (const auto &[name, format] : cases) {
        EXPECT_EQ(formatOfName(name), format) << name;
    }
}

ReadAnswer fullAnswer() {
    ReadAnswer answer;
    answer.tags = {"Title é", "Album", "Artist", "Various", "Jazz", 2004, 3, 1, 1.5, 64000, 44100};
    return answer;
}

TEST(IndexWire, RefusesWhatAHealthyReaderDoesNotSay) {
    const auto whole = encodeAnswer(fullAnswer());
    for (std::size_t size = 0; size < whole.size(); ++size) {
        EXPECT_FALSE(decodeAnswer(whole.substr(0, size))) << size;
    }
    EXPECT_FALSE(decodeAnswer(whole + "x"));
    const auto isRefused = [](auto change) {
        auto answer = fullAnswer();
        change(answer);
        return !decodeAnswer(encodeAnswer(answer));
    };
    EXPECT_TRUE(isRefused([](ReadAnswer &a) { a.status = ReadStatus{250}; }));
    EXPECT_TRUE(isRefused([](ReadAnswer &a) { a.tags.year = -1; }));
    EXPECT_TRUE(isRefused([](ReadAnswer &a) { a.tags.album = "\xFF"; }));
    EXPECT_TRUE(isRefused([](ReadAnswer &a) { a.tags.title = std::string("a\0b", 3); }));
    EXPECT_TRUE(isRefused([](ReadAnswer &a) { a.tags.artist.assign(4097, 'a'); }));
    EXPECT_TRUE(isRefused(
        [](ReadAnswer &a) { a.tags.duration = std::numeric_limits<double>::quiet_NaN(); }));
}

TEST(IndexWire, AnyBytesAreSurvived) {
    std::mt19937 random(1);
    const auto whole = encodeAnswer(fullAnswer());
    for (int round = 0; round < 20'000; ++round) {
        auto bytes = whole;
        for (int i = 0; i < 4; ++i) {
            bytes[random() % bytes.size()] = static_cast<char>(random());
        }
        decodeAnswer(bytes);
    }
}

TEST(IndexWire, FramesInPieces) {
    std::string stream;
    const std::vector<std::string> contents = {"", "one", std::string(5000, 'x')};
    for (const auto &content : contents) {
        appendFrame(stream, content);
    }
    FrameReader reader;
    std::vector<std::string> taken;
    for (const char c : stream) {
        reader.add(&c, 1);
        while (const auto frame = reader.next()) {
            taken.emplace_back(*frame);
        }
    }
    EXPECT_EQ(taken, contents);
    EXPECT_FALSE(reader.isBroken());
    reader.add("\xFF\xFF\xFF\xFF", 4);
    EXPECT_FALSE(reader.next());
    EXPECT_TRUE(reader.isBroken());
}

TEST(IndexProgress, TextAndBar) {
    EXPECT_EQ(progressText({Phase::kLooking, 7, 0, 0.5}), "looking for files: 7 files");
    EXPECT_EQ(progressText({Phase::kReading, 1200, 5200, 2}),
              "reading tags: 1200 of 5200 files, 600 files/s, 0:07 left");
    EXPECT_EQ(progressText({Phase::kReading, 100, 1'000'000, 10}),
              "reading tags: 100 of 1000000 files, 10 files/s, 27:46:30 left");
    const PhaseState half = {Phase::kReading, 10, 20, 0};
    EXPECT_EQ(progressBar(half, 50, false), "[=========          ] reading tags: 10 of 20 files");
    EXPECT_TRUE(text::contains(progressBar(half, 50, true), "\033["));
    for (std::size_t width = 0; width < 100; ++width) {
        EXPECT_LE(progressBar(half, width, false).size(), width);
    }
}

TEST(IndexWatch, TellsThatTooMuchHappened) {
    const files::Folder folder;
    FolderWatch watch([](const std::string &path, const std::string &reason) {
        ADD_FAILURE() << path << reason;
    });
    watch.add(folder.path(""), Descriptor(dup(STDIN_FILENO)).get());
    int limit = 0;
    std::ifstream("/proc/sys/fs/inotify/max_queued_events") >> limit;
    for (int i = 0; i <= limit; ++i) {
        // two files in turn, for equal events that follow each other are one
        files::write(folder.path(i % 2 == 0 ? "a" : "b"), "");
    }
    FolderChanges changes;
    watch.take(changes);
    EXPECT_TRUE(changes.isLossy);
}

}  // namespace
}  // namespace zano::index

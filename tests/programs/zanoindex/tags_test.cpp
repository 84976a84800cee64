#include <algorithm>
#include <array>
#include <map>
#include <random>

#include "index_test.h"
#include "text.h"

namespace zano::index {
namespace {

using TagsTest = IndexTest;

/* Ten bytes, to be replaced by ten others in a file. */
constexpr std::string_view kTitle = "S\u00F8dm\u00E9 \u66F2";
static_assert(kTitle.size() == 11);

/* Of all samples, in order. */
constexpr std::array kSuffixes = {"aiff", "flac", "m4a", "m4b", "mp3", "mp4", "oga",
                                  "ogg",  "opus", "spx", "tta", "wav", "wma", "wv"};

std::string replaced(std::string content, std::string_view from, std::string_view to) {
    const auto at = content.find(from);
    EXPECT_NE(at, std::string::npos) << from;
    return at == std::string::npos ? content : content.replace(at, from.size(), to);
}

TEST_F(TagsTest, EveryFormat) {
    // What differs: the sound of some, and tags that ffmpeg cannot write or we do not read.
    std::map<std::string, std::string> sounding = {{"opus", "48000 Hz"}, {"spx", "32000 Hz"}};
    std::map<std::string, std::string> tagged = {{"tta", "sample|||||0|0|0"},
                                                 {"wav", "Sødmé 曲|Øyvind|Älbum||Jazz|2004|3|0"}};
    std::vector<std::string> expected;
    for (const std::string suffix : kSuffixes) {
        add("sample." + suffix, suffix);
        tagged.try_emplace(suffix, "Sødmé 曲|Øyvind|Älbum|Various|Jazz|2004|3|1");
        sounding.try_emplace(suffix, "44100 Hz");
        expected.push_back("sample." + suffix + "|" + tagged[suffix]);
    }
    const auto summary = summaryOf({music()});
    EXPECT_EQ(songs(), expected);
    EXPECT_EQ(counts(summary), "added 14");
    const auto lines = sounds();
    ASSERT_EQ(lines.size(), kSuffixes.size());
    for (std::size_t i = 0; i < lines.size(); ++i) {
        EXPECT_TRUE(lines[i].ends_with(sounding[kSuffixes.at(i)])) << lines[i];
    }
    EXPECT_EQ(lines[5], "sample.mp4 1.0 s 66000 bit/s 44100 Hz");
}

TEST_F(TagsTest, TextsThatAreNotUtf8) {
    const std::string_view latin =
        "S\xF8"
        "dm\xE9 Lied";
    ASSERT_EQ(latin.size(), kTitle.size() - 1);
    const auto padded = std::string(latin) + "s";
    std::vector<std::string> expected;
    for (const char *suffix : {"flac", "m4a", "mp3", "oga", "ogg", "opus", "spx", "wav", "wv"}) {
        const auto name = std::string("a.") + suffix;
        files::write(music() + "/" + name, replaced(files::read(sample(suffix)), kTitle, padded));
        expected.push_back(name + "|Sødmé Lieds|Øyvind");
    }
    run({music()});
    auto lines = songs();
    for (auto &line : lines) {
        line.resize(line.find("|Älbum"));
    }
    EXPECT_EQ(lines, expected);
}

/* A tag at the end, of fixed size and Latin-1, is all that this file has. */
TEST_F(TagsTest, OldTagOfAnMp3) {
    auto content = files::read(sample("mp3"));
    const auto frames = content.find("\xFF\xFB", content.find("Lavf"));
    content = content.substr(frames);
    std::string tag = "TAGBj\xF6rk's \x96 S\xF8ng";
    tag.resize(33);
    tag += "Artist  ";
    tag.resize(128);
    tag[127] = 17;  // Rock
    files::write(music() + "/old.mp3", content + tag);
    files::write(music() + "/untagged.mp3", content);
    run({music()});
    EXPECT_EQ(songs(), (std::vector<std::string>{"old.mp3|Björk's – Søng|Artist|||Rock|0|0|0",
                                                 "untagged.mp3|untagged|||||0|0|0"}));
}

TEST_F(TagsTest, WrongSuffixes) {
    const std::pair<const char *, const char *> cases[] = {
        {"flac.mp3", "flac"}, {"mp3.flac", "mp3"},  {"mp4.ogg", "mp4"},
        {"ogg.opus", "ogg"},  {"opus.ogg", "opus"}, {"wav.wma", "wav"}};
    for (const auto &[name, suffix] : cases) {
        add(name, suffix);
    }
    run({music()});
    for (const auto &line : songs()) {
        EXPECT_TRUE(contains(line, "|Sødmé 曲|Øyvind|"));
    }
    EXPECT_EQ(paths().size(), std::size(cases));
}

TEST_F(TagsTest, WhatIsNotAudioIsNamedAndNotListed) {
    files::write(music() + "/text.mp3", "This is no music.\n");
    files::write(music() + "/empty.flac", "");
    files::write(music() + "/zeros.wav", std::string(100'000, '\0'));
    files::write(music() + "/page.ogg", "<html><body>Not found</body></html>");
    add("good.mp3");
    const auto ended = run({music()});
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(paths(), std::vector<std::string>{"good.mp3"});
    for (const char *name : {"text.mp3", "empty.flac", "zeros.wav", "page.ogg"}) {
        const auto line = "cannot read " + music() + "/" + name + ": not an audio file\n";
        EXPECT_TRUE(contains(ended.err, line));
    }
    // once more: named again, and what was listed before stays when its file is damaged
    files::write(music() + "/good.mp3", "no longer");
    const auto summary = summaryOf({music()});
    EXPECT_EQ(counts(summary), "failed 5");
    EXPECT_EQ(paths(), std::vector<std::string>{"good.mp3"});
}

/* Two hundred copies of each format with ends cut off and bytes flipped, most of them in the
 * first kilobytes, where the tags are. */
TEST_F(TagsTest, DamagedFiles) {
    constexpr int kCopies = 200;
    std::mt19937 random(20040506);
    std::size_t files = 0;
    for (const std::string suffix : kSuffixes) {
        const auto whole = files::read(sample(suffix));
        for (int copy = 0; copy < kCopies; ++copy, ++files) {
            auto content = whole;
            if (copy % 2 == 0) {
                content.resize(random() % content.size());
            }
            for (auto flips = random() % 24; flips > 0 && !content.empty(); --flips) {
                const auto near =
                    std::min<std::size_t>(content.size(), flips % 4 == 0 ? ~0U : 2048);
                content[random() % near] = static_cast<char>(random());
            }
            files::write(music() + "/" + std::to_string(copy) + "." + suffix, content);
        }
    }
    const auto ended = run({"--json", music()});
    ASSERT_EQ(ended.status, 0) << ended.err;
    const auto summary = parsed(ended.out);
    EXPECT_EQ(summary["files"].asUInt(), files);
    EXPECT_EQ(summary["added"].asUInt() + summary["failed"].size(), files);
    EXPECT_GT(summary["failed"].size(), 0U);
    for (const auto &failed : summary["failed"]) {
        EXPECT_TRUE(contains(ended.err, "cannot read " + failed["path"].asString() + ": " +
                                            failed["reason"].asString()));
    }
    EXPECT_LT(ended.peakKilobytes, 700 * 1024);
    for (const auto &line : songs()) {
        EXPECT_TRUE(isUtf8(line)) << printable(line);
    }
    EXPECT_NO_THROW(mediadb::openCatalogue(location())->check());
}

TEST_F(TagsTest, DemoMusic) {
    const fs::path untitled = fs::path(ZANOINDEX_DEMO) / "Loose Files/Untitled Recording.wav";
    const auto before = fs::last_write_time(untitled);
    const auto again = Process({ZANOINDEX_MAKE_DEMO, {"make-demo-music", ZANOINDEX_DEMO}}).wait();
    EXPECT_EQ(again.status, 0) << again.err;
    EXPECT_EQ(fs::last_write_time(untitled), before) << "a second call does nothing";
    const auto summary = summaryOf({ZANOINDEX_DEMO});
    EXPECT_EQ(counts(summary), "added 36");
}

}  // namespace
}  // namespace zano::index

#include "command_line.h"

#include "support/json.h"

namespace command_line {

namespace {

program::Start startOf(const Invocation &invocation) {
    Words words = {"vorelix"};
    words.insert(words.end(), invocation.arguments.begin(), invocation.arguments.end());
    return {.path = VORELIX_PROGRAM,
            .argv = words,
            .environment = invocation.environment,
            .output = invocation.output,
            .columns = invocation.columns,
            .input = invocation.input,
            .fileSizeLimit = invocation.fileSizeLimit};
}

}  // namespace

Ended run(const Invocation &invocation) {
    return program::Process(startOf(invocation)).wait();
}

pid_t start(const Invocation &invocation) {
    program::Start silent = startOf(invocation);
    silent.output = silent.errors = Output::Nowhere;
    return program::Process(silent).release();
}

CommandLine::CommandLine(Words front) : front_(std::move(front)) {
    files::write(ZANO_PATH_CONF, "mediadb=\"" + location_ + "\"\n");
}

void CommandLine::fill(const std::vector<zano::mediadb::Song> &songs) const {
    const auto catalogue = zano::mediadb::openCatalogue(location_);
    catalogue->begin();
    for (const auto &song : songs) {
        catalogue->putSong(song);
    }
    catalogue->commit();
    catalogue->finish({});
}

void CommandLine::fillWithLetters(int count, const std::filesystem::path &folder) const {
    std::vector<zano::mediadb::Song> songs(static_cast<size_t>(count));
    for (size_t i = 0; i < songs.size(); ++i) {
        songs[i].title = std::string(1, static_cast<char>('a' + i));
        songs[i].path = folder / (songs[i].title + ".mp3");
    }
    fill(songs);
}

Words CommandLine::whole(const Words &words) const {
    Words all = front_;
    all.insert(all.end(), words.begin(), words.end());
    return all;
}

std::string CommandLine::says(const Words &words, const std::string &input) const {
    const Ended ended = run({.arguments = whole(words), .input = input});
    EXPECT_EQ(ended.err, "");
    EXPECT_EQ(ended.status, 0);
    return ended.out;
}

std::string CommandLine::fails(const Words &words, int status, unsigned long fileSizeLimit) const {
    const Ended ended = run({.arguments = whole(words), .fileSizeLimit = fileSizeLimit});
    EXPECT_EQ(ended.status, status) << ended.err;
    EXPECT_EQ(ended.out, "");
    EXPECT_TRUE(ended.err.starts_with("vorelix: ")) << ended.err;
    return ended.err;
}

Json::Value CommandLine::answerOf(Words words) const {
    words.emplace_back("--json");
    return json::parsed(says(words));
}

}  // namespace command_line

#include "command_line.h"

#include "support/json.h"

namespace command_line {

namespace {

program::Start startOf(const Invocation &invocation) {
    std::vector<std::string> words = {"vorelix"};
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

CommandLine::CommandLine() {
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

Json::Value CommandLine::answerOf(std::vector<std::string> arguments) {
    arguments.emplace_back("--json");
    const Ended ended = run({arguments});
    EXPECT_EQ(ended.err, "");
    return json::parsed(ended.out);
}

}  // namespace command_line

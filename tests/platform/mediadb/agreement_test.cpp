/* Both engines give the same rows in the same order. bench/compare_engines asks the same of larger
 * catalogues. */
#include "bench/generator.h"
#include "bench/random_calls.h"
#include "cluster.h"
#include "fixture.h"

namespace zano::mediadb {
namespace {

class PostgresqlAgreementTest : public MediaDatabaseTest {};

TEST_F(PostgresqlAgreementTest, CallsOfChanceHaveTheAnswersOfSqlite) {
    constexpr int kSongs = 3000;
    constexpr unsigned kCalls = 1000;
    const std::string other = Cluster::get().newDatabase();
    for (const std::string &place : {location(), other}) {
        bench::fill(*openCatalogue(place), kSongs, [](std::int64_t) {});
    }
    std::vector<std::string> answers;
    for (unsigned number = 0; number < kCalls; ++number) {
        answers.push_back(bench::answerOf(bench::randomCall(number, kSongs)));
        ASSERT_EQ(answers.back().find("failed"), std::string::npos)
            << bench::randomCall(number, kSongs).text() << answers.back();
    }
    setSetting(other);
    for (unsigned number = 0; number < kCalls; ++number) {
        const bench::Call call = bench::randomCall(number, kSongs);
        ASSERT_EQ(bench::answerOf(call), answers[number]) << call.text();
    }
}

}  // namespace
}  // namespace zano::mediadb

/* How the engines go about the statements of the listings: no page sorts the songs. */
#include "mediadb/postgresql/plan.h"
#include "cluster.h"
#include "fixture.h"
#include "mediadb/query/parse.h"
#include "mediadb/sqlite/plan.h"

namespace zano::mediadb {
namespace {

class AnyPlanTest : public MediaDatabaseTest {
  protected:
    explicit AnyPlanTest(const std::string &place = "") : MediaDatabaseTest(place) {
        auto catalogue = openCatalogue(location());
        std::vector<Song> songs;
        for (int i = 0; i < 3000; ++i) {
            Song made = song("/music/" + std::to_string(i), "Title " + std::to_string(i));
            made.artist = "Artist " + std::to_string(i % 50);
            made.year = 1950 + i % 70;
            songs.push_back(made);
        }
        put(*catalogue, songs);
    }

    static const std::vector<std::string> &orders() {
        static const std::vector<std::string> all = [] {
            std::vector<std::string> made;
            const std::string tail =
                ", album, disc, track, title, artist, genre, year, path, duration";
            for (const char *leading :
                 {"lower(title)", "lower(artist)", "lower(album)", "lower(genre)", "year",
                  "duration", "path", "id", "title", "artist"}) {
                made.push_back(leading + (" " + tail));
                made.push_back(leading + (" desc" + tail));
            }
            return made;
        }();
        return all;
    }
};

}  // namespace

namespace sqlite {
namespace {

class PlanTest : public AnyPlanTest {
  protected:
    PlanTest() : pool_(std::make_shared<ReaderPool>(databasePath())) {}

    std::string planOf(const char *condition, const std::string &order, Query query) {
        auto reader = pool_->lease();
        const auto parsed = parseCondition(Table::Songs, condition);
        parseOrder(order.c_str(), query);
        Sql sql = SongPlan(*reader, parsed).page("songs.id, songs.title", query);
        Sql explain(dialect());
        explain.add("EXPLAIN QUERY PLAN ").add(sql.text());
        Statement &rows = (*reader).statement(explain.text());
        int index = 0;
        for (const Value &value : sql.values()) {
            rows.bindValue(++index, value);
        }
        std::string plan;
        while (rows.step()) {
            plan.append(rows.text(3)).append("; ");
        }
        return plan;
    }

    std::shared_ptr<ReaderPool> pool_;
};

TEST_F(PlanTest, APageComesFromAnIndexAtAnyDepth) {
    for (const std::string &order : orders()) {
        for (const int offset : {0, 1500, 2999}) {
            Query query;
            query.limit = 50;
            query.offset = offset;
            const std::string plan = planOf("path like '/music/%'", order, query);
            EXPECT_EQ(plan.find("TEMP B-TREE"), std::string::npos) << order << ": " << plan;
            const bool isById = order.substr(0, 2) == "id";
            EXPECT_TRUE(isById || plan.find("INDEX songs_by_") != std::string::npos)
                << order << ": " << plan;
            if (offset > 0) {
                EXPECT_NE(plan.find("SEARCH songs"), std::string::npos) << order << ": " << plan;
            }
        }
    }
}

TEST_F(PlanTest, ASearchLooksAtFewRowsOrFollowsTheOrder) {
    for (const std::string &order : orders()) {
        Query query;
        query.limit = 50;
        const std::string rare = planOf("title ilike '%title 1234%'", order, query);
        EXPECT_NE(rare.find("SCAN grams VIRTUAL TABLE INDEX"), std::string::npos)
            << order << ": " << rare;
        const std::string common = planOf("title ilike '%title%'", order, query);
        const bool isDefault = order.find("title)") != std::string::npos || order[0] == 't';
        if (!isDefault || order.find("desc") != std::string::npos) {
            EXPECT_NE(common.find("SCAN songs"), std::string::npos) << order << ": " << common;
        }
        EXPECT_EQ(common.find("TEMP B-TREE"), std::string::npos) << order << ": " << common;
    }
}

}  // namespace
}  // namespace sqlite

namespace postgresql {
namespace {

class PostgresqlPlanTest : public AnyPlanTest {
  protected:
    PostgresqlPlanTest()
        : AnyPlanTest(Cluster::get().newDatabase()),
          pool_(std::make_shared<ReaderPool>(location())) {}

    std::string planOf(const char *condition, const std::string &order, Query query) {
        auto parsed = parseCondition(Table::Songs, condition);
        query.select = parseSelect(Table::Songs, "*");
        parseOrder(order.c_str(), query);
        return pool_->serve([&](const ReaderPool::Lease &reader) {
            Sql explain = newSql("EXPLAIN ");
            const Statement page = SongPlan(*reader, parsed).page(query);
            explain.append(page.sql);
            const Result rows = (*reader).connection().run(explain);
            std::string plan = page.plan == Connection::Plan::Kept ? "Kept\n" : "";
            for (int i = 0; i < rows.size(); ++i) {
                plan.append(rows[i].text(0)).append("\n");
            }
            return plan;
        });
    }

    std::shared_ptr<ReaderPool> pool_;
};

/* What is equal by the columns of an index is sorted as it comes, and of a descending order that
 * begins at an anchor, two stretches of a page. */
TEST_F(PostgresqlPlanTest, APageComesFromAnIndexAtAnyDepth) {
    for (const std::string &order : orders()) {
        for (const int offset : {0, 1500, 2999}) {
            Query query;
            query.limit = 50;
            query.offset = offset;
            const std::string plan = planOf("path like '/music/%'", order, query);
            EXPECT_EQ(plan.find("Seq Scan on songs"), std::string::npos) << order << "\n" << plan;
            EXPECT_NE(plan.find(" using songs_"), std::string::npos) << order << "\n" << plan;
            const bool isSorted = plan.find("->  Sort") != std::string::npos;
            EXPECT_TRUE(!isSorted || plan.find("Append") != std::string::npos) << order << "\n"
                                                                               << plan;
        }
    }
}

TEST_F(PostgresqlPlanTest, ASearchLooksAtFewRowsOrFollowsTheOrder) {
    for (const std::string &order : orders()) {
        Query query;
        query.limit = 50;
        const std::string rare = planOf("title ilike '%title 1234%'", order, query);
        EXPECT_NE(rare.find("Bitmap Index Scan on songs_grams"), std::string::npos) << order << "\n"
                                                                                    << rare;
        EXPECT_EQ(rare.find("Kept"), 0U) << rare;
        const std::string common = planOf("title ilike '%title%'", order, query);
        EXPECT_NE(common.find(" using songs_"), std::string::npos) << order << "\n" << common;
        EXPECT_EQ(common.find("Kept"), std::string::npos) << common;
        const std::string frequent = planOf("title ilike '%ti%'", order, query);
        EXPECT_EQ(frequent.find("Kept"), 0U) << frequent;
        EXPECT_NE(frequent.find(" using songs_"), std::string::npos) << order << "\n" << frequent;
        if (order.find("id") != 0 && order.find("path") != 0) {
            /* 159 titles. */
            const std::string some = planOf("title ilike '%12%'", order, query);
            EXPECT_EQ(some.find("Kept"), 0U) << some;
            EXPECT_NE(some.find("Index Only Scan using songs_by_"), std::string::npos)
                << order << some;
            EXPECT_NE(some.find("Index Cond: (ROW("), std::string::npos) << order << some;
            const std::string unknown = planOf("title ilike '%\u0434\u043E\u043C%'", order, query);
            EXPECT_NE(unknown.find("Bitmap Index Scan on songs_grams"), std::string::npos)
                << unknown;
            EXPECT_NE(unknown.find("Index Cond: (ROW("), std::string::npos) << order << unknown;
        }
    }
}

/* They are equal in all that the index of an order holds. */
TEST_F(PostgresqlPlanTest, SongsThatAreFoundByTheirKeysKeepTheirOrder) {
    std::vector<Song> songs;
    for (int i = 0; i < 150; ++i) {
        songs.push_back(song("/music/quiz/" + std::to_string(i * 7 % 150), "Quiz"));
    }
    put(*openCatalogue(location()), songs);
    for (const std::string &order : orders()) {
        const auto all = rows("title ilike '%qu%'", order.c_str());
        ASSERT_EQ(all.size(), songs.size()) << order;
        for (const Page page : {Page{0, 50}, Page{49, 3}, Page{50, 50}, Page{140, 60}}) {
            const auto end = std::min<std::ptrdiff_t>(150, page.offset + page.limit);
            EXPECT_EQ(rows("title ilike '%qu%'", order.c_str(), page),
                      std::vector(all.begin() + page.offset, all.begin() + end))
                << order << page.offset;
        }
    }
    Query query;
    query.limit = 50;
    EXPECT_NE(planOf("title ilike '%qu%'", orders()[0], query).find("Index Cond: (ROW("),
              std::string::npos);
}

}  // namespace
}  // namespace postgresql
}  // namespace zano::mediadb

/* Tests that every engine of the media database has to pass. */
#pragma once

#include "cluster.h"
#include "fixture.h"

namespace zano::mediadb {

enum class EngineName { Sqlite, Postgresql };

inline std::ostream &operator<<(std::ostream &out, EngineName engine) {
    return out << (engine == EngineName::Sqlite ? "SQLite" : "PostgreSQL");
}

class EngineTest : public MediaDatabaseTest, public testing::WithParamInterface<EngineName> {
  protected:
    EngineTest() : MediaDatabaseTest(newLocation()) {}
    static bool isSqlite() { return GetParam() == EngineName::Sqlite; }

  private:
    static std::string newLocation() { return isSqlite() ? "" : Cluster::get().newDatabase(); }
};

}  // namespace zano::mediadb

/* A prefix tells ctest which of them need a server. */
#define ZANO_FOR_EVERY_ENGINE(suite)                                              \
    INSTANTIATE_TEST_SUITE_P(Sqlite, suite, testing::Values(EngineName::Sqlite)); \
    INSTANTIATE_TEST_SUITE_P(Postgresql, suite, testing::Values(EngineName::Postgresql))

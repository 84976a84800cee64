/* A PostgreSQL server of the test's own, on a socket in a folder of its own, started at its first
 * use. It ends with the process that uses it, however that ends: a guard between the two sees the
 * pipe close, stops the server and removes the folder. As root it runs as another user, since the
 * server refuses to run as root. */
#pragma once

#include <string>

namespace zano::mediadb {

class Cluster {
  public:
    static Cluster &get();
    /* Empty, or a standby of another one: a copy that follows it and can be read. */
    explicit Cluster(const Cluster *primary = nullptr);
    ~Cluster();
    Cluster(const Cluster &) = delete;
    Cluster &operator=(const Cluster &) = delete;

    /* Makes an empty database; its address for the setting mediadb. */
    std::string newDatabase();
    /* The address of a database for another role. */
    std::string address(const std::string &database, const std::string &role) const;
    /* Runs SQL on the database of an address; the first value it gives. Throws when it fails. */
    static std::string run(const std::string &address, const std::string &sql);
    /* The address of a database that this server and another one may both have. */
    std::string addressWith(const Cluster &other, const std::string &database) const;
    /* As if its machine had lost power. */
    void kill();
    /* Ends all connections to the databases, as a server does that is stopped. */
    void endConnections();

  private:
    std::string folder_;
    int lifeline_ = -1;
    int guard_ = -1;
    int databases_ = 0;
};

/* Where a test keeps its media database: in this file, or when the environment has
 * ZANO_TEST_ON_POSTGRESQL, in a database of its own, a new one each time. */
std::string locationForTest(const std::string &file);

}  // namespace zano::mediadb

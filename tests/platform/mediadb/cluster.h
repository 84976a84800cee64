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
    ~Cluster();
    Cluster(const Cluster &) = delete;
    Cluster &operator=(const Cluster &) = delete;

    /* Makes an empty database; its address for the setting mediadb. */
    std::string newDatabase();
    /* The address of a database for another role. */
    std::string address(const std::string &database, const std::string &role) const;
    /* Runs SQL on the database of an address; the first value it gives. Throws when it fails. */
    static std::string run(const std::string &address, const std::string &sql);
    /* Ends all connections to the databases, as a server does that is stopped. */
    void endConnections();

  private:
    Cluster();

    std::string folder_;
    int lifeline_ = -1;
    int guard_ = -1;
    int databases_ = 0;
};

}  // namespace zano::mediadb

/* A MiniDLNA of a test's own: on the loopback interface and a free port, with its database in a
 * folder that goes with it. It ends with the test, however that ends. */
#pragma once

#include <optional>
#include <string>

#include "support/files.h"
#include "support/program.h"

namespace integration {

class MiniDlna {
  public:
    /* Serves a folder of music. */
    explicit MiniDlna(const std::string &music);
    ~MiniDlna();
    MiniDlna(const MiniDlna &) = delete;
    MiniDlna &operator=(const MiniDlna &) = delete;

    const std::string &name() const { return name_; }

    /* "http://127.0.0.1:PORT" and a path. */
    std::string url(const std::string &path) const;

    /* Of the ContentDirectory. */
    std::string control() const { return url("/ctl/ContentDir"); }

    /* What it has to say, for messages of tests that fail. */
    std::string log() const { return files::read(folder_.path("minidlna.log")); }

  private:
    files::Folder folder_;
    int port_;
    std::string name_;
    std::optional<program::Process> program_;
};

}  // namespace integration

/* Work on what strangers send, in a process of its own: it may hang, crash or take all memory. */
#pragma once

#include <functional>
#include <string>

namespace vorelix {

struct ChildAnswer {
    enum class End {
        Finished,  // the work came to its end
        TooLate,   // it was ended
        Died,      // by a signal or an exception
    };
    End end = End::Died;
    std::string text;  // what it wrote before that
};

/* Runs work(pipe) in a child, which writes its answer, of 256 MiB at most, to the pipe. The child
 * has half a gigabyte of memory and ends with this process, or after the time at the latest. Throws
 * std::system_error when there is no process to be had. */
ChildAnswer runInChild(const std::function<void(int pipe)> &work, int timeoutMs);

/* The whole text, whatever its length; false when nobody reads any more. */
bool writeWhole(int file, const std::string &text);

}  // namespace vorelix

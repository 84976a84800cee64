/* Agents of the tests below. */
#pragma once

#include <gtest/gtest.h>
#include <poll.h>
#include <sys/syscall.h>
#include <unistd.h>
#include <vorelix/upnp/dmagent.h>

#include <csignal>
#include <cstdlib>
#include <functional>
#include <memory>
#include <string>

#include "support/process.h"

namespace upnp_test {

/* Gives up the response, which is the caller's, as a text; "(null)" when there is none. */
inline std::string takeResponse(DMAgent &agent) {
    const std::unique_ptr<char, decltype(&std::free)> response(agent.response, &std::free);
    agent.response = nullptr;
    return response != nullptr ? response.get() : "(null)";
}

/* True when work in a child is still under way a while after isDue() has come true. */
inline bool isUnderWay(
    const std::function<void()> &work, const std::function<bool()> &isDue = [] { return true; }) {
    const pid_t child = process::start([&] {
        work();
        return 0;
    });
    const auto handle = static_cast<int>(syscall(SYS_pidfd_open, child, 0));
    pollfd end{handle, POLLIN, 0};
    constexpr int kPatience = 3000;  // tens of milliseconds
    for (int i = 0; i < kPatience && !isDue() && poll(&end, 1, 10) == 0; ++i) {
    }
    EXPECT_TRUE(isDue());
    poll(&end, 1, 50);
    kill(child, SIGKILL);
    close(handle);
    return process::statusOf(child) == 128 + SIGKILL;
}

}  // namespace upnp_test

/* Addresses of the loopback interface, for servers of tests and those who ask them. */
#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <cstdint>
#include <stdexcept>

namespace loopback {

inline sockaddr_in address(int port) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    return address;
}

/* How the system's functions take it. */
inline sockaddr *general(sockaddr_in &address) {
    return reinterpret_cast<sockaddr *>(&address);
}

/* Binds a socket to a port on which nobody listens; the port. */
inline int bindToFreePort(int file) {
    sockaddr_in own = address(0);
    socklen_t size = sizeof own;
    if (bind(file, general(own), size) != 0 || getsockname(file, general(own), &size) != 0) {
        throw std::runtime_error("no port of the loopback interface");
    }
    return ntohs(own.sin_port);
}

}  // namespace loopback

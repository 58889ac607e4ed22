// Real loopback connections for the native teardown tests and the sweep benchmark: a private network
// namespace (so the sweep sees only the connections made here and never touches anybody else's),
// listeners on chosen 127.x.y.z addresses, and connected socket pairs.
#pragma once

#include <unistd.h>

#include <cstdint>
#include <string>
#include <utility>

namespace vantorel::testing {

// Why real teardown cannot run here, or empty when it can: it needs root (CAP_NET_ADMIN for
// SOCK_DESTROY, CAP_SYS_ADMIN for a private network namespace).
std::string TeardownUnavailableReason();

// Moves the calling thread (and threads it starts later) into a new network namespace with its
// loopback interface up. Empty on success, else what failed.
std::string EnterPrivateNetwork();

// Raises the open-file limit to at least `files`; false when it cannot.
bool AllowOpenFiles(std::uint64_t files);

class FileDescriptor {
public:
    FileDescriptor() = default;
    explicit FileDescriptor(int fd) : fd_(fd) {}
    FileDescriptor(FileDescriptor&& other) noexcept { std::swap(fd_, other.fd_); }
    // The descriptor held before goes to `other`, which closes it.
    FileDescriptor& operator=(FileDescriptor&& other) noexcept {
        std::swap(fd_, other.fd_);
        return *this;
    }
    ~FileDescriptor() {
        if (fd_ >= 0) ::close(fd_);
    }
    int get() const { return fd_; }
    explicit operator bool() const { return fd_ >= 0; }

private:
    int fd_ = -1;
};

// A TCP listener on `address` (dotted), port chosen by the system.
struct Listener {
    FileDescriptor fd;
    std::uint32_t address = 0;  // network order
    std::uint16_t port = 0;     // host order
};
Listener Listen(const std::string& address, int backlog = 4096);

// One connection from 127.0.0.1 to the listener, both ends kept.
struct Connection {
    FileDescriptor client;
    FileDescriptor server;
    std::uint16_t clientPort = 0;  // host order
};
Connection Connect(const Listener& listener);

// The address field of a dotted address as the connection table holds it.
std::uint32_t AddressField(const std::string& address);

// errno of a one-byte read that must not block: 0 when a byte or end of stream came, EAGAIN when
// the connection is idle and open, the error otherwise (ECONNABORTED for a torn-down socket).
int ReadError(int fd);

}  // namespace vantorel::testing

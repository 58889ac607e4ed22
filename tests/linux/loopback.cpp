#include "linux/loopback.h"

#include <arpa/inet.h>
#include <net/if.h>
#include <netinet/in.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace vantorel::testing {

std::string TeardownUnavailableReason() {
    return ::geteuid() == 0 ? ""
                            : "not run as root: tearing connections down (SOCK_DESTROY) and a private network "
                              "namespace need root, so the real-teardown tests are skipped";
}

std::string EnterPrivateNetwork() {
    auto failed = [](const char* call) { return std::string(call) + " failed: " + std::strerror(errno); };
    if (::unshare(CLONE_NEWNET) != 0) return failed("unshare(CLONE_NEWNET)");
    FileDescriptor control(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    ifreq request{};
    std::strncpy(request.ifr_name, "lo", IFNAMSIZ - 1);
    if (::ioctl(control.get(), SIOCGIFFLAGS, &request) != 0) return failed("SIOCGIFFLAGS");
    request.ifr_flags = static_cast<short>(request.ifr_flags | IFF_UP);
    if (::ioctl(control.get(), SIOCSIFFLAGS, &request) != 0) return failed("SIOCSIFFLAGS");
    return std::string();
}

bool AllowOpenFiles(std::uint64_t files) {
    rlimit limit{};
    if (::getrlimit(RLIMIT_NOFILE, &limit) != 0) return false;
    if (limit.rlim_cur >= files) return true;
    if (limit.rlim_max < files) limit.rlim_max = files;
    limit.rlim_cur = files;
    return ::setrlimit(RLIMIT_NOFILE, &limit) == 0;
}

std::uint32_t AddressField(const std::string& address) {
    in_addr parsed{};
    ::inet_pton(AF_INET, address.c_str(), &parsed);
    return parsed.s_addr;
}

Listener Listen(const std::string& address, int backlog) {
    Listener listener;
    listener.fd = FileDescriptor(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (!listener.fd) return listener;
    sockaddr_in local{};
    local.sin_family = AF_INET;
    local.sin_addr.s_addr = AddressField(address);
    if (::bind(listener.fd.get(), reinterpret_cast<sockaddr*>(&local), sizeof local) != 0 ||
        ::listen(listener.fd.get(), backlog) != 0) {
        listener.fd = FileDescriptor();
        return listener;
    }
    socklen_t length = sizeof local;
    ::getsockname(listener.fd.get(), reinterpret_cast<sockaddr*>(&local), &length);
    listener.address = local.sin_addr.s_addr;
    listener.port = ntohs(local.sin_port);
    return listener;
}

Connection Connect(const Listener& listener) {
    Connection connection;
    connection.client = FileDescriptor(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = listener.address;
    address.sin_port = htons(listener.port);
    // From 127.0.0.1: the source the loopback route gives every 127.x.y.z peer.
    if (::connect(connection.client.get(), reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) {
        connection.client = FileDescriptor();
        return connection;
    }
    connection.server = FileDescriptor(::accept4(listener.fd.get(), nullptr, nullptr, SOCK_CLOEXEC));
    socklen_t length = sizeof address;
    ::getsockname(connection.client.get(), reinterpret_cast<sockaddr*>(&address), &length);
    connection.clientPort = ntohs(address.sin_port);
    return connection;
}

int ReadError(int fd) {
    char byte = 0;
    return ::recv(fd, &byte, 1, MSG_DONTWAIT) >= 0 ? 0 : errno;  // EWOULDBLOCK is EAGAIN on Linux
}

}  // namespace vantorel::testing

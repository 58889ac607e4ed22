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

FileDescriptor& FileDescriptor::operator=(FileDescriptor&& other) noexcept {
    if (this != &other) {
        if (fd_ >= 0) ::close(fd_);
        fd_ = other.fd_;
        other.fd_ = -1;
    }
    return *this;
}

FileDescriptor::~FileDescriptor() {
    if (fd_ >= 0) ::close(fd_);
}

std::string TeardownUnavailableReason() {
    return ::geteuid() == 0 ? ""
                            : "not run as root: tearing connections down (SOCK_DESTROY) and a private network "
                              "namespace need root, so the real-teardown tests are skipped";
}

std::string EnterPrivateNetwork() {
    if (::unshare(CLONE_NEWNET) != 0) return std::string("unshare(CLONE_NEWNET) failed: ") + std::strerror(errno);
    FileDescriptor control(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    if (!control) return std::string("socket failed: ") + std::strerror(errno);
    ifreq request{};
    std::strncpy(request.ifr_name, "lo", IFNAMSIZ - 1);
    if (::ioctl(control.get(), SIOCGIFFLAGS, &request) != 0)
        return std::string("SIOCGIFFLAGS: ") + std::strerror(errno);
    request.ifr_flags = static_cast<short>(request.ifr_flags | IFF_UP);
    if (::ioctl(control.get(), SIOCSIFFLAGS, &request) != 0)
        return std::string("SIOCSIFFLAGS: ") + std::strerror(errno);
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
    if (!connection.client) return connection;
    sockaddr_in local{};
    local.sin_family = AF_INET;
    local.sin_addr.s_addr = AddressField("127.0.0.1");
    sockaddr_in remote{};
    remote.sin_family = AF_INET;
    remote.sin_addr.s_addr = listener.address;
    remote.sin_port = htons(listener.port);
    if (::bind(connection.client.get(), reinterpret_cast<sockaddr*>(&local), sizeof local) != 0 ||
        ::connect(connection.client.get(), reinterpret_cast<sockaddr*>(&remote), sizeof remote) != 0) {
        connection.client = FileDescriptor();
        return connection;
    }
    connection.server = FileDescriptor(::accept4(listener.fd.get(), nullptr, nullptr, SOCK_CLOEXEC));
    socklen_t length = sizeof local;
    ::getsockname(connection.client.get(), reinterpret_cast<sockaddr*>(&local), &length);
    connection.clientPort = ntohs(local.sin_port);
    return connection;
}

int ReadError(int fd) {
    char byte = 0;
    ssize_t got = ::recv(fd, &byte, 1, MSG_DONTWAIT);
    if (got >= 0) return 0;
    return errno == EWOULDBLOCK ? EAGAIN : errno;
}

bool Exchange(int from, int to, const std::string& text) {
    if (::send(from, text.data(), text.size(), MSG_NOSIGNAL) != static_cast<ssize_t>(text.size())) return false;
    std::string got(text.size(), '\0');
    std::size_t have = 0;
    while (have < got.size()) {
        ssize_t n = ::recv(to, got.data() + have, got.size() - have, 0);
        if (n <= 0) return false;
        have += static_cast<std::size_t>(n);
    }
    return got == text;
}

}  // namespace vantorel::testing

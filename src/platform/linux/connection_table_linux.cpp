#include "platform/linux/connection_table_linux.h"

#include <linux/netlink.h>
#include <linux/sock_diag.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <numeric>
#include <tuple>

namespace vantorel::linux_platform {

namespace {

constexpr std::size_t kReceiveBytes = 256 * 1024;  // larger reads let the kernel pack more rows per call

struct Request {
    nlmsghdr header;
    inet_diag_req_v2 body;
};

Request MakeRequest(std::uint16_t type, std::uint16_t flags, std::uint32_t sequence) {
    Request request;
    std::memset(&request, 0, sizeof request);
    request.header.nlmsg_len = sizeof request;
    request.header.nlmsg_type = type;
    request.header.nlmsg_flags = flags;
    request.header.nlmsg_seq = sequence;
    request.body.sdiag_family = AF_INET;
    request.body.sdiag_protocol = IPPROTO_TCP;
    request.body.idiag_states = ~0u;
    return request;
}

bool SendRequest(int fd, const Request& request) {
    sockaddr_nl kernel{};
    kernel.nl_family = AF_NETLINK;
    for (;;) {
        ssize_t sent =
            ::sendto(fd, &request, sizeof request, 0, reinterpret_cast<const sockaddr*>(&kernel), sizeof kernel);
        if (sent == static_cast<ssize_t>(sizeof request)) return true;
        if (sent < 0 && errno == EINTR) continue;
        return false;
    }
}

bool SameTuple(const inet_diag_sockid& id, const platform::TcpRow& row) {
    return id.idiag_src[0] == row.localAddr && id.idiag_dst[0] == row.remoteAddr && id.idiag_sport == row.localPort &&
           id.idiag_dport == row.remotePort;
}

}  // namespace

LinuxConnectionTable::LinuxConnectionTable()
    : fd_(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_SOCK_DIAG)), receive_(kReceiveBytes) {}

LinuxConnectionTable::~LinuxConnectionTable() {
    if (fd_ >= 0) ::close(fd_);
}

std::uint32_t LinuxConnectionTable::WindowsState(std::uint8_t linuxState) {
    switch (linuxState) {
        case TCP_ESTABLISHED: return platform::kTcpStateEstablished;
        case TCP_SYN_SENT: return platform::kTcpStateSynSent;
        case TCP_SYN_RECV: return platform::kTcpStateSynReceived;
        case TCP_FIN_WAIT1: return platform::kTcpStateFinWait1;
        case TCP_FIN_WAIT2: return platform::kTcpStateFinWait2;
        case TCP_TIME_WAIT: return platform::kTcpStateTimeWait;
        case TCP_CLOSE: return platform::kTcpStateClosed;
        case TCP_CLOSE_WAIT: return platform::kTcpStateCloseWait;
        case TCP_LAST_ACK: return platform::kTcpStateLastAck;
        case TCP_LISTEN: return platform::kTcpStateListen;
        case TCP_CLOSING: return platform::kTcpStateClosing;
        case 12: return platform::kTcpStateSynReceived;  // TCP_NEW_SYN_RECV: a request not yet accepted
        default: return platform::kTcpStateClosed;
    }
}

bool LinuxConnectionTable::Dump() {
    rows_.clear();
    ids_.clear();
    if (fd_ < 0) return false;
    std::uint32_t sequence = ++sequence_;
    if (!SendRequest(fd_, MakeRequest(SOCK_DIAG_BY_FAMILY, NLM_F_REQUEST | NLM_F_DUMP, sequence))) return false;
    for (;;) {
        ssize_t got = ::recv(fd_, receive_.data(), receive_.size(), 0);
        if (got < 0) {
            if (errno == EINTR) continue;
            return false;
        }
        if (got == 0) return false;
        int left = static_cast<int>(got);
        for (auto* header = reinterpret_cast<nlmsghdr*>(receive_.data()); NLMSG_OK(header, left);
             header = NLMSG_NEXT(header, left)) {
            if (header->nlmsg_seq != sequence) continue;  // an answer to an earlier request
            if (header->nlmsg_type == NLMSG_DONE) return true;
            if (header->nlmsg_type == NLMSG_ERROR) return false;
            if (header->nlmsg_type != SOCK_DIAG_BY_FAMILY || header->nlmsg_len < NLMSG_LENGTH(sizeof(inet_diag_msg)))
                continue;
            const auto* message = static_cast<const inet_diag_msg*>(NLMSG_DATA(header));
            if (message->idiag_family != AF_INET) continue;
            const inet_diag_sockid& id = message->id;
            rows_.push_back(platform::TcpRow{WindowsState(message->idiag_state), id.idiag_src[0], id.idiag_sport,
                                             id.idiag_dst[0], id.idiag_dport});
            ids_.push_back(id);
        }
    }
}

std::uint32_t LinuxConnectionTable::GetTcpTable(void* table, std::uint32_t& size, bool order) {
    constexpr std::uint32_t kGenFailure = 31;
    if (table == nullptr && size != 0) return 87;
    if (!Dump()) return kGenFailure;
    auto count = static_cast<std::uint32_t>(rows_.size());
    std::uint32_t needed = platform::TcpTableBytes(count);
    if (size < needed) {
        size = needed;
        return platform::kErrorInsufficientBuffer;
    }
    auto* out = static_cast<unsigned char*>(table);
    std::memcpy(out, &count, 4);
    if (!order) {
        if (count != 0) std::memcpy(out + 4, rows_.data(), count * sizeof(platform::TcpRow));
        return platform::kNoError;
    }
    // Sorted as the system sorts: local address and port, then remote address and port, each as
    // the numbers they are in network order.
    order_.resize(count);
    std::iota(order_.begin(), order_.end(), 0u);
    auto key = [this](std::uint32_t i) {
        const platform::TcpRow& r = rows_[i];
        return std::make_tuple(ntohl(r.localAddr), ntohs(static_cast<std::uint16_t>(r.localPort)), ntohl(r.remoteAddr),
                               ntohs(static_cast<std::uint16_t>(r.remotePort)));
    };
    std::sort(order_.begin(), order_.end(), [&](std::uint32_t a, std::uint32_t b) { return key(a) < key(b); });
    for (std::uint32_t i = 0; i < count; ++i)
        std::memcpy(out + 4 + i * sizeof(platform::TcpRow), &rows_[order_[i]], sizeof(platform::TcpRow));
    return platform::kNoError;
}

std::uint32_t LinuxConnectionTable::SetTcpEntry(const platform::TcpRow& row) {
    constexpr std::uint32_t kAccessDenied = 5, kGenFailure = 31, kInvalidParameter = 87, kNotFound = 1168;
    if (row.state != platform::kTcpStateDeleteTcb) return kInvalidParameter;
    if (fd_ < 0) return kGenFailure;

    Request request = MakeRequest(SOCK_DESTROY, NLM_F_REQUEST | NLM_F_ACK, ++sequence_);
    auto found = std::find_if(ids_.begin(), ids_.end(), [&](const inet_diag_sockid& id) { return SameTuple(id, row); });
    if (found != ids_.end()) {
        request.body.id = *found;
    } else {
        request.body.id.idiag_src[0] = row.localAddr;
        request.body.id.idiag_dst[0] = row.remoteAddr;
        request.body.id.idiag_sport = static_cast<std::uint16_t>(row.localPort);
        request.body.id.idiag_dport = static_cast<std::uint16_t>(row.remotePort);
        request.body.id.idiag_cookie[0] = INET_DIAG_NOCOOKIE;
        request.body.id.idiag_cookie[1] = INET_DIAG_NOCOOKIE;
    }
    if (!SendRequest(fd_, request)) return kGenFailure;
    for (;;) {
        ssize_t got = ::recv(fd_, receive_.data(), receive_.size(), 0);
        if (got < 0 && errno == EINTR) continue;
        if (got <= 0) return kGenFailure;
        int left = static_cast<int>(got);
        for (auto* header = reinterpret_cast<nlmsghdr*>(receive_.data()); NLMSG_OK(header, left);
             header = NLMSG_NEXT(header, left)) {
            if (header->nlmsg_seq != request.header.nlmsg_seq || header->nlmsg_type != NLMSG_ERROR) continue;
            if (header->nlmsg_len < NLMSG_LENGTH(sizeof(nlmsgerr))) return kGenFailure;
            int error = -static_cast<const nlmsgerr*>(NLMSG_DATA(header))->error;
            if (error == 0) return platform::kNoError;
            if (error == EPERM || error == EACCES) return kAccessDenied;
            if (error == ENOENT) return kNotFound;
            return kGenFailure;
        }
    }
}

}  // namespace vantorel::linux_platform

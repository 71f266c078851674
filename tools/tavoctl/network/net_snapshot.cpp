// The settings of an interface and the gateway as they are now, so that they can be put back exactly.
#include "network/net_snapshot.h"

#include "frame/failure.h"
#include "frame/held_locks.h"

#include "tavo_file.h"
#include "tavo_lock.h"
#include "tavo_proc.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

constexpr const char *folder = "/etc/sysconfig/network-scripts/";
constexpr const char *network_file = "/etc/sysconfig/network";
constexpr int most_routes = 8;

std::optional<std::string> Text(const std::string &path)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
        return std::nullopt;
    return std::string((std::istreambuf_iterator<char>(in)), {});
}

std::string Setting(const std::string &path, const char *key)
{
    char value[64] = "";
    return TLIBFileGetKeyValue(path.c_str(), key, value, sizeof value, 0) > 0 ? value : "";
}

bool WriteNew(int fd, const std::string &text, mode_t mode)
{
    std::size_t done = 0;
    while (done < text.size()) {
        const ssize_t put = ::write(fd, text.data() + done, text.size() - done);
        if (put < 0 && errno != EINTR)
            return false;
        done += put > 0 ? static_cast<std::size_t>(put) : 0;
    }
    return ::fchmod(fd, mode) == 0 && ::fsync(fd) == 0;
}

// The file is the old or the new one, whenever this is killed.
bool Restore(const std::string &path, const std::optional<std::string> &text)
{
    if (!text)
        return ::unlink(path.c_str()) == 0 || errno == ENOENT;
    if (Text(path) == text)
        return true;
    struct stat st;
    const mode_t mode = ::stat(path.c_str(), &st) == 0 ? st.st_mode & 0777 : 0644;
    std::string temp = path + ".XXXXXX";
    const int fd = ::mkostemp(temp.data(), O_CLOEXEC);
    if (fd < 0)
        return false;
    const bool written = WriteNew(fd, *text, mode);
    if (::close(fd) == 0 && written && std::rename(temp.c_str(), path.c_str()) == 0)
        return true;
    ::unlink(temp.c_str());
    return false;
}

std::string LiveGateway()
{
    char gateway[20] = "";
    return TAVONetDefaultGatewayGet(gateway, sizeof gateway) == 0 ? gateway : "";
}

}  // namespace

void CheckInterface(const std::string &attempted, const std::string &interface)
{
    char ignored[16];
    if (TAVOConfGetMTUValue(interface.c_str(), ignored, sizeof ignored) != 0 && TLIBErrGet() == ERR_BAD_PARAMETERS)
        throw UsageFailure(attempted, "there can be no interface of that name");
}

TAVONETCARD FirstCard(const std::string &attempted)
{
    TAVONETCARD card = {};
    if (TAVONetGetCard1(&card) != 0)
        throw LibraryFailure(attempted, "is there a wired interface at all?");
    return card;
}

NetSnapshot::NetSnapshot(const std::string &interface)
    : file_(folder + ("ifcfg-" + interface)), file_text_(Text(file_)), network_text_(Text(network_file)),
      gateway_(LiveGateway())
{
    Put(card_.szInterface, interface);
    card_.nMode = Setting(file_, "BOOTPROTO") == "dhcp" ? TAVO_NET_DHCP : TAVO_NET_STATIC;
    Put(card_.szIp, Setting(file_, "IPADDR"));
    Put(card_.szMask, Setting(file_, "NETMASK"));
    TAVONETCARD first = {};
    if (!card_.szIp[0] && TAVONetGetCard1(&first) == 0 && first.szInterface == interface) {
        Put(card_.szIp, first.szIp);
        Put(card_.szMask, first.szMask);
    }
}

bool NetSnapshot::PutBackFiles() const
{
    const bool interface = Restore(file_, file_text_);
    return Restore(network_file, network_text_) && interface;
}

bool NetSnapshot::PutBackKernel() const
{
    // The route must go before its network does, or there is none to go back to.
    if (card_.nMode == TAVO_NET_STATIC && !card_.szIp[0])
        return TLIBSystem(("/sbin/ifconfig " + std::string(card_.szInterface) + " 0.0.0.0 > /dev/null 2>&1").c_str()) ==
               0;
    if (TAVONetSetCard1(&card_, nullptr) == -1)
        return false;
    // A route that was added beside the old one stands before it.
    std::string now = LiveGateway();
    for (int i = 0; i < most_routes && !now.empty() && now != gateway_; ++i) {
        TLIBSystem(("/sbin/route delete default gw " + now + " > /dev/null 2>&1").c_str());
        now = LiveGateway();
    }
    return now == gateway_ || (!gateway_.empty() && TAVONetDefaultGatewaySet(gateway_.c_str()) == 0);
}

bool NetSnapshot::PutBack() const
{
    try {
        const HeldLocks lock(TAVO_LOCK_HOST, false, usual_wait);
        // The files first, for the library adds what they say; and last, for it may write them in another order.
        const bool before = PutBackFiles();
        const bool kernel = PutBackKernel();
        return PutBackFiles() && before && kernel;
    } catch (const Failure &) {
        return false;
    }
}

}  // namespace tavoctl

// Appliances that find each other over real UDP, and attacks from the same cable, which have no effect.
#include "tavo_fhost.h"
#include "tavo_proc.h"

#include "packet.h"
#include "support/container_text.h"
#include "support/rounds.h"
#include "support/test.h"
#include "support/text_lines.h"
#include "support/virtual_cable.h"

#include <chrono>
#include <random>
#include <regex>

#include <arpa/inet.h>
#include <sys/file.h>
#include <sys/socket.h>

using test::Eventually;
using test::Lines;
using test::Node;
using test::ReadFile;
using test::ShellStatus;
using testing::HasSubstr;
using testing::UnorderedElementsAre;

namespace {

constexpr const char *kList = "/tmp/tavods.list";
constexpr const char *kDaemon = "/usr/tavo/bin/findhostd";
constexpr const char *kPidFile = "/var/run/findhostd.pid";

const std::string kQuery(reinterpret_cast<const char *>(stFHOSTBroadCast), sizeof stFHOSTBroadCast);

size_t awaited_lines = 0;  // the library sleeps until the list has so many, 20 seconds at most

std::string ListText()
{
    return std::filesystem::is_regular_file(kList) ? ReadFile(kList) : "";
}

// Asks, and waits until the list has so many hosts.
void ExpectAnswers(size_t hosts)
{
    EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
    EXPECT_TRUE(Eventually([&] { return Lines(ListText()).size() == hosts; })) << ListText();
}

// The hosts that a caller of the library finds, "NAME(ADDRESS)", sorted. The daemon is started where none runs.
std::vector<std::string> Discover(size_t expected, int *result = nullptr)
{
    awaited_lines = expected;
    const int dumped = TAVOFHOSTDumpHost();
    if (result)
        *result = dumped;
    test::Hash hosts(PshTLIBSzHashAlloc(1024));
    test::Moving(hosts, TAVOFHOSTGet2Hash);
    std::vector<std::string> keys;
    for (const auto &[key, address] : test::Pairs(hosts.get()))
        keys.push_back(key);
    return keys;
}

class Daemons : public testing::Test {
  protected:
    void SetUp() override
    {
        if (const std::string missing = test::VirtualCable::Missing(); !missing.empty())
            GTEST_SKIP() << missing;
        if (test::RootLacks("uids"))
            GTEST_SKIP() << "the daemon has nobody to become";
        cable_.emplace("cable");
        for (int i = 0; i < 3; ++i) {
            Node &node = nodes_[i].emplace("nas" + std::to_string(i + 1));
            cable_->Plug(node, "eth0");
            ASSERT_EQ(node.Shell("ifconfig eth0 192.0.2." + std::to_string(i + 1) + " netmask 255.255.255.0 up"), 0);
        }
    }

    void StartAll()
    {
        for (auto &node : nodes_)
            ASSERT_EQ(node->Shell(kDaemon), 0);
    }

    std::optional<test::VirtualCable> cable_;
    std::optional<Node> nodes_[3];
};

TEST_F(Daemons, FindEachOther)
{
    for (int i = 1; i < 3; ++i)
        ASSERT_EQ(nodes_[i]->Shell(kDaemon), 0);
    nodes_[0]->Do([] {
        EXPECT_THAT(Discover(2), UnorderedElementsAre("nas2(192.0.2.2)", "nas3(192.0.2.3)"));
        EXPECT_FALSE(std::filesystem::exists(kList)) << "taken";
        EXPECT_GT(TLIBReadPidFile(kPidFile), 0) << "the library started it";
    });
    // And the others that one, by now; once more and a second time, since each query begins a new list.
    for (int round = 0; round < 2; ++round)
        nodes_[1]->Do([] { EXPECT_THAT(Discover(2), UnorderedElementsAre("nas1(192.0.2.1)", "nas3(192.0.2.3)")); });
    // A new name, and one that is switched off, are known once the last answers are old.
    ASSERT_TRUE(nodes_[0]->Run([] { return ::sethostname("attic", 5) == 0; }));
    ASSERT_EQ(nodes_[2]->Shell("ifconfig eth0 down"), 0);
    ::usleep(15500000);
    nodes_[1]->Do([] {
        std::filesystem::remove(kList);
        EXPECT_THAT(Discover(1), UnorderedElementsAre("attic(192.0.2.1)"));
    });
}

// Whatever the ports of the asker have on them: three others on the cable.
TEST_F(Daemons, AreFoundByABoxWithTwoPorts)
{
    StartAll();
    Node asker("asker");
    ASSERT_EQ(asker.Shell("rm -f /etc/sysconfig/network-scripts/*"), 0);
    test::VirtualCable second("second");
    cable_->Plug(asker, "eth0");
    second.Plug(asker, "eth1");
    const std::vector<std::string> all = {"nas1(192.0.2.1)", "nas2(192.0.2.2)", "nas3(192.0.2.3)"};
    const auto found = [&](const char *cables, const std::vector<std::string> &expected) {
        ASSERT_EQ(asker.Shell(cables), 0) << cables;
        SCOPED_TRACE(cables);
        asker.Do([&] {
            EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
            int result = -1;
            EXPECT_THAT(Discover(expected.size(), &result), testing::UnorderedElementsAreArray(expected));
            EXPECT_EQ(result, 0) << "nothing has failed";
        });
    };
    found("ip link set eth0 down && ip link set eth1 down", {});
    found("ifconfig eth0 192.0.2.9 netmask 255.255.255.0 up", all);
    found("ip link set eth1 up", all);
    // The cable is in the other port.
    found("ifconfig eth0 0.0.0.0 down; ip link set eth0 name eth9 && ip link set eth1 name eth0 && "
          "ip link set eth9 name eth1 && ifconfig eth1 192.0.2.9 netmask 255.255.255.0 up",
          all);
}

// What follows looks at the processes of the node in which it runs.
bool IsGone(const std::string &pid)
{
    return Eventually([&] { return !std::filesystem::exists("/proc/" + pid); });
}

// The two processes of the daemon: who writes and who listens.
struct Pids {
    std::string root = ReadFile(kPidFile);
    std::string listener;

    Pids()
    {
        root.resize(root.find('\n'));
        listener = ReadFile("/proc/" + root + "/task/" + root + "/children");
        listener.resize(listener.find(' '));
    }
};

TEST_F(Daemons, TheListenerHasNoRights)
{
    StartAll();
    nodes_[0]->Do([] {
        const Pids pids;
        std::string rights;
        for (const std::string &line : Lines(ReadFile("/proc/" + pids.listener + "/status"))) {
            if (std::regex_search(line, std::regex("^(Uid|Gid|Groups|Cap(Inh|Prm|Eff|Amb)|NoNewPrivs):")))
                rights += line + "\n";
        }
        EXPECT_EQ(rights, "Uid:\t65534\t65534\t65534\t65534\nGid:\t65534\t65534\t65534\t65534\nGroups:\t \n"
                          "CapInh:\t0000000000000000\nCapPrm:\t0000000000000000\nCapEff:\t0000000000000000\n"
                          "CapAmb:\t0000000000000000\nNoNewPrivs:\t1\n");
        EXPECT_THAT(std::filesystem::read_symlink("/proc/" + pids.listener + "/root").string(), HasSubstr("(deleted)"));
        // Standard streams, the network, the other part: nothing else is open.
        size_t sockets = 0;
        for (const auto &fd : std::filesystem::directory_iterator("/proc/" + pids.listener + "/fd")) {
            const std::string what = std::filesystem::read_symlink(fd.path());
            sockets += what.starts_with("socket:");
            EXPECT_TRUE(what.starts_with("socket:") || std::atoi(fd.path().filename().c_str()) < 3) << what;
        }
        EXPECT_EQ(sockets, 2u);
        // The writer has one, and never hears the network.
        sockets = 0;
        for (const auto &fd : std::filesystem::directory_iterator("/proc/" + pids.root + "/fd"))
            sockets += std::filesystem::read_symlink(fd.path()).string().starts_with("socket:");
        EXPECT_EQ(sockets, 1u);
    });
}

TEST_F(Daemons, OneEndsWithTheOther)
{
    StartAll();
    nodes_[0]->Do([] {
        const std::pair<bool, int> ends[] = {{true, SIGTERM}, {false, SIGKILL}, {true, SIGKILL}};
        for (const auto &[writer, signal] : ends) {
            const Pids pids;
            EXPECT_NE(ShellStatus(std::string(kDaemon) + " 2>/dev/null"), 0) << "one is enough";
            EXPECT_EQ(::kill(std::atoi((writer ? pids.root : pids.listener).c_str()), signal), 0);
            EXPECT_TRUE(IsGone(pids.root) && IsGone(pids.listener));
            EXPECT_EQ(std::filesystem::exists(kPidFile), writer && signal == SIGKILL);
            EXPECT_EQ(ShellStatus(kDaemon), 0) << "what a crash left is in nobody's way";
        }
    });
}

// The starting program reads to the end of its output, or has no streams at all.
TEST_F(Daemons, LeaveTheCallersStreams)
{
    nodes_[0]->Do([] {
        const std::string daemon = kDaemon;
        EXPECT_EQ(ShellStatus("x=$(timeout 20 sh -c '" + daemon + " 2>&1; echo $?'); [ \"$x\" = 0 ]"), 0);
        for (const char *closed : {"0<&-", "1>&-", "2>&-", "0<&- 1>&- 2>&-"}) {
            const Pids pids;
            EXPECT_EQ(::kill(std::atoi(pids.root.c_str()), SIGTERM), 0);
            EXPECT_TRUE(IsGone(pids.root) && IsGone(pids.listener));
            EXPECT_EQ(ShellStatus(daemon + " " + closed), 0) << closed;
            EXPECT_NE(ShellStatus(daemon + " 2>/dev/null"), 0) << "one is enough, " << closed;
        }
        const Pids pids;
        for (const std::string &pid : {pids.root, pids.listener}) {
            for (const char *fd : {"0", "1", "2"})
                EXPECT_EQ(std::filesystem::read_symlink("/proc/" + pid + "/fd/" + fd), "/dev/null") << pid << fd;
        }
    });
}

TEST_F(Daemons, IgnoreALockOfAnotherProgram)
{
    nodes_[0]->Do([] {
        test::WriteFile(kPidFile, "1\n");
        const int fd = ::open(kPidFile, O_RDONLY | O_CLOEXEC);
        EXPECT_EQ(::flock(fd, LOCK_EX), 0);
        EXPECT_EQ(ShellStatus(kDaemon), 0);
        EXPECT_GT(TLIBReadPidFile(kPidFile), 1);
        ::close(fd);
    });
}

class UdpSocket {
  public:
    explicit UdpSocket(uint16_t port = 0, const std::string &from = "0.0.0.0")
    {
        const int on = 1;
        ::setsockopt(fd_, SOL_SOCKET, SO_BROADCAST, &on, sizeof on);
        const sockaddr_in here = Address(from.c_str(), port);
        EXPECT_EQ(::bind(fd_, reinterpret_cast<const sockaddr *>(&here), sizeof here), 0);
    }
    ~UdpSocket() { ::close(fd_); }

    void Send(const char *to, std::string_view bytes) const
    {
        const sockaddr_in where = Address(to, findhostd::kPort);
        ::sendto(fd_, bytes.data(), bytes.size(), 0, reinterpret_cast<const sockaddr *>(&where), sizeof where);
    }

    // How many packets come until none has for half a second.
    size_t Count() const
    {
        const timeval patience = {0, 500000};
        ::setsockopt(fd_, SOL_SOCKET, SO_RCVTIMEO, &patience, sizeof patience);
        char bytes[600];
        size_t count = 0;
        while (::recv(fd_, bytes, sizeof bytes, 0) >= 0)
            ++count;
        return count;
    }

  private:
    static sockaddr_in Address(const char *address, uint16_t port)
    {
        sockaddr_in where{};
        where.sin_family = AF_INET;
        where.sin_addr.s_addr = ::inet_addr(address);
        where.sin_port = htons(port);
        return where;
    }

    const int fd_ = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
};

std::string Reply(const char *address, const std::string &name)
{
    findhostd::Host host{};
    host.model = 7;
    host.protocol = 250;
    host.address.s_addr = ::inet_addr(address);
    name.copy(host.name, findhostd::kLongestName);
    std::array<uint8_t, findhostd::kLargestPacket> packet;
    return {reinterpret_cast<const char *>(packet.data()), findhostd::WriteReply(host, packet)};
}

// Writable memory of both parts, in kB.
long MemoryOf(const Node &node)
{
    return std::stol(node.Output("p=$(cat /var/run/findhostd.pid); cat /proc/$p/status "
                                 "/proc/$(echo $(cat /proc/$p/task/$p/children))/status | "
                                 "awk '$1 == \"VmData:\" { n += $2 } END { print n }'"));
}

// So many packets that say nothing valid of 192.0.2.3, which sends them, and at last one that does.
void Flood(int packets, unsigned seed)
{
    const UdpSocket socket;
    const std::string good = Reply("192.0.2.3", "mallory");
    std::mt19937 random(seed);
    for (int i = 0; i < packets; ++i) {
        std::string bytes = i % 2 ? good : kQuery;
        switch (random() % 3) {
        case 0:
            bytes = Reply("192.0.2.2", "stolen");
            break;
        case 1:
            bytes.resize(random() % bytes.size());
            break;
        default:
            bytes = good;
            for (char &byte : bytes)
                byte = random() % 4 ? byte : static_cast<char>(random());
            std::memcpy(bytes.data() + bytes.size() - 4, "\x09\x09\x09\x09", 4);  // never its own address
        }
        socket.Send("192.0.2.1", bytes);
    }
    socket.Send("192.0.2.1", std::string(60000, 'x'));
    socket.Send("192.0.2.1", "");
    ::usleep(200000);
    socket.Send("192.0.2.1", good);  // when it is there, all the others have been seen
}

TEST_F(Daemons, AMillionHostilePacketsChangeNothing)
{
    ASSERT_EQ(nodes_[0]->Shell(kDaemon), 0);
    ASSERT_EQ(nodes_[1]->Shell(kDaemon), 0);
    nodes_[2]->Do([] {
        UdpSocket().Send("192.0.2.1", Reply("192.0.2.3", "unasked"));
        ::usleep(300000);
    });
    const int packets = test::Rounds(1000000) / (std::getenv("TAVO_LONG_TESTS") ? 1 : 4);
    long memory = 0;
    for (const unsigned round : {1u, 9u}) {
        nodes_[0]->Do([] {
            EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
            EXPECT_TRUE(Eventually([] { return !Lines(ListText()).empty(); }));
        });
        nodes_[2]->Do([&] { Flood(packets / 10 * static_cast<int>(round), round); });
        nodes_[0]->Do([] {
            EXPECT_TRUE(Eventually([] { return Lines(ListText()).size() == 2; })) << ListText();
            EXPECT_THAT(Lines(ListText()),
                        UnorderedElementsAre("6,240,nas2,192.0.2.2,eth0", "7,250,mallory,192.0.2.3,eth0"));
            struct stat st;
            EXPECT_EQ(::stat(kList, &st), 0);
            EXPECT_EQ(st.st_uid, 0u);
            EXPECT_EQ(st.st_mode & 07777, 0644u);
        });
        const long now = MemoryOf(*nodes_[0]);
        EXPECT_LT(now, 16384 * 2);
        EXPECT_TRUE(memory == 0 || now == memory) << now << " kB instead of " << memory;
        memory = now;
    }
}

TEST_F(Daemons, CannotBeUsedToFloodAnotherHost)
{
    ASSERT_EQ(nodes_[0]->Shell(kDaemon), 0);
    nodes_[1]->Do([&] {
        const UdpSocket socket(findhostd::kPort);
        socket.Send("192.0.2.1", kQuery);
        EXPECT_EQ(socket.Count(), 1u);
        for (int i = 0; i < 2000; ++i)
            socket.Send("192.0.2.1", kQuery);
        const size_t answers = socket.Count();
        EXPECT_GE(answers, 1u);
        EXPECT_LE(answers, 20u) << "2 a second, for as long as it takes to send";
    });
    // An asker whose address is not of this network.
    ASSERT_EQ(nodes_[2]->Shell("ifconfig eth0 198.51.100.3 netmask 255.255.255.0 && route add default dev eth0"), 0);
    ASSERT_EQ(nodes_[0]->Shell("route add default dev eth0"), 0);
    nodes_[2]->Do([&] {
        const UdpSocket socket(findhostd::kPort);
        socket.Send("192.0.2.1", kQuery);
        EXPECT_EQ(socket.Count(), 0u);
    });
}

// Every local user may ask, too, at any rate.
TEST_F(Daemons, ALocalQueryEmptiesNoList)
{
    StartAll();
    nodes_[0]->Do([] {
        ExpectAnswers(2);
        const UdpSocket socket;
        std::set<ino_t> lists;
        const auto begin = std::chrono::steady_clock::now();
        for (int i = 0; i < 1000; ++i) {
            socket.Send("127.0.0.1", kQuery);
            ::usleep(2000);
            struct stat st;
            if (::stat(kList, &st) == 0)
                lists.insert(st.st_ino);
            EXPECT_EQ(Lines(ListText()).size(), 2u);
        }
        const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - begin;
        EXPECT_LE(double(lists.size()), 4 * taken.count() + 4) << "four a second";
    });
    // The other two: a later answer in the same collection does not rename a host.
    nodes_[1]->Do([] { UdpSocket().Send("192.0.2.1", Reply("192.0.2.2", "forged")); });
    // And one that is not of the interface's network is none.
    ASSERT_EQ(nodes_[2]->Shell("ifconfig eth0 198.51.100.3 netmask 255.255.255.0 && route add default dev eth0"), 0);
    nodes_[2]->Do([] { UdpSocket().Send("192.0.2.1", Reply("198.51.100.3", "foreign")); });
    ::usleep(600000);
    nodes_[0]->Do([] {
        EXPECT_THAT(Lines(ListText()), UnorderedElementsAre("6,240,nas2,192.0.2.2,eth0", "6,240,nas3,192.0.2.3,eth0"));
    });
}

TEST_F(Daemons, ReplaceForeignFilesAtTheListsPath)
{
    StartAll();
    nodes_[0]->Do([] {
        test::WriteFile("/tmp/victim", "root:x\n");
        std::filesystem::create_symlink("/tmp/victim", kList);
        ExpectAnswers(2);
        EXPECT_FALSE(std::filesystem::is_symlink(kList));
        EXPECT_EQ(ReadFile("/tmp/victim"), "root:x\n");
        std::filesystem::remove(kList);
        std::filesystem::create_directory(kList);
        ExpectAnswers(2);
        for (const auto &entry : std::filesystem::directory_iterator("/tmp"))
            EXPECT_FALSE(entry.path().filename().string().starts_with(".tavods.list")) << entry.path();
    });
}

}  // namespace

// The library's waiting: a tenth of the time between two looks at the list, not for the daemon, which is ready when its
// start is over, and for answers until they are there.
extern "C" unsigned sleep(unsigned seconds)
{
    if (seconds == 1)
        ::usleep(100000);
    for (int i = 0; seconds >= 10 && i < 2000 && Lines(ListText()).size() < awaited_lines; ++i)
        ::usleep(10000);
    return 0;
}

// Discovery: the packets and whom they are sent to, and the list of those who answered.
#include "tavo_fhost.h"

#include "network/named_process.h"
#include "network/net/cards.h"
#include "support/own_child.h"
#include "support/owned_container.h"
#include "support/planted_name.h"
#include "support/story.h"
#include "support/test.h"

#include <chrono>

#include <sys/file.h>
#include <sys/socket.h>

using test::Cards;
using test::ReadFile;
using test::WriteFile;

namespace {

constexpr const char *kList = "/tmp/tavods.list";
constexpr const char *kTaken = "/tmp/tavods.list.tmp";

std::vector<std::string> sent;
std::string bound;
std::string no_send_from;
std::string no_bind_to;

std::string Text(const sockaddr *address)
{
    sockaddr_in where;
    std::memcpy(&where, address, sizeof where);
    return std::string(::inet_ntoa(where.sin_addr)) + ":" + std::to_string(ntohs(where.sin_port));
}

class Discovery : public Cards {
  protected:
    Discovery()
    {
        sent.clear();
        no_send_from = no_bind_to = "";
        std::filesystem::remove_all(kList);
        std::filesystem::remove_all(kTaken);
        story_.Mask("(sockfd=|s_addr = )[0-9]+", "$1...");
    }

    static std::vector<std::string> TakeSent() { return std::exchange(sent, {}); }

    test::Story story_{TEST_GOLDEN, {TakeSent, test::LogOf(log_), test::CallsOf(calls_, "sleep")}, {kList, kTaken}};
};

const std::string kQuery("\x12\x34\x56\x78TAVO\x01\x04\x01\x00\x00\x00\xA4\x04\x00\x00\x02\x01", 20);

TEST(DiscoveryPackets, AreTheseBytes)
{
    const auto text = [](const uint8_t *bytes, int32_t size) {
        return std::string(reinterpret_cast<const char *>(bytes), static_cast<size_t>(size));
    };
    std::string v11 = kQuery;
    v11.back() = 0;
    EXPECT_EQ(text(stFHOSTHeader, FHOSTHeaderSize), kQuery.substr(0, 8));
    EXPECT_EQ(text(stFHOSTBroadCast, FHOSTBroadCastSize), kQuery.substr(0, 8) + std::string(2, '\0'));
    EXPECT_EQ(text(stFHOSTBroadCastV11, FHOSTBroadCastSizeV11), v11);
    EXPECT_EQ(text(stFHOSTBroadCastVDS20, FHOSTBroadCastSizeVDS20), kQuery);
}

TEST_F(Discovery, TheQueryLeavesTwiceFromEveryCard)
{
    TELL(ErrFHOSTSendQueryPkt());
    AddCard("eth0", "192.0.2.10");
    AddCard("eth1", "198.51.100.10");
    TELL(ErrFHOSTSendQueryPkt());
    // A bond asks for its members, whatever they have.
    AddCard("bond0", "192.0.2.9");
    for (const char *member : {"eth0", "eth1"})
        tree_.Put(std::string("/sys/class/net/") + member + "/master", "");
    TELL(ErrFHOSTSendQueryPkt());
    for (const char *gone : {"eth0/master", "eth1/master", "bond0"})
        tree_.Remove(std::string("/sys/class/net/") + gone);
    // Ten cards are more than are asked.
    for (int i = 0; i < 10; ++i)
        AddCard("eth" + std::to_string(i), "192.0.2." + std::to_string(10 + i));
    TELL(ErrFHOSTSendBroadcastUdp("x", 1));
}

TEST_F(Discovery, EachFailureIsABitAndTheOthersAreTried)
{
    AddCard("eth0", "192.0.2.10");
    AddCard("eth1");
    WriteFile(test::kScripts + "ifcfg-eth1",
              "DEVICE=eth1\nBOOTPROTO=static\nIPADDR=192.0.2.11\n");  // not in the kernel
    AddCard("eth2", "192.0.2.12");
    AddCard("eth3", "192.0.2.13");
    AddCard("eth4", "unreadable");
    AddCard("eth10", "192.0.2.20");  // the last one
    no_bind_to = "192.0.2.12:0";
    no_send_from = "192.0.2.13:0";
    TELL(ErrFHOSTSendBroadcastUdp("hello", 5));
}

// A port without a cable is not a failure, and the ports after it keep their bits.
TEST_F(Discovery, SkipsCardsWithoutAnAddress)
{
    AddCard("eth0");
    WriteFile(test::kScripts + "ifcfg-eth0", "DEVICE=eth0\nBOOTPROTO=dhcp\nIPADDR=192.0.2.9\n");
    AddCard("eth1");
    WriteFile(test::kScripts + "ifcfg-eth1", "DEVICE=eth1\nBOOTPROTO=static\n");
    AddCard("eth2");
    TELL(ErrFHOSTSendQueryPkt());  // none is configured
    AddCard("eth3", "192.0.2.13");
    TELL(ErrFHOSTSendBroadcastUdp("x", 1));
    no_send_from = "192.0.2.13:0";
    TELL(ErrFHOSTSendBroadcastUdp("x", 1));
}

// This process, as the daemon does it: with the lock of the pid file.
class Daemon {
  public:
    Daemon() : fd_(::open(kPidFile, O_RDWR | O_CREAT | O_CLOEXEC, 0644))
    {
        EXPECT_EQ(::flock(fd_, LOCK_EX | LOCK_NB), 0);
    }
    ~Daemon()
    {
        ::close(fd_);
        ::unlink(kPidFile);
    }
    Daemon(const Daemon &) = delete;
    Daemon &operator=(const Daemon &) = delete;

    static constexpr const char *kPidFile = "/var/run/findhostd.pid";

  private:
    int fd_;
};

TEST_F(Discovery, WithoutADaemonNothingIsCollected)
{
    std::filesystem::remove("/usr/tavo/bin/findhostd");
    WriteFile("/usr/tavo/bin/findhostd", "#!/bin/sh\nexit 1\n", 0755);
    TELL(TAVOFHOSTDumpHost());
}

// Neither a name nor a pid file nor another user's lock on that file counts as a daemon.
TEST_F(Discovery, OnlyTheLockOfThePidFileIsADaemon)
{
    WriteFile("/usr/tavo/bin/findhostd", "#!/bin/sh\nexit 1\n", 0755);
    const test::NamedProcess pretender("/usr/tavo/bin/findhostd");
    EXPECT_EQ(TAVOFHOSTDumpHost(), -1);
    const Daemon daemon;
    log_.Clear();
    EXPECT_EQ(TAVOFHOSTDumpHost(), 0);
    EXPECT_EQ(log_.Take(), "");
    if (test::RootLacks("uids"))
        return;
    std::filesystem::remove(Daemon::kPidFile);
    WriteFile(Daemon::kPidFile, std::to_string(::getpid()) + "\n");
    int ready[2];
    ASSERT_EQ(::pipe2(ready, O_CLOEXEC), 0);
    const test::OwnChild nobody([&] {
        const int fd = ::setresuid(65534, 65534, 65534) == 0 ? ::open(Daemon::kPidFile, O_RDONLY) : -1;
        if (fd >= 0 && ::flock(fd, LOCK_EX) == 0 && ::write(ready[1], "", 1) == 1)
            ::pause();
    });
    char byte;
    EXPECT_EQ(::read(ready[0], &byte, 1), 1);
    EXPECT_EQ(TAVOFHOSTDumpHost(), 0) << "it is started, and its pid is there";
    EXPECT_THAT(log_.Texts().at(0), testing::EndsWith("findhostd daemon is not running ...."));
}

struct Heard {
    std::vector<std::string> hosts;
    size_t most = 100;

    static int Note(const TAVOFHOST *host, void *context)
    {
        auto &heard = *static_cast<Heard *>(context);
        heard.hosts.push_back(std::to_string(host->nModel) + " " + std::to_string(host->nProtocol) + " " +
                              host->szName + " " + host->szIp + " " + host->szInterface);
        return heard.hosts.size() == heard.most;
    }
};

TEST_F(Discovery, HostsAreHandedToACallbackAndTheListStays)
{
    const Daemon daemon;
    AddCard("eth0", "192.0.2.10");
    WriteFile(kList, "6,240,nas,192.0.2.11,eth0\n7,250,attic,192.0.2.12,eth1\n0,240,none,192.0.2.13,eth0\n");
    WriteFile(kTaken, "6,240,nas,192.0.2.11,eth0\n8,240,taken,192.0.2.14,eth0\n");
    const auto enumerate = [&](size_t most, int seconds) {
        Heard heard = {{}, most};
        TELL(TAVOFHOSTEnum(Heard::Note, &heard, seconds));
        story_.Show("heard", heard.hosts);
    };
    enumerate(100, 3);
    // A list of an earlier search does not count as an answer. The callback has heard enough.
    const auto past = std::filesystem::file_time_type::clock::now() - std::chrono::minutes(1);
    std::filesystem::last_write_time(kTaken, past);
    enumerate(1, 3);
    no_send_from = "192.0.2.10:0";
    enumerate(100, 3);  // others have answered
    std::filesystem::remove(kList);
    enumerate(100, 3);
    enumerate(100, 0);
    TELL(TAVOFHOSTEnum(nullptr, nullptr, 3));
}

TEST_F(Discovery, MovesTheListToItsCaller)
{
    const Daemon daemon;
    AddCard("eth0", "192.0.2.10");
    WriteFile(kList, "1,240,nas,192.0.2.11,x\n");
    TELL(TAVOFHOSTDumpHost());
    no_send_from = "192.0.2.10:0";
    TELL(TAVOFHOSTDumpHost());
}

TEST_F(Discovery, PlantedListsAreNotReadAndNotInTheWay)
{
    const Daemon daemon;
    test::Owned<TLIBSZHASH> hosts = test::HashOf({});
    const auto dump = [](const std::string &what) {
        EXPECT_EQ(TAVOFHOSTDumpHost(), 0) << what;
        EXPECT_TRUE(std::filesystem::is_regular_file(std::filesystem::symlink_status(kTaken))) << what;
        EXPECT_EQ(ReadFile(kTaken), "") << what;
        std::filesystem::remove(kTaken);
    };
    for (const test::Plant plant : test::kPlants) {
        test::PlantAt(kTaken, plant);
        EXPECT_EQ(TAVOFHOSTGet2Hash(hosts), 0) << plant;
        EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OPEN_FAILED, "fhost_get2_hash"})) << plant;
        test::RemovePlanted(kTaken);
        test::PlantAt(kList, plant);
        dump(testing::PrintToString(plant));
        if (const std::string aside = test::MovedAside(kList); !aside.empty())
            test::RemovePlanted(aside);
    }
    const std::string victim = std::string(kList) + ".target";
    EXPECT_EQ(ReadFile(victim), "kept");
    std::filesystem::create_hard_link(victim, kList);
    dump("a second name of another file");
    EXPECT_EQ(ReadFile(victim), "kept");
}

TEST_F(Discovery, TheListIsReadLineByLine)
{
    test::Owned<TLIBSZHASH> hosts = test::HashOf({});
    WriteFile(kTaken, "1,240,host,10.0.0.5,x\n"
                      "  2,239,old,10.0.0.6,x  \n"
                      "0,240,nomodel,10.0.0.7,x\n"
                      "x,240,nomodel,10.0.0.7,x\n"
                      "1,240,short,10.0.0.8\n"
                      "\n"
                      "\t3,255,other,10.0.0.9,x,y,z\r\n"
                      "1,240,host,10.0.0.5,again\n"
                      "1,240,liar,10.0.0.5;x,x\n"
                      "1,240,\x1B[2J,10.0.0.10,x");
    TELL(TAVOFHOSTGet2Hash(hosts));
    // Showing the names safely is the reader's affair.
    EXPECT_EQ(test::Pairs(hosts), (test::PairMap{{"host(10.0.0.5)", "10.0.0.5"},
                                                 {"other(10.0.0.9)", "10.0.0.9"},
                                                 {"\x1B[2J(10.0.0.10)", "10.0.0.10"}}));
    TELL(TAVOFHOSTGet2Hash(hosts));
}

TEST_F(Discovery, AHashThatMustGrowStaysTheCallers)
{
    test::Owned<TLIBSZHASH> hosts = test::HashOf({});
    std::string list;
    for (int i = 0; i < 2000; ++i)
        list += "1,240," + std::string(250, 'n') + std::to_string(i) + ",10.0." + std::to_string(i / 200) + "." +
                std::to_string(i % 200 + 1) + ",x\n";
    WriteFile(kTaken, list);
    EXPECT_EQ(TAVOFHOSTGet2Hash(hosts), 2000);
}

}  // namespace

extern "C" {

int bind(int, const sockaddr *address, socklen_t) noexcept
{
    bound = Text(address);
    if (bound != no_bind_to)
        return 0;
    errno = EADDRNOTAVAIL;
    return -1;
}

ssize_t sendto(int, const void *bytes, size_t size, int, const sockaddr *to, socklen_t)
{
    if (bound == no_send_from)
        return static_cast<ssize_t>(size) - 1;
    sent.push_back("send from " + bound + " to " + Text(to) + ": " +
                   std::string(static_cast<const char *>(bytes), size));
    return static_cast<ssize_t>(size);
}
}

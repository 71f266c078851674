// The discovery packets byte for byte, and the table that bounds what a network can fill.
#include "packet.h"

#include "tavo_fhost.h"

#include "answer_budget.h"
#include "host_table.h"
#include "support/test.h"

#include <arpa/inet.h>

using findhostd::Host;
using findhostd::HostTable;
using findhostd::PacketKind;
using namespace std::string_literals;

namespace {

Host MakeHost(const std::string &name, const char *address = "192.0.2.7")
{
    Host host{};
    host.model = 0x01020304;
    host.protocol = 240;
    host.address.s_addr = ::inet_addr(address);
    name.copy(host.name, findhostd::kLongestName);
    return host;
}

PacketKind Kind(const std::string &text, Host *host = nullptr)
{
    Host ignored{};
    return findhostd::ReadPacket(std::vector<uint8_t>(text.begin(), text.end()), host ? *host : ignored);
}

std::string Record(char type, const std::string &body)
{
    return std::string{type, static_cast<char>(body.size())} + body;
}

const std::string kHeader = "\x12\x34\x56\x78TAVO";
const std::string kReplyKind = Record(0x01, "\x02\0\0\0"s);
const std::string kModel = Record(0x10, "\x04\x03\x02\x01");
const std::string kProtocol = Record(0x11, "\xF0\0\0\0"s);
const std::string kName = Record(0x12, "nas");
const std::string kAddress = Record(0x13, "\xC0\0\x02\x07"s);
const std::string kWhole = kHeader + kReplyKind + kModel + kProtocol + kName + kAddress;

TEST(Packet, OursAreTheseBytes)
{
    std::array<uint8_t, findhostd::kLargestPacket> packet;
    const size_t size = findhostd::WriteReply(MakeHost("nas"), packet);
    EXPECT_EQ(std::string(packet.begin(), packet.begin() + size),
              "\x12\x34\x56\x78TAVO\x01\x04\x02\0\0\0\x10\x04\x04\x03\x02\x01\x11\x04\xF0\0\0\0\x12\x03nas"s +
                  "\x13\x04\xC0\0\x02\x07"s);
    EXPECT_EQ(std::string(packet.begin(), packet.begin() + size), kWhole);
}

TEST(Packet, EveryQueryOfTheLibraryIsOne)
{
    Host host{};
    EXPECT_EQ(findhostd::ReadPacket(stFHOSTBroadCast, host), PacketKind::query);
    EXPECT_EQ(findhostd::ReadPacket(stFHOSTBroadCastV11, host), PacketKind::query);
    EXPECT_EQ(findhostd::ReadPacket(stFHOSTBroadCastVDS20, host), PacketKind::query);
    EXPECT_EQ(Kind(kHeader), PacketKind::other) << "nothing is asked";
}

TEST(Packet, ARepliesRecordsComeInAnyOrder)
{
    Host host{};
    const std::string unknown = Record('\xA4', "\0\0\x02\x01"s) + Record(0x77, "");
    EXPECT_EQ(Kind(kHeader + kAddress + unknown + kName + kProtocol + kModel + kReplyKind, &host), PacketKind::reply);
    const Host expected = MakeHost("nas");
    EXPECT_EQ(std::memcmp(&host, &expected, sizeof host), 0);
}

TEST(Packet, RejectsIncompleteAndInvalidPackets)
{
    const auto with = [&](const std::string &part, const std::string &instead) {
        std::string text = kWhole;
        return text.replace(text.find(part), part.size(), instead);
    };
    const auto named = [&](const std::string &name) {
        return with(kName, Record(0x12, name));
    };
    const auto addressed = [&](const std::string &address) {
        return with(kAddress, Record(0x13, address));
    };
    ASSERT_EQ(Kind(kWhole), PacketKind::reply);
    const std::string long_record = Record(0x77, std::string(255, 'x'));
    const struct {
        const char *what;
        std::string bytes;
    } rows[] = {
        {"another tag", "\x12\x34\x56\x78OVAT" + kWhole.substr(8)},
        {"a record without a length", kWhole + "\x77"},
        {"a record longer than the packet", kWhole + "\x77\x05" + "abcd"},
        {"no model", with(kModel, "")},
        {"no protocol", with(kProtocol, "")},
        {"no name", with(kName, "")},
        {"model 0", with(kModel, Record(0x10, "\0\0\0\0"s))},
        {"protocol 239", with(kProtocol, Record(0x11, "\xEF\0\0\0"s))},
        {"a model of three bytes", with(kModel, Record(0x10, "\x01\0\0"s))},
        {"two names", kWhole + kName},
        {"an invalid kind", with(kReplyKind, Record(0x01, "\x03\0\0\0"s))},
        {"query and reply", kWhole + Record(0x01, "\x01\0\0\0"s)},
        {"an empty name", named("")},
        {"a comma", named("a,b")},
        {"a line feed", named("a\nb")},
        {"a NUL", named("a\0b"s)},
        {"an escape", named("\x1B[m")},
        {"a control of the second set", named("a\xC2\x9B")},
        {"a mark of direction", named("a\xE2\x80\xAE")},
        {"an isolate", named("a\xE2\x81\xA6")},
        {"the Arabic mark", named("a\xD8\x9C")},
        {"a line separator", named("a\xE2\x80\xA8")},
        {"Latin 1", named("a\xE4")},
        {"half a character", named("a\xE2\x80")},
        {"an overlong slash", named("a\xC0\xAF")},
        {"a surrogate", named("a\xED\xA0\x80")},
        {"beyond Unicode", named("a\xF4\x90\x80\x80")},
        {"another's address", named("nas(192.0.2.10)")},
        {"a blank at the end", named("a ")},
        {"64 bytes", named(std::string(64, 'a'))},
        {"loopback", addressed("\x7F\0\0\x01"s)},
        {"a multicast address", addressed("\xE0\0\0\x01"s)},
        {"no address at all", addressed("\0\0\0\0"s)},
        {"too large", kWhole + long_record + long_record},
    };
    for (const auto &row : rows)
        EXPECT_EQ(Kind(row.bytes), PacketKind::other) << row.what;
    for (size_t size = 0; size < kWhole.size(); ++size)
        EXPECT_EQ(Kind(kWhole.substr(0, size)), PacketKind::other) << size;
    for (const std::string &name : {std::string(63, 'a'), "\xC3\xA4"s, "\xE2\x82\xAC"s, "\xF0\x9F\x98\x80"s})
        EXPECT_EQ(Kind(named(name)), PacketKind::reply) << name;
}

std::string Flooder(int i)
{
    return "10.0." + std::to_string(i / 250) + "." + std::to_string(i % 250 + 1);
}

TEST(HostTable, KeepsTheFirstAnswerOfACollection)
{
    HostTable table;
    int64_t now = 1000000;
    table.NoteQuery(now);
    EXPECT_TRUE(table.Put(MakeHost("one", "192.0.2.1"), 0, now));
    EXPECT_FALSE(table.Put(MakeHost("one", "192.0.2.1"), 0, now)) << "as it is there";
    EXPECT_FALSE(table.Put(MakeHost("forged", "192.0.2.1"), 0, now + 1));
    EXPECT_FALSE(table.Put(MakeHost("one", "192.0.2.1"), 3, now + 1)) << "over another interface";
    table.NoteQuery(now += 5000);  // every host may ask again
    EXPECT_FALSE(table.Put(MakeHost("forged", "192.0.2.1"), 0, now));
    EXPECT_EQ(table.Text(now), "16909060,240,one,192.0.2.1,\n");
    table.NoteQuery(now += 5000);
    EXPECT_TRUE(table.Put(MakeHost("renamed", "192.0.2.1"), 0, now));
    EXPECT_EQ(table.Text(now), "16909060,240,renamed,192.0.2.1,\n");
}

TEST(HostTable, ForgetsByAge)
{
    HostTable table;
    table.NoteQuery(1000);
    EXPECT_TRUE(table.Put(MakeHost("one", "192.0.2.1"), 0, 1000));
    EXPECT_TRUE(table.Put(MakeHost("two", "192.0.2.2"), 0, 1000));
    EXPECT_FALSE(table.Put(MakeHost("two", "192.0.2.2"), 0, 9000));
    EXPECT_THAT(table.Text(1000 + HostTable::kKept), testing::HasSubstr("one"));
    EXPECT_EQ(table.Text(1001 + HostTable::kKept), "16909060,240,two,192.0.2.2,\n");
    EXPECT_TRUE(table.Put(MakeHost("one", "192.0.2.1"), 0, 1001 + HostTable::kKept)) << "back again";
}

TEST(HostTable, HasRoomForSoMany)
{
    HostTable table;
    table.NoteQuery(1000);
    EXPECT_TRUE(table.Put(MakeHost("one", "192.0.2.1"), 0, 1000));
    for (int i = 0; i < 3000; ++i)
        table.Put(MakeHost("flood", Flooder(i).c_str()), 0, 1000);
    EXPECT_EQ(table.Size(), HostTable::kMost);
    EXPECT_THAT(table.Text(1000), testing::StartsWith("16909060,240,one,192.0.2.1,\n")) << "who came first stays";
    EXPECT_FALSE(table.Put(MakeHost("late", "192.0.2.99"), 0, 1000));
    EXPECT_TRUE(table.Put(MakeHost("late", "192.0.2.99"), 0, 1001 + HostTable::kKept));
}

in_addr At(const std::string &address)
{
    in_addr found;
    found.s_addr = ::inet_addr(address.c_str());
    return found;
}

// The most moments of the list that any second has.
size_t MostInASecond(const std::vector<int64_t> &moments)
{
    size_t most = 0;
    for (size_t first = 0, last = 0; last < moments.size(); ++last) {
        while (moments[last] - moments[first] >= 1000)
            ++first;
        most = std::max(most, last - first + 1);
    }
    return most;
}

// A flood that asks thousands of times a second, from so many addresses, and a host that asks now and then.
struct Flood {
    findhostd::AnswerBudget budget;
    std::vector<int64_t> all;
    std::map<int, std::vector<int64_t>> each;

    // How many of the host's queries are answered; one every `every` milliseconds.
    int Run(int addresses, int64_t from, int64_t to, int64_t every)
    {
        int answered = 0;
        for (int64_t now = from; now < to; ++now) {
            for (int i = 0; i < 5; ++i) {
                const int who = std::rand() % addresses;
                if (budget.Take(At(Flooder(who)), now)) {
                    all.push_back(now);
                    each[who].push_back(now);
                }
            }
            if ((now - from) % every == every / 2 && budget.Take(At("192.0.2.77"), now)) {
                all.push_back(now);
                ++answered;
            }
        }
        return answered;
    }
};

TEST(AnswerBudget, OneFlooderTakesNothingFromTheOthers)
{
    Flood flood;
    EXPECT_EQ(flood.Run(1, 1, 20001, 1000), 20);
    EXPECT_LE(MostInASecond(flood.all), 50u);
    EXPECT_EQ(MostInASecond(flood.each[0]), 2u);
}

TEST(AnswerBudget, AWholeNetworkOfFloodersLeavesTheOthersTheirTurn)
{
    for (const unsigned seed : {1u, 2u, 3u, 4u, 5u}) {
        std::srand(seed);
        Flood flood;
        EXPECT_GE(flood.Run(250, 1, 10001, 1000), 1) << "seed " << seed;
        int64_t now = 10001;
        for (int round = 0; round < 5; ++round, now += 12000)
            EXPECT_GE(flood.Run(250, now, now + 12000, 1000), 1) << "seed " << seed << ", round " << round;
        EXPECT_LE(MostInASecond(flood.all), 50u);
        for (const auto &[who, moments] : flood.each)
            EXPECT_LE(MostInASecond(moments), 2u);
    }
}

}  // namespace

// The discovery packets byte for byte, and the table that bounds what a network can fill.
#include "host_table.h"
#include "packet.h"

#include "tavo_fhost.h"

#include <gmock/gmock.h>

#include <cstring>

#include <arpa/inet.h>

using findhostd::Host;
using findhostd::HostTable;
using findhostd::PacketKind;

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

std::vector<uint8_t> Bytes(const std::string &text)
{
    return {text.begin(), text.end()};
}

PacketKind Kind(const std::string &text, Host *host = nullptr)
{
    Host ignored{};
    const auto bytes = Bytes(text);
    return findhostd::ReadPacket(bytes, host ? *host : ignored);
}

const std::string kHeader = "\x12\x34\x56\x78TAVO";
const std::string kReplyKind("\x01\x04\x02\x00\x00\x00", 6);
const std::string kModel("\x10\x04\x04\x03\x02\x01", 6);
const std::string kProtocol("\x11\x04\xF0\x00\x00\x00", 6);
const std::string kName("\x12\x03nas", 5);
const std::string kAddress("\x13\x04\xC0\x00\x02\x07", 6);

TEST(Packet, OursAreTheseBytes)
{
    std::array<uint8_t, findhostd::kLargestPacket> packet;
    const size_t size = findhostd::WriteReply(MakeHost("nas"), packet);
    EXPECT_EQ(std::string(packet.begin(), packet.begin() + size),
              kHeader + kReplyKind + kModel + kProtocol + kName + kAddress);
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
    const std::string unknown("\xA4\x04\x00\x00\x02\x01\x77\x00", 8);
    EXPECT_EQ(Kind(kHeader + kAddress + unknown + kName + kProtocol + kModel + kReplyKind, &host), PacketKind::reply);
    const Host expected = MakeHost("nas");
    EXPECT_EQ(std::memcmp(&host, &expected, sizeof host), 0);
}

TEST(Packet, WhatIsNotWholeOrNotSoundIsNothing)
{
    const std::string whole = kHeader + kReplyKind + kModel + kProtocol + kName + kAddress;
    const auto with = [&](const std::string &part, const std::string &instead) {
        std::string text = whole;
        return text.replace(text.find(part), part.size(), instead);
    };
    ASSERT_EQ(Kind(whole), PacketKind::reply);
    const struct {
        const char *what;
        std::string bytes;
    } rows[] = {
        {"empty", ""},
        {"half a header", kHeader.substr(0, 7)},
        {"another tag", "\x12\x34\x56\x78OVAT" + whole.substr(8)},
        {"a record without a length", whole + "\x77"},
        {"a record longer than the packet", whole + std::string("\x77\x05"
                                                                "abcd")},
        {"no model", with(kModel, "")},
        {"no protocol", with(kProtocol, "")},
        {"no name", with(kName, "")},
        {"no address", with(kAddress, "")},
        {"model 0", with(kModel, std::string("\x10\x04\0\0\0\0", 6))},
        {"protocol 239", with(kProtocol, std::string("\x11\x04\xEF\0\0\0", 6))},
        {"a model of three bytes", with(kModel, std::string("\x10\x03\x01\0\0", 5))},
        {"two names", whole + kName},
        {"a kind that is none", with(kReplyKind, std::string("\x01\x04\x03\0\0\0", 6))},
        {"query and reply", whole + std::string("\x01\x04\x01\0\0\0", 6)},
        {"an empty name", with(kName, std::string("\x12\0", 2))},
        {"a comma", with(kName, std::string("\x12\x03"
                                            "a,b",
                                            5))},
        {"a line feed", with(kName, std::string("\x12\x03"
                                                "a\nb",
                                                5))},
        {"a NUL", with(kName, std::string("\x12\x03"
                                          "a\0b",
                                          5))},
        {"an escape", with(kName, std::string("\x12\x03\x1B[m", 5))},
        {"a blank at the end", with(kName, std::string("\x12\x02"
                                                       "a ",
                                                       4))},
        {"64 bytes", with(kName, std::string("\x12\x40", 2) + std::string(64, 'a'))},
        {"loopback", with(kAddress, std::string("\x13\x04\x7F\0\0\x01", 6))},
        {"a multicast address", with(kAddress, std::string("\x13\x04\xE0\0\0\x01", 6))},
        {"no address at all", with(kAddress, std::string("\x13\x04\0\0\0\0", 6))},
        {"too large", whole + std::string("\x77\xFF", 2) + std::string(255, 'x') + std::string("\x77\xFF", 2) +
                          std::string(255, 'x')},
    };
    for (const auto &row : rows)
        EXPECT_EQ(Kind(row.bytes), PacketKind::other) << row.what;
    for (size_t size = 0; size < whole.size(); ++size)
        EXPECT_EQ(Kind(whole.substr(0, size)), PacketKind::other) << size;
    EXPECT_EQ(Kind(with(kName, "\x12\x3F" + std::string(63, 'a'))), PacketKind::reply);
    EXPECT_EQ(Kind(with(kName, std::string("\x12\x02\xC3\xA4", 4))), PacketKind::reply) << "UTF-8";
}

TEST(HostTable, HasRoomForSoMany)
{
    HostTable table;
    EXPECT_TRUE(table.Put(MakeHost("one", "192.0.2.1"), 0));
    EXPECT_FALSE(table.Put(MakeHost("one", "192.0.2.1"), 0)) << "as it is there";
    EXPECT_TRUE(table.Put(MakeHost("other", "192.0.2.1"), 0)) << "it has another name now";
    EXPECT_EQ(table.Text(), "16909060,240,other,192.0.2.1,\n");
    for (int i = 0; i < 1000; ++i)
        table.Put(MakeHost("flood", ("10.0." + std::to_string(i / 250) + "." + std::to_string(i % 250 + 1)).c_str()),
                  0);
    EXPECT_EQ(table.Size(), HostTable::kMost);
    EXPECT_THAT(table.Text(), testing::StartsWith("16909060,240,other,192.0.2.1,\n")) << "who came first stays";
    EXPECT_FALSE(table.Put(MakeHost("late", "192.0.2.99"), 0));
    EXPECT_TRUE(table.Put(MakeHost("renamed", "192.0.2.1"), 0)) << "also in a full table";
    table.Clear();
    EXPECT_EQ(table.Text(), "");
}

}  // namespace

// Validators and conversions: tables of what is accepted and refused.
#include "tavo_net.h"

#include "support/test.h"

namespace {

using Validator = int (*)(const char *);

int IsIpMask(const char *text)
{
    char copy[64] = "";
    return BlTLIBIsIpMask(text ? std::strncpy(copy, text, sizeof copy - 1) : nullptr);
}

struct Table {
    const char *name;
    Validator valid;
    std::vector<std::string> accepted;
    std::vector<std::string> refused;
};

std::vector<Table> Tables()
{
    const std::string x63(63, 'x');
    const std::string d255 = x63 + "." + x63 + "." + x63 + "." + x63;
    return {
        {"IsIpAddr",
         BlTLIBIsIpAddr,
         {"1.0.0.0", "10.0.255.1", "223.255.255.254", "192.168.001.010"},
         {"", "127.0.0.1", "0.1.2.3", "224.0.0.1", "10.0.0.255", "10.256.0.1", "10.0.0", "10.0.0.0.1", "10.0.0.1;x",
          " 10.0.0.1", "10.0.0.1 ", "+10.0.0.1", "10.0.0.-1", "10..0.1", "10.0.0.1\n", "0010.0.0.1", "4294967306.0.0.1",
          "a.b.c.d", "10,0,0,1"}},
        {"IsIpMask",
         IsIpMask,
         {"255.255.255.0", "255.255.254.0", "255.255.255.255", "128.0.0.0", "0.0.0.0", "255.255.000.0"},
         {"", "255.0.255.0", "255.255.255.1", "0.255.255.255", "255.255.255", "256.0.0.0", "255.255.255.0x"}},
        {"IsHostname",
         BlTLIBIsHostname,
         {"n", "_nas", "NAS-1_b", "abcdefghijklmno"},
         {"", "1nas", "-nas", "abcdefghijklmnop", "na.s", "na s", "n\xC3\xA4s", "nas;reboot"}},
        {"IsDomain",
         BlTLIBIsDomain,
         {"a", "example.com", "a-b.c--d.e", "1.2", x63 + ".x", d255},
         {"", ".", "a.", ".a", "a..b", "-a.b", "a-.b", "a_b", "a b", x63 + "x", d255 + "x", "b\xC3\xBC.de"}},
        {"IsAtom",
         BlTLIBIsAtom,
         {"a", "!#$%&'*+-/=?^_`{|}~", "09"},
         {"", "a.b", "a b", "a@b", "(", ")", "<", ">", "[", "]", ",", ";", ":", "\\", "\"", "\x7F", "\xC3\xA4", "\t"}},
        {"IsMailbox",
         BlTLIBIsMailbox,
         {"a@b", "first.last@example.com", "a+b=c@x-y.z"},
         {"", "@", "a@", "@b", "a@@b", ".a@b", "a.@b", "a..b@c", "a@b@c", "a b@c", "a@b.", "a\n@b", "\"a\"@b"}},
        {"IsWorkGroupName",
         BlTLIBIsWorkGroupName,
         {"WORKGROUP", "a", "my group", "!@#$%^&()-_'{}", "x.y~"},
         {"", "0123456789012345", ".x", " x", "x ", "a/b", "a\\b", "a:b", "a*", "a?", "\"", "<a>", "a|b", "a\n",
          "\xC3\xA4"}},
        {"IsSubNet",
         BlTLIBIsSubNet,
         {"10.0.0.0/255.0.0.0", "192.168.1.7/255.255.255.128"},
         {"", "10.0.0.0", "10.0.0.0/", "/255.0.0.0", "10.0.0.0/8", "10.0.0.0/255.0.255.0", "10.0.0.0/255.0.0.0/1"}},
        {"Isv6IpAddrValid",
         BlTLIBIsv6IpAddrValid,
         {"::", "::1", "fe80::1", "2001:db8::192.0.2.1", "1:2:3:4:5:6:7:8"},
         {"", ":", "1:2:3:4:5:6:7", "fe80::1%eth0", "::1/64", "::g", "1::2::3", "10.0.0.1", " ::1"}},
    };
}

TEST(Validators, AcceptAndRefuse)
{
    for (const Table &table : Tables()) {
        for (const std::string &text : table.accepted) {
            test::ForgetFault();
            EXPECT_EQ(table.valid(text.c_str()), 1) << table.name << " \"" << text << '"';
            EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << table.name;
        }
        for (const std::string &text : table.refused) {
            test::ForgetFault();
            EXPECT_EQ(table.valid(text.c_str()), 0) << table.name << " \"" << text << '"';
            EXPECT_EQ(TLIBErrGet(), ERR_INVALID_NETNAME) << table.name << " \"" << text << '"';
        }
        test::ForgetFault();
        EXPECT_EQ(table.valid(nullptr), 0) << table.name;
        EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS) << table.name;
    }
}

TEST(Conversions, SubnetsAndMasks)
{
    const struct {
        int (*convert)(char *, char *);
        std::vector<std::pair<const char *, const char *>> taken;
        std::vector<const char *> refused;
    } tables[] = {
        {ErrTLIBIpMaskToSubnet,
         {{"192.168.1.7/255.255.255.0", "192.168.1.0/24"}, {"10.1.2.3/255.255.255.255", "10.1.2.3/32"}},
         {"192.168.1.255/255.255.255.0", "10.0.255.1/255.0.0.0", "10.0.0.1/255.0.255.0", "10.0.0.1", "10.0.0.1/"}},
        {ErrTLIBSubnetToIpMask,
         {{"10.1.2.3/8", "10.0.0.0/255.0.0.0"},
          {"10.1.2.3/010", "10.0.0.0/255.0.0.0"},
          {"10.1.2.3/0x18", "10.1.2.0/255.255.255.0"},
          {"10.1.2.3/32", "10.1.2.3/255.255.255.255"}},
         {"10.1.2.3/0", "10.1.2.3/33", "10.1.2.3/8x", "10.1.2.3/", "10.1.2.3/99999999999999999999", "10.1.2/8",
          "10.1.2.3"}}};
    for (const auto &table : tables) {
        const auto check = [&](const char *text, const char *result, int code) {
            char in[64] = "";
            std::strcpy(in, text);
            char out[64] = "untouched";
            test::ForgetFault();
            EXPECT_EQ(table.convert(in, out), code ? -1 : 0) << text;
            EXPECT_STREQ(out, code ? "untouched" : result) << text;
            EXPECT_STREQ(in, text);
            EXPECT_EQ(TLIBErrGet(), code) << text;
            EXPECT_EQ(table.convert(in, nullptr), code ? -1 : 0);
            EXPECT_STREQ(in, code ? text : result) << "over the input";
        };
        for (const auto &[in, out] : table.taken)
            check(in, out, 0);
        for (const char *in : table.refused)
            check(in, "", std::strchr(in, '/') ? ERR_INVALID_NETNAME : ERR_BAD_PARAMETERS);
        EXPECT_EQ(table.convert(nullptr, nullptr), -1);
    }
}

}  // namespace

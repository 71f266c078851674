// The two tables of the services: their rows, and where each keeps its data.
#include "service/detail/service_table.h"

#include <algorithm>
#include <string_view>

#define RC_D "/usr/tavo/etc/rc.d/"

namespace tavo {

// clang-format off
constexpr TAVOSERVICE service_table[kServices + 1] = {
    //     name            script                     enable key          pid file or process           action                status                    daemons   shares
    /*  0 */ {"web",          RC_D "S97apache-user.sh",  "runweb",           "/var/run/httpd-user.pid",    TAVOServiceSTDAction, TAVOServiceSTDStatus,     0x40,     {1, 12}},
    /*  1 */ {"photo",        nullptr,                   "runphoto",         nullptr,                      TAVOServiceSTDAction, TAVOServiceSTDStatus,     0,        {2, 12}},
    /*  2 */ {"netbkp",       nullptr,                   "runnetbkp",        "/var/run/rsyncd.pid",        TAVOServiceNetBkp,    TAVOServiceSTDStatus,     0x100,    {3, 12}},
    /*  3 */ {"download",     RC_D "S25download.sh",     "download_enabled", "/var/run/scheduler.pid",     TAVOServiceSTDAction, TAVOServiceSTDStatus,     0x200,    {4, 12}},
    /*  4 */ {"media",        RC_D "S86tavodms.sh",      "runmediaservice",  "/var/run/dms.pid",           TAVOServiceSTDAction, TAVOServiceSTDStatus,     0x2,      {6, 5, 2, 12}},
    /*  5 */ {"audio",        nullptr,                   "runaudiodeck",     "/var/run/tavoaudiod.pid",    TAVOServiceAudio,     TAVOServiceSTDStatus,     0x240000, {6, 12}},
    /*  6 */ {"itunes",       RC_D "S99iTunes.sh",       "runitunes",        "/var/run/mt-daapd.pid",      TAVOServiceiTunes,    TAVOServiceiTunesStatus,  0x800,    {6, 12}},
    /*  7 */ {"mysql",        RC_D "S21mysql.sh",        "runmysql",         "/tmp/mysqld.pid",            TAVOServiceSTDAction, TAVOServiceSTDStatus,     0,        {7, 12}},
    /*  8 */ {"pgsql",        RC_D "S20pgsql.sh",        "runpgsql",         "/tmp/postgresql.pid",        TAVOServiceSTDAction, TAVOServiceSTDStatus,     0,        {11, 12}},
    /*  9 */ {"printer",      nullptr,                   nullptr,            nullptr,                      nullptr,              TAVOServicePrinterStatus, 0x400,    {8, 12}},
    /* 10 */ {"surveillance", RC_D "S82surveillance.sh", "runsurveillance",  nullptr,                      TAVOServiceSTDAction, TAVOServiceSTDStatus,     0x2000,   {9, 12}},
    /* 11 */ {"userhome",     nullptr,                   "userHomeEnable",   nullptr,                      TAVOServiceUserHome,  TAVOServiceSTDStatus,     0,        {10, 12}},
    /* 12 */ {"ftp",          RC_D "S99ftpd.sh",         "runftpd",          "ftpd",                       TAVOServiceSTDAction, TAVOServiceFTPStatus,     0x10,     {12}},
    /* 13 */ {"telnet",       RC_D "S03inetd.sh",        "runtelnet",        nullptr,                      TAVOServiceTelnet,    TAVOServiceTelnetStatus,  0,        {12}},
    /* 14 */ {"ssh",          RC_D "S95sshd.sh",         "runssh",           "/var/run/sshd.pid",          TAVOServiceSSH,       TAVOServiceSSHStatus,     0,        {12}},
    /* 15 */ {"nfs",          RC_D "S83nfsd.sh",         "runnfs",           "nfsd",                       TAVOServiceSTDAction, TAVOServiceSTDStatus,     0x8000,   {12}},
    /* 16 */ {"afp",          RC_D "S81atalk.sh",        "runafp",           "/var/run/afpd.pid",          TAVOServiceAFP,       TAVOServiceAFPStatus,     0x1,      {12}},
    /* 17 */ {"samba",        RC_D "S80samba.sh",        "runsamba",         "/var/run/smbd.pid",          TAVOServiceSAMBA,     TAVOServiceSTDStatus,     0,        {12}},
    /* 18 */ {"filedeck",     nullptr,                   "runfiledeck",      nullptr,                      TAVOServiceSTDAction, TAVOServiceSTDStatus,     0,        {12}},
    /* 19 */ {"https",        nullptr,                   "runHTTPS",         nullptr,                      TAVOServiceHTTPS,     TAVOServiceSTDStatus,     0,        {12}},
    /* 20 */ {"iscsitrg",     nullptr,                   nullptr,            "/var/run/iscsi_trgt.pid",    nullptr,              TAVOServiceSTDStatus,     0x100000, {12}},
    /* 21 */ {"crond",        nullptr,                   nullptr,            "crond",                      nullptr,              TAVOServiceSTDStatus,     0x8,      {12}},
    /* 22 */ {"DB",           nullptr,                   nullptr,            nullptr,                      nullptr,              TAVOServiceSTDStatus,     0x20,     {12}},
    /* 23 */ {"mkthumb",      nullptr,                   nullptr,            "/var/run/mkthumbd.pid",      nullptr,              TAVOServiceSTDStatus,     0x80,     {12}},
    /* 24 */ {"index",        nullptr,                   nullptr,            "/var/run/tavoindexd.pid",    nullptr,              TAVOServiceSTDStatus,     0x1000,   {12}},
    /* 25 */ {"mkflv",        nullptr,                   nullptr,            "/var/run/tavomkflvd.pid",    nullptr,              TAVOServiceSTDStatus,     0x4000,   {12}},
    /* 26 */ {"restore",      nullptr,                   nullptr,            nullptr,                      nullptr,              TAVOServiceSTDStatus,     0x10000,  {12}},
    /* 27 */ {"mdns",         nullptr,                   nullptr,            "/var/run/mDNSResponder.pid", nullptr,              TAVOServiceSTDStatus,     0x20000,  {12}},
    /* 28 */ {"tavorcd",      nullptr,                   nullptr,            "/var/run/tavorcd.pid",       nullptr,              TAVOServiceSTDStatus,     0x40000,  {12}},
    /* 29 */ {"tavologd",     nullptr,                   nullptr,            "/var/run/tavologd.pid",      nullptr,              TAVOServiceSTDStatus,     0x80000,  {12}},
    /* 30 */ {nullptr,        nullptr,                   nullptr,            nullptr,                      nullptr,              nullptr,                  0,        {12}},
};

constexpr ServiceShareRow service_share_table[kServiceShares] = {
    // id     stem            link                          enable key                      supported, naming, a, b        capability keys
    {{ 0, 0, "",             "",                           "",                 "", "", "", 0, 0, 0,  0, 0, 0}, {}},
    {{ 1, 0, "web",          "/var/services/web",          "runweb",           "", "", "", 0, 1, 1,  1, 0, 0}, {"supportweb"}},
    {{ 2, 0, "photo",        "/var/services/photo",        "runphoto",         "", "", "", 0, 1, 1,  1, 0, 0}, {"supportphoto", "supportmediaservice"}},
    {{ 3, 0, "NetBackup",    "/var/services/NetBackup",    "runnetbkp",        "", "", "", 0, 1, 1,  1, 0, 0}, {"netbkp"}},
    {{ 4, 0, "download",     "/var/services/download",     "download_enabled", "", "", "", 0, 0, 1, 13, 0, 0}, {"support_download"}},
    {{ 5, 0, "video",        "/var/services/video",        "runmediaservice",  "", "", "", 0, 1, 1,  1, 0, 0}, {"supportmediaservice"}},
    {{ 6, 0, "music",        "/var/services/music",        "runmediaservice",  "", "", "", 0, 1, 1,  1, 0, 0}, {"supportmediaservice", "support_audio", "supportitunes"}},
    {{ 7, 0, "mysql",        "/var/services/mysql",        "runmysql",         "", "", "", 0, 2, 1,  1, 0, 0}, {"supportmysql"}},
    {{ 8, 0, "spool",        "/var/services/printer",      "",                 "", "", "", 1, 0, 0,  1, 0, 0}, {}},
    {{ 9, 0, "surveillance", "/var/services/surveillance", "runsurveillance",  "", "", "", 0, 1, 1,  1, 0, 0}, {"supportsurveillance"}},
    {{10, 0, "homes",        "/var/services/homes",        "userHomeEnable",   "", "", "", 1, 1, 0,  1, 0, 0}, {}},
    {{11, 0, "pgsql",        "/var/services/pgsql",        "runpgsql",         "", "", "", 1, 2, 1,  1, 0, 0}, {}},
};
// clang-format on

namespace {

constexpr bool NamesAreUnique()
{
    for (int i = 0; i < kServices; ++i) {
        for (int j = 0; j < i; ++j) {
            if (std::string_view(service_table[i].szName) == service_table[j].szName)
                return false;
        }
    }
    return true;
}

constexpr bool ShareIdsAreRows()
{
    for (const TAVOSERVICE &service : service_table) {
        int at = 0;
        while (service.rgShareId[at] != TAVO_SERVICE_SHARE_END) {
            if (service.rgShareId[at] < 1 || service.rgShareId[at] >= kServiceShares || ++at == 4)
                return false;
        }
    }
    return true;
}

constexpr bool SharesStandAtTheirIds()
{
    for (int i = 0; i < kServiceShares; ++i) {
        if (service_share_table[i].share.nId != i)
            return false;
    }
    return true;
}

// The bits of daemons that no service may claim: the dispatcher has no command for them.
constexpr uint32_t kUnknownDaemons = ~(0x7FFFFFu | TAVO_DAEMON_WEB_SYSTEM);

constexpr bool MasksAreKnown()
{
    for (const TAVOSERVICE &service : service_table) {
        if (service.fDaemon & kUnknownDaemons)
            return false;
    }
    return true;
}

static_assert(NamesAreUnique());
static_assert(ShareIdsAreRows());
static_assert(SharesStandAtTheirIds());
static_assert(MasksAreKnown());

}  // namespace

const TAVOSERVICE *FindService(int id) noexcept
{
    return id < 0 || id > kServices ? nullptr : &service_table[id];
}

const ServiceShareRow *FindServiceShare(int id) noexcept
{
    return id < 1 || id >= kServiceShares ? nullptr : &service_share_table[id];
}

std::span<const int32_t> SharesOf(const TAVOSERVICE &service) noexcept
{
    size_t count = 0;
    while (service.rgShareId[count] != TAVO_SERVICE_SHARE_END)
        ++count;
    return {service.rgShareId, count};
}

bool UsesShare(const TAVOSERVICE &service, int share) noexcept
{
    const auto shares = SharesOf(service);
    return std::find(shares.begin(), shares.end(), share) != shares.end();
}

}  // namespace tavo

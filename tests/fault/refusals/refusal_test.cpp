// What a caller gets wrong: each argument in turn is the null pointer or one of its bad values while the others are good.
// The call is refused with its code under its own name, before it looks at the appliance.
#include "tavosdk.h"

#include "support/test.h"

#include <concepts>
#include <tuple>
#include <type_traits>

namespace {

struct MayBeNull {};

// A good value, and bad ones.
template <typename T>
struct Argument {
    Argument(T value, std::convertible_to<T> auto... others) : Argument(MayBeNull(), value, others...)
    {
        if constexpr (std::is_pointer_v<T>)
            bad.push_back(nullptr);
    }
    Argument(MayBeNull, T value, std::convertible_to<T> auto... others) : good(value), bad{static_cast<T>(others)...} {}

    T good;
    std::vector<T> bad;
};

// What a function reports: a code under its module, or under "module:line" where the line is published, a text in the log,
// or both.
struct Refusal {
    Refusal(const char *place, const char *log = "") : Refusal(place, ERR_BAD_PARAMETERS, log) {}
    Refusal(const char *place, int code, const char *log)
    {
        const std::string_view text = place;
        const size_t colon = std::min(text.find(':'), text.size());
        module = text.substr(0, colon);
        if (code != 0)
            fault = {code, module, colon < text.size() ? std::atoi(place + colon + 1) : 0};
        if (*log)
            line = module + log;
    }

    std::string module, line;
    test::Fault fault;
};

constexpr const char *kBad = ":# Bad parameters";

char text[64] = "";
unsigned char bytes[512] = {};
int number = 0;
int32_t number32 = 0;
uint64_t number64 = 0;
TLIBSZLIST *no_list = nullptr;
TLIBSZHASH *no_hash = nullptr;

class Refusals : public testing::Test {
  protected:
    ~Refusals() override
    {
        EXPECT_EQ(list_->nItem + hash_->nPair, 0) << "a refused call changes nothing";
        TLIBSzListFree(list_);
        TLIBSzHashFree(hash_);
    }

    template <typename Result, typename... Types>
    void Refuses(const Refusal &refusal, Result (*function)(Types...),
                 std::type_identity_t<Argument<Types>>... arguments)
    {
        const auto spoil = [&]<size_t at>(std::integral_constant<size_t, at>, const auto &argument) {
            for (size_t i = 0; i < argument.bad.size(); ++i) {
                std::tuple<Types...> values(arguments.good...);
                std::get<at>(values) = argument.bad[i];
                test::ForgetFault();
                log_.Clear();
                const Result result = std::apply(function, values);
                EXPECT_EQ(test::LastFault(), refusal.fault) << refusal.module << ", argument " << at << ", value " << i;
                EXPECT_EQ(log_.Take(), refusal.line);
                if constexpr (std::is_pointer_v<Result>)
                    EXPECT_EQ(result, nullptr) << refusal.module;
                else
                    EXPECT_TRUE(result == 0 || result == static_cast<Result>(-1))
                        << refusal.module << " returns " << result;
            }
        };
        [&]<size_t... at>(std::index_sequence<at...>)
        {
            (spoil(std::integral_constant<size_t, at>(), arguments), ...);
        }
        (std::index_sequence_for<Types...>());
    }

    TLIBSZLIST *list_ = PslTLIBSzListAlloc(64);
    TLIBSZHASH *hash_ = PshTLIBSzHashAlloc(64);
    test::CapturedLog log_;
};

TEST_F(Refusals, Core)
{
    Refuses("error_log_set:33", TLIBErrLogSet, "/none/log", "x");
    Refuses("file_add_line", TLIBFileAddLine, "/none", {0, -1}, "x");
    Refuses("file_add_line_by_key", TLIBFileAddLineByKey, "/none", "key", "x");
    Refuses("file_append_key", TLIBFileAppendKey, "/none", "key", "x", {MayBeNull(), nullptr, "%d"});
    Refuses("file_check_key_value", BlTAVOFileCheckKeyValue, "/none", "key", "x");
    Refuses("file_comment", TLIBFileComment, "/none", "key");
    Refuses("file_get_keys", TLIBFileGetKeys, "/none", {MayBeNull(), list_}, {&hash_, &no_hash}, "=");
    Refuses("file_get_key_value:52", TLIBFileGetKeyValue, "/none", "key", {MayBeNull(), text}, 16, {0, -1});
    Refuses("file_get_line", TLIBFileGetLine, "/none", {1, 0}, text, 64);
    Refuses("file_get_line_by_key", TLIBFileGetLineByKey, "/none", "key", {MayBeNull(), text}, 64);
    Refuses("file_get_section:54", TLIBFileGetSection, "/none", "part", {&hash_, &no_hash});
    Refuses("file_enum_section", TLIBFileEnumSection, "/none", {&list_, &no_list});
    Refuses("file_match_line_no", TLIBFileMatchLineNo, "/none", "key");
    Refuses("file_match_section:33", TLIBIFileMatchSection, "[part]", 6, "part");
    Refuses("file_modify_section", TLIBIFileModifySection, "/none", "part", {MayBeNull(), nullptr},
            {MayBeNull(), hash_}, 0, {MayBeNull(), nullptr});
    Refuses("file_add_section", ErrTLIBFileAddSection, "/none", "part", hash_, {MayBeNull(), nullptr});
    Refuses("file_read_lines", TLIBFileReadLines, "/none", {&list_, &no_list});
    Refuses("file_remove_key", TLIBFileRemoveKey, "/none", "key");
    Refuses("file_replace_sub_str", TLIBFileReplaceSubStr, "/none", {"old", "", "o\nld"}, {"new", "n\new"});
    Refuses("file_set_key_value", TLIBFileSetKeyValue, "/none", "key", "x", {MayBeNull(), nullptr, "%d"});
    Refuses("file_set_keys", TLIBFileSetKeys, "/none", hash_, {MayBeNull(), nullptr});
    Refuses("file_set_line", TLIBFileSetLine, "/none", {1, 0, -1}, "x");
    Refuses("file_set_line_by_key", TLIBFileSetLineByKey, "/none", "key", "x");
    Refuses("file_line_key_match", TLIBILineKeyMatch, "key=x", "key");
    Refuses("proc_pid_file_create", TAVOProcPidFileCreate, "/none");
    Refuses("info_set_key_value", TAVOINFOSetKeyValue, "key", "x");
    Refuses("file_is_section", TLIBIFileIsSection, "[part]", 6);
    Refuses("file_touch", TLIBFileTouch, "/none/file");
    Refuses("file_utf8bom_strip", TLIBFileUTF8BomStrip, "/none");
    Refuses("proc_signal_by_pid_file", TLIBProcAliveByPidFile, "/none");
    Refuses("proc_signal_by_pid_file", TLIBProcSignalByPidFile, "/none", {0, -1});
    Refuses("ps", TLIBPs, "none", {MayBeNull(), nullptr}, {0, 1});
    Refuses("read_pid_file", TLIBReadPidFile, "/none");
    Refuses("sys_remove", TLIBSysRemove, "/none");
    Refuses("str_decode_colon", TLIBStrDecodeColon, "a", {MayBeNull(), text}, {64, -1});
    Refuses("str_encode_colon", TLIBStrEncodeColon, "a", text, {64, -1});
    Refuses("str_trim_space", TLIBStrTrimSpace, text, {MayBeNull(), text});
    Refuses("unicode_utf8_str_upper", TLIBUnicodeUTF8StrUpper, "a", text, {64, -1});
    Refuses("unicode_utf8_str_count_char", TLIBUnicodeUTF8StrCountChar, {"a", "\xff"});
    Refuses("list_and:59", PslTLIBSzListAnd, list_, list_, 0);
    Refuses("list_case_find:46", TLIBSzListCaseFind, list_, "a");
    Refuses({"list_dump_2_str:36", ":# Parameter error"}, TLIBSzListDump2Str, list_, ",", text, {64, 0});
    Refuses("list_expand", PslTLIBISzListExpand, list_);
    Refuses("list_find:37", TLIBSzListFind, list_, "a");
    Refuses("list_find", TLIBISzListFind, list_, 0, 0, "a", 0);
    Refuses("list_get:30", SzTLIBSzListGet, list_, {1, -1, 0});
    Refuses("list_insert:45", TLIBSzListInsert, {&list_, &no_list}, {0, -1}, "x");
    Refuses("list_insert:131", TLIBSzListPush, {&list_, &no_list}, "x");
    Refuses("list_insert:167", TLIBSzListUnshift, {&list_, &no_list}, "x");
    Refuses("list_or:61", PslTLIBSzListOr, {&list_, &no_list}, list_, 0);
    Refuses("list_remove:40", SzTLIBSzListRemove, list_, {1, -1, 0});
    Refuses("list_remove:78", SzTLIBSzListShift, list_);
    Refuses("list_remove:110", SzTLIBSzListPop, list_);
    Refuses("list_set", TLIBSzListSet, {&list_, &no_list}, {1, -1, 0}, "x");
    Refuses("list_sorted:26", TLIBSzListSorted, list_);
    Refuses("list_sub:58", PslTLIBSzListSub, list_, list_, 0);
    Refuses("hash_allocator", PshTLIBSzHashAlloc, {1, -1});
    Refuses("hash_allocator", PshTLIBIHashAllocator, {1, -1}, 9);
    Refuses("hash_pair_num:26", TLIBSzHashPairNum, hash_);

    // Without a code.
    const Refusal silent("", 0, "");
    Refuses(silent, SzTLIBSzHashGetValue, hash_, "k");
    Refuses(silent, SzTLIBSzHashRemoveKey, hash_, "k");
    Refuses(silent, TLIBSzHashSetValue, {&hash_, &no_hash}, "k", "v");
    Refuses(silent, TLIBSzHashGetLength, hash_);
    Refuses(silent, TLIBSzHashEnumKey, hash_, {MayBeNull(), nullptr});
    Refuses(silent, TLIBIGetLookDict, hash_, "k");
    Refuses(silent, TLIBISetLookDict, hash_, "k");
    Refuses(silent, TLIBIInsertPair, hash_, {0, -1, 1 << 20}, "k", "v");
    Refuses(silent, TLIBICopyHash, hash_, hash_);
    Refuses(silent, PshTLIBICheckSpace, hash_, 1);
    Refuses(silent, PshTLIBIReSizeHash, hash_, {1, -1}, 1);
    Refuses(silent, PshTLIBIInsertNewPair, hash_, &number, "k", "v");
    Refuses(silent, PshTLIBIUpdateValue, hash_, &number, "k", "v");
}

TEST_F(Refusals, Storage)
{
    static RAIDINFO array = {}, stranger = {};
    static RAIDINFO *found = nullptr;
    static RAIDLIST *arrays = nullptr;
    std::strcpy(array.szPath, "/dev/md2");
    array.fLevel = RAID_LEVEL_5;
    std::strcpy(stranger.szPath, "/dev/sda");
    const RAIDINFO *const good = &array, *const bad = &stranger;
    static DISKINFO *disk = nullptr;
    static DISKLIST *disks = nullptr;
    static TAVODISKINFO *info = nullptr;
    static int32_t *numbers = nullptr;
    static RAIDSBENTRY *entry = nullptr;
    static RAIDSUPERBLOCK superblock;
    static DISKPATH parsed;
    static RAIDPROGRESS progress;

    Refuses("disk_check_power", TAVOIDiskCheckPower, "/dev/none", bytes);
    Refuses("disk_dd_status_get", DiskDDStatusGet, {"/dev/none", "/dev/"}, &number64, &number64);
    Refuses("disk_enter_sleep", TAVOIDiskEnterSleep, "/dev/none");
    Refuses("disk_enum", TAVODiskEnum, {1, 0, 2}, &numbers);
    Refuses("disk_flush_buffer", TAVOIDiskFlushBuffer, "/dev/none");
    Refuses("disk_get_info", TAVODiskGetInfo, {1, 0, 2}, 1, &info);
    Refuses("disk_get_standby_timer", TAVODiskGetStandbyTimer, &number);
    Refuses("disk_info_enum", DiskInfoEnum, {MayBeNull(), nullptr}, &disks);
    Refuses("disk_info_get", DiskInfoGet, "/dev/none", &disk);
    Refuses("disk_is_exist", DiskIsExist, "/dev/none");
    Refuses("disk_is_mv_soc_driver", TAVODiskIsMvSocDriver, {"/dev/none", "/dev/"});
    Refuses("disk_is_ssd", TAVODiskIsSSD, "/dev/none");
    Refuses("disk_list_push", DiskListPush, &disks, {MayBeNull(), nullptr, nullptr});
    Refuses("disk_partition_num_get", TAVODiskPartitionNumGet, "/dev/none1", text, {64, 1});
    Refuses("disk_path_parse", DiskPathParse, "sda", &parsed);
    Refuses("disk_raw_open", TAVOIDiskRawOpen, "/dev/none");
    Refuses("disk_reset", TAVOIDiskReset, "/dev/none");
    Refuses({"disk_set_disk_standby", ":# argument should not be NULL"}, TAVOIDiskSetDiskStandby, "/dev/none");
    Refuses("disk_set_disk_standby_timer", TAVOIDiskSetDiskStandbyTimer, "/dev/none", {0, -1, 256});
    Refuses("disk_set_file_sb_timer_setting", TAVODiskSetFileSBTimerSetting, {0, -1});
    Refuses("disk_size_get", DiskSizeGet, "/dev/none", &number64);
    Refuses("disk_usb_get_info", TAVODiskUSBGetInfo, {"none", "../none"}, &number64);
    Refuses("disk_write_cache_get", TAVODiskWriteCacheGet, "/dev/none");
    Refuses("disk_write_cache_set", TAVODiskWriteCacheSet, "/dev/none", 0);
    Refuses("lnx_disk_get_model", TAVOLnxDiskGetModel, {"/dev/none", "none"}, text, {64, 0});
    Refuses("smart_data_read", SmartDataRead, "/dev/none", bytes, 0);
    Refuses({"raid_add", kBad}, RAIDAdd, {good, bad}, {"/dev/sda3", "sda3"});
    Refuses("raid_add_robust_check", RAIDAddRobustCheck, good, {"/dev/sda3", "sda3"});
    Refuses({"raid_assemble", kBad}, RAIDAssemble, {"/dev/md2", "/dev/sda"}, {"0:0:0:0", "", "none"});
    Refuses({"raid_assemble_by_info", kBad}, RAIDAssembleByInfo, {good, bad});
    Refuses({"raid_bad_sector_remap", kBad}, RAIDBadSectorRemap, {"/dev/md2", "/dev/sda"}, 0);
    Refuses({"raid_dev_count_change", kBad}, RAIDDevCountChange, {good, bad}, {2, 0});
    Refuses("raid_disk_is_used_by_raid", RAIDDiskIsUsedByRAID, {"/dev/sda", "sda3"}, {MayBeNull(), nullptr});
    Refuses("raid_expansible", RAIDExpansible, good, &number64);
    Refuses("raid_info_dup", RAIDInfoDup, good);
    Refuses("raid_info_enum", RAIDInfoEnum, &arrays);
    Refuses("raid_info_get", RAIDInfoGet, {"/dev/md2", "/dev/sda"}, &found);
    Refuses("raid_ioctl_status", RAIDIoctlStatus, {0, -1}, &number);
    Refuses("raid_list_push", RAIDListPush, &arrays, {MayBeNull(), nullptr, nullptr});
    Refuses("raid_list_search", RAIDListSearch, {MayBeNull(), nullptr}, "/dev/md2", &found);
    Refuses({"raid_md_stripe_cache_size_set", kBad}, TAVORAIDMdStripeCacheSizeSet, {"/dev/md2", "/dev/sda"}, {1, 0});
    Refuses({"raid_md_tuning_performance", ":# illegal device path: NULL "}, TAVORAIDMdTuningPerformance, "/dev/md2");
    Refuses({"raid_md_tuning_performance", ":# illegal device path: /dev/sda "}, TAVORAIDMdTuningPerformance,
            {MayBeNull(), "/dev/md2", "/dev/sda"});
    Refuses({"raid_migrate2_raid6", kBad}, RAIDMigrate2RAID6, {good, bad}, list_);
    Refuses("raid_path_enum", RAIDPathEnum, {&list_, &no_list});
    Refuses("raid_rebuild_status_get", RAIDRebuildStatusGet, {0, -1}, &progress);
    Refuses("raid_rebuilding_multi_wait", RAIDRebuildingMultiWait, list_);
    Refuses("raid_rebuilding_wait", RAIDRebuildingWait, {"/dev/md2", "/dev/sda"});
    Refuses({"raid_remove", kBad}, RAIDRemove, {good, bad});
    Refuses({"raid_remove_disk", kBad}, RAIDRemoveDisk, {good, bad}, {"/dev/sda3", "sda3"});
    Refuses("raid_remove_multiple", RAIDRemoveMultiple, list_);
    Refuses({"raid_replace_disk", kBad}, RAIDReplaceDisk, {good, bad}, {MayBeNull(), nullptr, "sda3"},
            {"/dev/sda", "sda3", "/dev/sda3"});
    Refuses("raid_sb_clean", RAIDSBClean, {"/dev/sda3", "sda3"});
    Refuses({"raid_sb_clean_by_uuid", kBad}, RAIDSBCleanByUUID, {MayBeNull(), nullptr}, {"0:0:0:0", "", "none"});
    Refuses("raid_sb_enum", RAIDSBEnum, list_, &entry);
    Refuses("raid_sb_get", RAIDSBGet, {"/dev/sda3", "sda3"}, &superblock);
    Refuses("raid_size_unalloc_get", RAIDSizeUnallocGet, good, &number64);
    Refuses({"raid_stop", kBad}, RAIDStop, {"/dev/md2", "/dev/sda"});
    Refuses("raid_uuid_get", RAIDUUIDGet, {MayBeNull(), "/dev/md2"}, text, {64, 0});
}

// These log a bad argument without a code.
TEST_F(Refusals, StorageWithoutACode)
{
    TLIBSZLIST *paths = PslTLIBSzListAlloc(64), *names = PslTLIBSzListAlloc(64);
    TLIBSzListPush(&paths, "/dev/sda3");
    TLIBSzListPush(&names, "sda3");
    const TLIBSZLIST *const devices = paths, *const bad = names, *const empty = list_;
    LVMPVLIST *volumes = nullptr;
    LVMPV volume;
    LVMVG group = {}, unnamed = {};
    std::strcpy(group.szUuid, "x");
    LVMVGINFO info = {}, *found = nullptr;
    const LVMVGINFO no_devices = {};
    info.pslPvs = paths;
    const LVMVGKEY key = {};
    const PARTITIONFILTER filter = {};
    const auto logs = [](const char *module) {
        return Refusal(module, 0, kBad);
    };

    Refuses(logs("lvm_create"), LVMCreate, {devices, bad, empty}, {"/dev/vg1", "vg1"}, {"lv", "-lv"},
            {MayBeNull(), text}, {64, 0});
    Refuses(logs("lvm_vg_create"), LVMVgCreate, {"/dev/vg1", "vg1"}, {devices, bad, empty});
    Refuses(logs("lvm_lv_create"), LVMLvCreate, {"/dev/vg1", "vg1"}, {"lv", "-lv"});
    Refuses(logs("lvm_pv_create"), LVMPvCreate, {"/dev/sda3", "sda3"});
    Refuses(logs("lvm_pv_sb_list_push"), LVMPvSBListPush, &volumes, &volume);
    Refuses(logs("lvm_vg_remove"), LVMVgRemove, {"/dev/vg1", "/etc"});
    Refuses(logs("lvm_vg_sb2_info"), LVMVgSB2Info, {&group, &unnamed}, &info);
    Refuses(logs("lvm_pv_sb_get"), LVMPvSBGet, {"/dev/sda3", "sda3"}, &volume);
    Refuses(logs("lvm_pv_remove"), LVMPvRemove, {"/dev/sda3", "sda3"});
    Refuses(logs("lvm_remove"), LVMRemove, {"/dev/vg1", "/etc"}, {"lv", "vg"});
    Refuses(logs("lvm_vg_sb_get"), LVMVgSBGet, {"/dev/vg1", "/etc"}, &group);
    Refuses(logs("lvm_pv_expand"), LVMPvExpand, {&info, &no_devices});
    Refuses(logs("lvm_pv_sb_enum"), LVMPvSBEnum, &volumes);
    Refuses(logs("lvm_vg_sb_list_search"), LVMVgSBListSearch, {MayBeNull(), nullptr}, &key, &found);
    Refuses(logs("lvm_get_lv_path"), LVMGetLVPath, {"/dev/sda3", "sda3"}, text, {64, 0});
    Refuses(logs("lvm_remove_lv"), LVMRemoveLV, {"/dev/sda3", "sda3"});
    Refuses({"disk_container_get", 0, ":# bad paramters"}, DiskContainerGet, {"sda", "hda", "sd"}, &number);
    Refuses(logs("partition_is_extended"), PartitionIsExtended, "/dev/sda3");
    Refuses(logs("partition_clean_raid"), PartitionCleanRAID, {"/dev/sda", "sda"}, {1, 0});
    Refuses(logs("partition_clean"), PartitionClean, {"/dev/sda", "sda"}, 0);
    Refuses(logs("partition_table_type_get"), PartitionTableTypeGet, "/dev/none", &number);
    Refuses(logs("check_special_device"), TAVOCheckSpecialDevice, "none");
    Refuses(logs("partition_layout_get"), PartitionLayoutGet, &number);
    Refuses(logs("partition_path_enum"), PartitionPathEnum, &filter, {&list_, &no_list});
    Refuses(logs("partition_create"), PartitionCreate, {"/dev/sda", "sda"}, 0, {MayBeNull(), nullptr});
    Refuses(logs("partition_add_table"), PartitionAddTable, {"/dev/sda", "sda"});
    TLIBSzListFree(names);
    TLIBSzListFree(paths);
}

TEST_F(Refusals, Accounts)
{
    static TAVOBDB store = {};
    static TAVOUSER *user = nullptr;
    static TAVOGROUP *group = nullptr;
    static const char *const names[] = {"none", nullptr};
    static const TAVOUSER *const users[] = {nullptr};
    static void *data = nullptr;
    static TAVOQUOTA quota;
    static const float limit = 1, below = -1;
    static TAVOUSERDB users_open = {}, users_closed = {};
    users_open.pUid = &store;
    static TAVOGROUPDB groups_open = {&store, &store, &store}, groups_closed = {};
    static char name[] = "none";
    static TAVOGROUP record = {};
    record.szName = name;
    static TAVOUSER person = {};
    person.szName = name;
    const TAVOUSER *const account = &person;
    static const TAVOGROUP no_name = {};
    const Argument<const TAVOGROUP *> nameless(&record, &no_name);

    Refuses("bdb_close", TAVOBDbClose, {MayBeNull(), nullptr, nullptr});
    Refuses("bdb_conf_sync_time_get", TAVOBDbConfSyncTimeGet, &store, &number32);
    Refuses("bdb_conf_sync_time_set", TAVOBDbConfSyncTimeSet, &store, 0);
    Refuses("bdb_deprecated_set", TAVOBDbDeprecatedSet, &store, 0);
    Refuses("bdb_domain_expire_time_set", TAVOBDbDomainExpireTimeSet, &store);
    Refuses("bdb_is_need_to_rebuild", TAVOBDbIsNeedToRebuild, &store, 0);
    Refuses("bdb_domain_expire_time_delete", TAVOBDbDomainExpireTimeDelete, &store);
    Refuses("user_db_get_free_uid", TAVOUserDBGetFreeUid, {&users_open, &users_closed});
    Refuses("user_db_dump", TAVOUserDBDump, {&users_open, &users_closed});
    Refuses("user_db_set", TAVOUserDBSet, {&users_open, &users_closed}, {MayBeNull(), nullptr}, account);
    Refuses("user_set_one", TAVOUserSetOne, {MayBeNull(), nullptr}, account);
    Refuses("user_expired_date_fill", TAVOUserExpiredDateFill, &person, "2020/01/01");
    Refuses("user_expired_date_get", TAVOUserExpiredDateGet, account, text, 64);
    Refuses("group_db_get_free_gid", TAVOGroupDBGetFreeGid, {&groups_open, &groups_closed});
    Refuses("group_set", TAVOGroupSet, {MayBeNull(), nullptr}, nameless);
    Refuses("group_db_set", TAVOGroupDBSet, {&groups_open, &groups_closed}, {MayBeNull(), nullptr}, &record);
    Refuses("bdb_cursor_get", TAVOBDbCursorGet, &store, 0, &data, &number, &data, &number);
    Refuses("bdb_cursor_set_type", TAVOBDbCursorSetType, &store, {TAVO_BDB_CURSOR_KEY, -1, 100});
    Refuses("bdb_delete", TAVOBDbDelete, &store, "key", {3, 0});
    Refuses("bdb_deprecated_get", TAVOBDbDeprecatedGet, &store, &number32);
    Refuses("bdb_domain_expire_time_get", TAVOBDbDomainExpireTimeGet, &store, &number32);
    Refuses("bdb_get", TAVOBDbGet, &store, "key", {3, 0}, &data, &number);
    Refuses("bdb_open", TAVOBDbOpen, {"/none", ""}, 0, 0);
    Refuses("bdb_set", TAVOBDbSet, &store, "key", {3, 0}, "x", {1, -1});
    Refuses("group_alloc", TAVOGroupAlloc, &group, "none:x:1:");
    Refuses("group_alloc2", TAVOGroupAlloc2, &group, {"none", ""}, 1, {MayBeNull(), nullptr});
    Refuses("group_delete", TAVOGroupDelete, names, {1, -1});
    Refuses("group_desc_get", TAVOGroupDescGet, {"none", ""}, text, {64, -1});
    Refuses("group_desc_set", TAVOGroupDescSet, {"none", ""}, {MayBeNull(), "x", "a\nb"});
    Refuses("group_enum", TAVOGroupEnum, {&list_, &no_list}, TAVO_GROUP_LOCAL);
    Refuses("group_enum_by_prefix", TAVOGroupEnumByPrefix, {&list_, &no_list}, TAVO_GROUP_LOCAL, "x");
    Refuses("group_enum_by_substr", TAVOGroupEnumBySubstr, {&list_, &no_list}, TAVO_GROUP_LOCAL, "x");
    Refuses("group_get", TAVOGroupGet, {"none", ""}, &group);
    Refuses("group_get_by_gid", TAVOGroupGetByGID, 1, &group);
    Refuses("group_list_member", TAVOGroupListMember, {"none", ""}, {&list_, &no_list});
    Refuses("user_modify_group", TAVOUserModifyGroup, hash_);
    Refuses("quota_clean", TAVOQuotaClean, list_, {"/dev/none", ""});
    Refuses("quota_clean_all_vols", TAVOQuotaCleanAllVols, list_);
    Refuses("quota_fmt_get", TAVOQuotaFmtGet, {"/dev/none", ""});
    Refuses("quota_get", TAVOQuotaGet, {"none", ""}, {"/dev/none", ""}, &quota);
    Refuses("quota_set", TAVOQuotaSet, {"none", ""}, {"/dev/none", ""}, {&limit, &below});
    Refuses("quota_init", TAVOQuotaInit, {1, 77});
    Refuses("quota_off", TAVOQuotaOff, {1, 77});
    Refuses("smb_lm_hash", TLIBSmbLmHash, "x", bytes);
    Refuses("smb_md4_hash", TLIBSmbMd4Hash, "x", bytes);
    Refuses("user_aging_set", TAVOUserAgingSet, {MayBeNull(), "none"}, {0, -2}, {0, -2}, {0, -2});
    Refuses("user_delete", TAVOUserDelete, names, {1, -1});
    Refuses("user_enum", TAVOUserEnum, {&list_, &no_list}, TAVO_USER_LOCAL);
    Refuses("user_enum_by_prefix", TAVOUserEnumByPrefix, {&list_, &no_list}, TAVO_USER_LOCAL, "x");
    Refuses("user_enum_by_substr", TAVOUserEnumBySubstr, {&list_, &no_list}, TAVO_USER_LOCAL, "x");
    Refuses("user_get", TAVOUserGet, {"none", ""}, &user);
    Refuses("user_get_by_uid", TAVOUserGetByUID, 1, &user);
    Refuses("user_get_valid_user_list", TAVOUserGetValidUserList, names, text, {64, -1});
    Refuses("user_privilege_get", TAVOUserPrivilegeGet, {"none", ""});
    Refuses("user_set", TAVOUserSet, names, users, {1, -1});
    Refuses("user_set_passwd", TAVOUserSetPasswd, users, names, names, names, {1, -1});
}

TEST_F(Refusals, Network)
{
    static TAVONETCARD card;
    static TAVONETLINKAGGR bond = {};

    Refuses("fhost_get2_hash", TAVOFHOSTGet2Hash, {&hash_, &no_hash});
    Refuses("conf_get_mtu_value", TAVOConfGetMTUValue, "eth0", text, {64, 0});
    Refuses({"conf_get_mtu_value", ":# interface name is too long"}, TAVOConfGetMTUValue, {MayBeNull(), "eth0", "../x"},
            {MayBeNull(), text}, 64);
    Refuses("conf_set_mtu_value", TAVOConfSetMTUValue, "eth0", {1500, -1});
    Refuses({"conf_set_mtu_value", ":# interface name is too long"}, TAVOConfSetMTUValue, {MayBeNull(), "eth0", "../x"},
            1500);
    Refuses("lnx_get_hostname", TAVOLnxGetHostname, text, {64, 0});
    Refuses("lnx_is_dhcp", BlTAVOLnxIsDHCP, {"eth0", "../x"});
    Refuses("lnx_set_hostname", TAVOLnxSetHostname, "tavo");
    Refuses("net_address_probe", TAVONetAddressProbe, {"eth0", "../x"}, {"10.0.0.1", "10.0.0", "0.0.0.0"}, {1, 0});
    Refuses("net_default_gateway_get", TAVONetDefaultGatewayGet, text, {64, 0});
    Refuses("net_default_gateway_get_conf", TAVONetDefaultGatewayGetConf, text, {64, 0});
    Refuses("net_default_gateway_set", TAVONetDefaultGatewaySet, {MayBeNull(), "10.0.0.1", nullptr});
    Refuses("net_dhcp6_wait", TAVONetDhcp6Wait, {"eth0", "../x"}, {0, -1});
    Refuses("net_dhcp_test", TAVONetDhcpTest, {"eth0", "../x"}, {1, 0});
    Refuses("net_dns_get", TAVONetDNSGet, {&list_, &no_list});
    Refuses("net_dns_set", TAVONetDNSSet, list_);
    Refuses("net_get_card", TAVONetGetCard, {"eth0", "../x"}, &card);
    Refuses("net_get_card1", TAVONetGetCard1, &card);
    Refuses("net_ip_conflict", TAVOIIpConflict, {"eth0", "../x"}, {"10.0.0.1", "10.0.0"});
    Refuses("net_ipv6_addr_enum", TAVONetIPv6AddrEnum, {"eth0", "../x"}, {&list_, &no_list});
    Refuses("net_ipv6_is_enabled", BlTAVONetIPv6IsEnabled, {"eth0", "../x"});
    Refuses("net_ipv6_set", TAVONetIPv6Set, {"eth0", "../x"}, 0);
    Refuses("net_is_connected", BlTLIBIsConnected, {"eth0", "../x"});
    Refuses("net_is_port_in_use", BlTLIBIsPortInUse, {1, 0, 65536});
    Refuses("net_link_aggr_enum", TAVONetLinkAggrEnum, {&list_, &no_list});
    Refuses("net_link_aggr_get", TAVONetLinkAggrGet, {"bond0", "../x"}, &bond);
    Refuses("net_link_aggr_opt_slsave_add", TAVONetLinkAggrOptSlsaveAdd, &bond, {"eth0", "../x"});
    Refuses("net_link_aggr_phy_get", TAVONetLinkAggrPhyGet, {"bond0", "../x"}, {&list_, &no_list});
    Refuses("net_set_card1", TAVONetSetCard1, {&card, &card}, {MayBeNull(), nullptr});
    Refuses("net_set_mtu_eth", TAVONetSetMTUEth, {"eth0", "../x"}, {1500, -1});
    Refuses("net_wol_get", TAVONetWolGet, {"eth0", "../x"});
    Refuses("net_wol_set", TAVONetWolSet, {"eth0", "../x"}, 0);
}

TEST_F(Refusals, Services)
{
    static TAVOEBOX *box = nullptr;
    static const TAVOEBOX unit = {};
    static TAVOSERVICESHARE share;
    const TAVOSERVICE *const row = TAVOServiceInfoGet(0);
    const Argument<int> action = {TAVO_SERVICE_START, -1, 7};

    Refuses("ebox_info_enum", TAVOEBoxInfoEnum, &box);
    Refuses("ebox_is_poweron", TAVOEBoxIsPoweron, &unit);
    Refuses("net_bkp_service", TAVONetBkpService, {TAVO_DAEMON_STOP, -1, 100});
    Refuses("push_duser_used", TAVOPushDUserUsed, {&list_, &no_list});
    Refuses("user_modify_smb_conf", TAVOUserModifySmbConf, hash_);
    Refuses("service_action_set", TAVOServiceActionSet, {0, -1, 31}, TAVO_SERVICE_START);
    Refuses("service_daemon_get", TAVOServiceDaemonGet, "none");
    Refuses("service_data_search", TAVOServiceDataSearch, 1, text, 64);
    Refuses("service_disable_set", TAVOServiceDisableSet, {1, -1, 0, 8, 12});
    Refuses("service_enable_get", TAVOServiceEnableGet, {1, -1, 0, 12});
    Refuses("service_get_all", TAVOServiceGetAll, {&list_, &no_list});
    Refuses("service_getby_volume", TAVOServiceGetbyVolume, {"/volume1", "/tmp"}, {&list_, &no_list});
    Refuses("service_interface", TAVOServiceDaemonIDGet, {0, -1, 31, 1000});
    Refuses("service_interface", TAVOServiceIndexGet, "web");
    Refuses("service_interface", TAVOServiceInfoGet, {0, -1, 31, 1000});
    Refuses("service_interface", TAVOServiceNameGet, {0, -1, 31, 1000});
    Refuses("service_interface", TAVOServiceShareIDGet, {0, -1, 31, 1000});
    Refuses("service_interface", TAVOServiceTypeGet, {0, -1, 31, 1000});
    Refuses("service_is_on_volume", TAVOServiceIsOnVolume, 1, {"/volume1", "/tmp", "", "/volume", "/volume2/"});
    Refuses("service_link_remove", TAVOServiceLinkRemove, {1, -1, 12});
    Refuses("service_link_set", TAVOServiceLinkSet, 1, {"/volume1/web", ""});
    Refuses({"service_net_service", "(#):  bad parameter"}, TAVONetService, {TAVO_DAEMON_CRON, 0},
            {TAVO_DAEMON_START, -1, 5});
    Refuses("service_new_volume_decide", TAVOServiceNewVolumeDecide, {1, -1, 12}, text, {64, 0});
    Refuses("service_remove", TAVOServiceRemove, {1, -1, 12}, 0);
    Refuses("service_removeby_id", TAVOServiceRemovebyID, {1, -1, 31}, 0);
    Refuses("service_removeby_info", TAVOServiceRemovebyInfo, row, 0);
    Refuses("service_removeby_volume", TAVOServiceRemovebyVolume,
            {"/volume1", "/tmp", "", "/volume", "/volume0", "/volume1/", "volume1"}, 0);
    Refuses("service_restore", TAVOServiceRestore, {"/volume1", "/tmp", "", "/volume", "/volume2/"});
    Refuses("service_setting_get", TAVOServiceSettingGet, {1, -1, 0, 12}, &share);
    Refuses("service_share_gen", TAVOServiceShareGen, 1, {"/volume1", "/tmp"}, text, {64, 0});
    Refuses("service_share_is_empty", TAVOServiceShareIsEmpty, {1, -1, 12});
    Refuses("service_share_remove", TAVOServiceShareRemove, {1, -1, 12}, 0);
    Refuses("service_status_get", TAVOServiceStatusGet, {1, -1, 30});
    Refuses("service_std_action", TAVOServiceSTDAction, TAVOServiceInfoGet(0), {0, -1, 100});
    for (const auto act : {TAVOServiceAFP, TAVOServiceAudio, TAVOServiceHTTPS, TAVOServiceNetBkp, TAVOServiceSAMBA,
                           TAVOServiceSSH, TAVOServiceUserHome, TAVOServiceiTunes})
        Refuses("service_std_action", act, row, action);
    for (const auto ask : {TAVOServiceAFPStatus, TAVOServiceFTPStatus, TAVOServiceSSHStatus, TAVOServiceTelnetStatus,
                           TAVOServiceiTunesStatus})
        Refuses("service_std_status", ask, row);
    Refuses("service_std_status", TAVOServiceSTDStatus, {TAVOServiceInfoGet(0), TAVOServiceInfoGet(30)});
    Refuses("service_printer_status", TAVOServicePrinterStatus, {TAVOServiceInfoGet(0), TAVOServiceInfoGet(30)});
    Refuses("service_telnet", TAVOServiceTelnet, TAVOServiceInfoGet(13), {TAVO_SERVICE_STOP, -1, 7, 100});
    Refuses("service_third_party_all", TAVOServiceThirdPartyAll, {"start", "", "reload", "start; reboot"});
    Refuses("service_volume_getby_link", TAVOServiceVolumeGetbyLink, {"web", ""}, text, {64, 0}, text, {64, 0});
    Refuses("service_volume_getby_share", TAVOServiceVolumeGetbyShare, {"web", ""}, text, {64, 0});
}

// Names that no account or host can have, buffers that are too small, and files and devices that are something else.
TEST_F(Refusals, NamesBuffersAndFiles)
{
    static TAVOUSER *user = nullptr;
    static TAVOGROUP *group = nullptr;
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    test::WriteFile(file, std::to_string(::getpid()) + "\n");
    const int null_device = ::open("/dev/null", O_RDONLY | O_CLOEXEC);
    RAIDINFO array = {};
    std::strcpy(array.szPath, "/dev/md77");
    RAIDPROGRESS progress;
    TAVOBDB store = {};
    TAVOGROUPDB groups = {&store, &store, &store};
    char name[] = "DOM\\none";
    TAVOGROUP record = {};
    record.szName = name;
    char plain_name[] = "none";
    char *no_member = nullptr;
    TAVOGROUP plain = {};
    plain.szName = plain_name;
    plain.rgszMember = &no_member;
    TAVONETCARD card = {};
    card.nMode = TAVO_NET_STATIC;
    std::strcpy(card.szInterface, "eth0");
    const auto fails = [](int code, const char *module, auto result) {
        EXPECT_TRUE(result == 0 || result == static_cast<decltype(result)>(-1)) << module;
        EXPECT_EQ(test::LastFault(), (test::Fault{code, module}));
        test::ForgetFault();
    };
    fails(ERR_INVALID_USERNAME, "user_get", TAVOUserGet("\xff", &user));
    fails(ERR_INVALID_USERNAME, "user_privilege_get", TAVOUserPrivilegeGet("\xff"));
    fails(ERR_INVALID_GROUPNAME, "group_get", TAVOGroupGet("\xff", &group));
    fails(ERR_INVALID_GROUPNAME, "group_desc_get", TAVOGroupDescGet("\xff", text, sizeof text));
    fails(ERR_INVALID_GROUPNAME, "group_desc_set", TAVOGroupDescSet("\xff", "x"));
    fails(ERR_NO_SUCH_GROUP, "group_set", TAVOGroupSet("DOM\\none", &plain));
    fails(ERR_INVALID_GROUPNAME, "group_db_set", TAVOGroupDBSet(&groups, nullptr, &record));
    fails(ERR_INVALID_NETNAME, "lnx_set_hostname", TAVOLnxSetHostname("a b"));
    fails(ERR_INVALID_NETNAME, "net_default_gateway_set", TAVONetDefaultGatewaySet("10.0.0"));
    fails(ERR_INVALID_NETNAME, "net_set_card1", TAVONetSetCard1(&card, nullptr));
    fails(ERR_NOT_ENOUGH_MEMORY, "service_share_gen", TAVOServiceShareGen(1, "/volume1", text, 12));
    fails(ERR_NOT_ENOUGH_MEMORY, "conf_get_mtu_value", TAVOConfGetMTUValue("none0", text, 2));
    fails(ERR_FILE_NOT_FOUND, "sys_remove", TLIBSysRemove((dir / "none").c_str()));
    fails(ERR_SYS_UNKNOWN, "sys_remove", TLIBSysRemove(dir.Path().c_str()));
    fails(ERR_OPEN_FAILED, "proc_signal_by_pid_file", TLIBProcSignalByPidFile((dir / "none").c_str(), 0));
    fails(ERR_SYS_UNKNOWN, "proc_signal_by_pid_file", TLIBProcSignalByPidFile(file.c_str(), 999));
    fails(ERR_OPEN_FAILED, "file_read_lines", TLIBFileReadLines(dir.Path().c_str(), &list_));
    fails(ERR_OPEN_FAILED, "file_enum_section", TLIBFileEnumSection(dir.Path().c_str(), &list_));
    fails(ERR_OPEN_FAILED, "net_ipv6_is_enabled", BlTAVONetIPv6IsEnabled("none0"));
    fails(ERR_OP_FAILURE, "net_bkp_service", TAVONetBkpService(TAVO_DAEMON_RELOAD));
    fails(ERR_DISK_IO_FAILED, "disk_usb_get_info", TAVODiskUSBGetInfo("none", &number64));
    fails(ERR_SYS_UNKNOWN, "raid_add_robust_check", RAIDAddRobustCheck(&array, "/dev/sdz3"));
    fails(ERR_OPEN_FAILED, "raid_md_stripe_size_get", RAIDMdStripeSizeGet("/dev/md77"));
    fails(ERR_UNKNOWN, "raid_ioctl_status", RAIDIoctlStatus(null_device, &number));
    fails(ERR_UNKNOWN, "raid_rebuild_status_get", RAIDRebuildStatusGet(null_device, &progress));
    fails(ERR_STAT_FAILED, "disk_get_devname_from_fd", TAVODiskGetDevnameFromFd(-1) ? 1 : 0);
    fails(ERR_NOT_A_DISK, "disk_get_devname_from_fd", TAVODiskGetDevnameFromFd(null_device) ? 1 : 0);
    fails(ERR_SYS_UNKNOWN, "quota_fmt_get", TAVOQuotaFmtGet("/dev/null"));
    ::close(null_device);
}

}  // namespace

// The core: error state, containers, texts, settings files, locks, processes, and what the appliance says of itself.
#include "arguments.h"
#include "support/test.h"

namespace every_call {
namespace {

constexpr const char *kLines = "/tmp/every_call/lines.conf";
constexpr const char *kSections = "/tmp/every_call/sections.conf";
constexpr const char *kNew = "/tmp/every_call/new.conf";
constexpr const char *kOther = "/tmp/every_call/other";
constexpr const char *kMarked = "/tmp/every_call/marked.conf";
constexpr const char *kPidFile = "/tmp/every_call/own.pid";

const std::string kLarge(600, 'x');

// A text that is taken apart.
struct Cursor {
    char text[16];
    char *at = text;

    operator char **() { return &at; }
};

// Calls a function that returns the container, which it may have moved, or NULL.
template <class Owner, class Function, class... Args>
void Replaces(Trial &run, Owner &&owner, Function &function, Args &&...args)
{
    auto *moved = run(function, owner.block, args...);
    owner.block = moved ? moved : owner.block;
    run.Show(owner.block);
}

void ShowAndFree(Trial &run, TLIBSZLIST *list)
{
    run.Show(list);
    TLIBSzListFree(list);
}

struct Core {
    Core()
    {
        const test::CapturedLog quiet;  // takes syslog's place and drops every line
        std::filesystem::create_directories("/tmp/every_call");
        test::WriteFile(kLines, "# comment\nkey=value\nother=1\nfolder=/a/b\n");
        test::WriteFile(kSections, "# comment\n[one]\nkey=value\n[two]\nother=1\n");
        test::WriteFile(kMarked, "\xEF\xBB\xBFkey=value\n");
        test::WriteFile(kPidFile, std::to_string(::getpid()) + "\n", 0644);
        ErrTLIBFileLock(0x801, 0);
        ErrTLIBFileUnlock(0x800);
    }
};

}  // namespace

Family CoreFamily()
{
    return {
        "Core",
        {
            // Error state.
            CALL(TAVOErrorBackTraceLog, kNoCode),
            CALL(TAVOErrorBackTracePanic, kNoCode | kInChild),
            CALL(TAVOErrorBackTracePrint, kNoCode | kInChild),
            BODY(TAVOErrorGetFile, kAnswers,
                 {
                     TLIBErrSetEx(ERR_READ_FAILED, "module", 7);
                     run(f);
                 }),
            CALL(TAVOErrorGetLine, 0),
            CALL(TAVOVolGetErr, 0),
            CALL(TAVOVolISetErr, 0, 0),
            CALL(TLIBErrGet, 0),
            CALL(TLIBErrLogInitial, kNoCode, kOther),
            CALL(TLIBErrLogSet, kCreates, kOther, "message"),
            CALL(TLIBErrPrint, kNoCode | kInChild),
            CALL(TLIBErrSet, 0, ERR_SUCCESS),
            CALL(TLIBErrSetEx, 0, ERR_SUCCESS, "module", 7),
            BODY(codeNum, 0, { run.Show(f); }),
            BODY(errNum, 0, { run.Show(f); }),
            BODY(rgszErrMsg, 0, { run.Show(std::string_view(f[1])); }),
            BODY(tavoerrno, 0, { run.Show(f); }),
            BODY(volerr, 0, { run.Show(f); }),

            // Lists.
            BODY(PslTLIBISzListExpand, 0, { Replaces(run, ListOf(), f); }),
            BODY(PslTLIBSzListAlloc, 0, { TLIBSzListFree(run(f, 512)); }),
            BODY(PslTLIBSzListAnd, 0,
                 {
                     ShowAndFree(run, run(f, ListOf(), ListOf({"c", "d"}), int{TLIB_SZLIST_NEW}));
                 }),
            BODY(PslTLIBSzListOr, 0,
                 {
                     ShowAndFree(run, run(f, ListOf(), ListOf({"c", "d"}), int{TLIB_SZLIST_NEW}));
                 }),
            BODY(PslTLIBSzListSub, 0,
                 {
                     ShowAndFree(run, run(f, ListOf(), ListOf({"c", "d"}), int{TLIB_SZLIST_NEW}));
                 }),
            CALL(SzTLIBSzListGet, 0, ListOf(), 1),
            CALL(SzTLIBSzListPop, 0, ListOf()),
            CALL(SzTLIBSzListRemove, 0, ListOf(), 1),
            CALL(SzTLIBSzListShift, 0, ListOf()),
            CALL(TLIBISzListClean, 0, ListOf()),
            CALL(TLIBISzListDump, kInChild, ListOf()),
            CALL(TLIBISzListFind, kNoCode, ListOf({"a", "b", "c"}, TLIB_SZLIST_SORTED), 2, 0, "b", 0),
            BODY(TLIBISzListStrcmp, 0, { run.Show(run(f, Var<const char *>{"b"}, Var<const char *>{"a"}) > 0); }),
            CALL(TLIBISzListUTF8StrCasecmp, kAnswers, Var<const char *>{"\xC3\xA4"}, Var<const char *>{"\xC3\x84"}),
            CALL(TLIBSzListCaseFind, kNoCode, ListOf(), "C"),
            CALL(TLIBSzListDump2Str, 0, ListOf(), ",", Text<64>(), 64),
            CALL(TLIBSzListFind, kNoCode, ListOf(), "c"),
            CALL(TLIBSzListFree, 0, test::MakeList({"a"}).release()),
            CALL(TLIBSzListInsert, 0, ListOf(), 1, kLarge.c_str()),
            CALL(TLIBSzListPush, 0, ListOf(), kLarge.c_str()),
            CALL(TLIBSzListRemoveAll, 0, ListOf()),
            CALL(TLIBSzListSet, 0, ListOf(), 1, kLarge.c_str()),
            CALL(TLIBSzListSortItems, 0, ListOf(), int{TLIB_SZLIST_SORTED}),
            CALL(TLIBSzListSorted, 0, ListOf()),
            CALL(TLIBSzListUnshift, 0, ListOf(), kLarge.c_str()),

            // Hashes.
            BODY(PshTLIBICheckSpace, kNoCode, { Replaces(run, HashOf(), f, 5000); }),
            BODY(PshTLIBIHashAllocator, 0, { TLIBSzHashFree(run(f, 16, 100)); }),
            BODY(PshTLIBIInsertNewPair, kNoCode,
                 { Replaces(run, HashOf(), f, Var<int>{-1}, "another", kLarge.c_str()); }),
            BODY(PshTLIBIReSizeHash, kNoCode, { Replaces(run, HashOf(), f, 50, 500); }),
            BODY(PshTLIBIUpdateValue, kNoCode,
                 { Replaces(run, HashOf(), f, Var<int>{TLIBIGetLookDict(HashOf(), "key")}, "key", kLarge.c_str()); }),
            BODY(PshTLIBSzHashAlloc, 0, { TLIBSzHashFree(run(f, 64)); }),
            CALL(PslSzHashRemoveAll, 0, HashOf()),
            CALL(SzTLIBSzHashGetValue, 0, HashOf(), "key"),
            CALL(SzTLIBSzHashRemoveKey, 0, HashOf(), "key"),
            CALL(TLIBICopyHash, 0, HashOf({}), HashOf()),
            CALL(TLIBIGetLookDict, 0, HashOf(), "key"),
            CALL(TLIBIHashDump, kInChild, HashOf()),
            CALL(TLIBIInsertPair, 0, HashOf(), TLIBISetLookDict(HashOf(), "k"), "k", "v"),
            CALL(TLIBIRadixHashCode, 0, "key", 16),
            CALL(TLIBISetLookDict, 0, HashOf(), "key"),
            CALL(TLIBSzHashEnumKey, 0, HashOf(), ListOf()),
            CALL(TLIBSzHashFree, 0, PshTLIBSzHashAlloc(64)),
            CALL(TLIBSzHashGetLength, 0, HashOf()),
            CALL(TLIBSzHashPairNum, 0, HashOf()),
            CALL(TLIBSzHashSetValue, kNoCode, HashOf(), "another", kLarge.c_str()),

            // Texts.
            CALL(TLIBIStrTok, 0, Cursor{",,a,b"}, ","),
            CALL(TLIBStrDecodeColon, 0, "a", Text<16>(), 16),
            CALL(TLIBStrEncodeColon, 0, "a:b", Text<16>(), 16),
            CALL(TLIBStrSep, 0, Cursor{"a,b"}, ","),
            CALL(TLIBStrTok, 0, Cursor{",,a,b"}, ","),
            CALL(TLIBStrTrimSpace, 0, Text<16>{"  a "}, nullptr),
            CALL(TLIBUnicodeUTF8StrCaseCmp, 0, "\xC3\xA4", "\xC3\x84"),
            CALL(TLIBUnicodeUTF8StrCountChar, 0, "\xC3\xA4"),
            CALL(TLIBUnicodeUTF8StrUpper, 0, "\xC3\xA4", Text<16>(), 16),

            // Settings files.
            CALL(BlTAVOFileCheckKeyValue, kZeroFails, kLines, "key", "value"),
            CALL(TAVOINFOSetKeyValue, 0, "runweb", "yes"),
            CALL(TLIBFileAddLine, 0, kLines, 2, "added=1"),
            CALL(TLIBFileAddLineByKey, 0, kLines, "other", "added=1"),
            CALL(TLIBFileAppendKey, 0, kLines, "added", "1", nullptr),
            CALL(TLIBFileComment, kSteps, kLines, "key"),
            CALL(TLIBFileGetKeyValue, 0, kLines, "key", Text<16>(), 16, 0),
            CALL(TLIBFileGetKeys, 0, kLines, nullptr, HashOf({}), "="),
            CALL(TLIBFileGetLine, 0, kLines, 2, Text<64>(), 64),
            CALL(TLIBFileGetLineByKey, 0, kLines, "other", Text<64>(), 64),
            CALL(TLIBFileITmpName, 0, "/tmp/every_call/x", Array<char, 64>(), 64),
            CALL(TLIBFileMatchLineNo, 0, kLines, "other"),
            CALL(TLIBFileReadLines, 0, kLines, ListOf()),
            CALL(TLIBFileRemoveKey, 0, kLines, "other"),
            CALL(TLIBFileReplaceSubStr, 0, kLines, "/a", "/c"),
            CALL(TLIBFileSetKeyValue, 0, kLines, "key", "new", nullptr),
            CALL(TLIBFileSetKeys, 0, kLines, HashOf(), nullptr),
            CALL(TLIBFileSetLine, 0, kLines, 2, "key=2"),
            CALL(TLIBFileSetLineByKey, 0, kLines, "other", "other=2"),
            BODY(TLIBFileTempFileOpen, 0,
                 {
                     char name[] = "/tmp/every_call/XXXXXX";
                     std::FILE *file = run(f, name);
                     if (file) {
                         std::fclose(file);
                         ::unlink(name);
                     }
                 }),
            CALL(TLIBFileTouch, 0, kOther),
            CALL(TLIBFileUTF8BomStrip, 0, kMarked),
            CALL(TLIBILineKeyMatch, 0, "key=value", "key"),

            // The file is made.
            CALL(TLIBFileAppendKey, 0, kNew, "added", "1", nullptr),
            CALL(TLIBFileSetKeyValue, 0, kNew, "key", "new", nullptr),
            CALL(TLIBFileSetKeys, 0, kNew, HashOf(), nullptr),
            CALL(ErrTLIBFileAddSection, 0, kNew, "three", HashOf(), nullptr),

            // Sections.
            CALL(ErrTLIBFileAddSection, 0, kSections, "three", HashOf(), nullptr),
            CALL(ErrTLIBFileRemoveSection, 0, kSections, "two"),
            CALL(ErrTLIBFileSetSection, 0, kSections, "two", nullptr, HashOf(), 1, nullptr),
            BODY(ErrTLIBIFileHash2File, 0,
                 {
                     std::FILE *file = std::fopen(kOther, "we");
                     run(f, file, "one", HashOf(), nullptr);
                     std::fclose(file);
                 }),
            CALL(TLIBFileEnumSection, 0, kSections, ListOf()),
            CALL(TLIBFileGetSection, 0, kSections, "two", HashOf()),
            CALL(TLIBIFileCheckFormat, 0, "%s=%s\n"),
            CALL(TLIBIFileIsSection, 0, "[one]\n", 6),
            CALL(TLIBIFileMatchSection, 0, "[one]\n", 6, "one"),
            CALL(TLIBIFileModifySection, 0, kSections, "two", "renamed", HashOf(), 1, nullptr),

            // Locks.
            CALL(ErrTLIBFileCloseLock, kInChild),
            CALL(ErrTLIBFileLock, kInChild | kHolds, 0x805u, 1),
            CALL(ErrTLIBFileResetLock, kInChild, 0x800u),
            BODY(ErrTLIBFileUnlock, kInChild,
                 {
                     ErrTLIBFileLock(0x801, 0);
                     run(f, 0x800u);
                 }),
            CALL(ErrTLIBILockCheckDir, 0),
            BODY(rgslckList, 0, { run.Show(std::string_view(f[0].szPath)); }),

            // Processes.
            CALL(BlTLIBProcAlive, kZeroFails | kNoCode, ::getpid()),
            CALL(TAVOProcPidFileCreate, 0, "/tmp/every_call.pid"),
            BODY(TLIBBackgroundExec, kAnswers | kInChild, { run.Show(run(f, "/bin/true", nullptr) > 0); }),
            CALL(TLIBExec, 0, "/bin/true", nullptr),
            BODY(TLIBExecv, kNoCode,
                 {
                     char word[] = "true";
                     char *const words[] = {word, nullptr};
                     run(f, "/bin/true", words, 1);
                 }),
            CALL(TLIBProcAliveByPidFile, kZeroFails, kPidFile),
            CALL(TLIBProcSignalByPidFile, 0, kPidFile, 0),
            CALL(TLIBPs, kAnswers, "fault_every_call_test", Array<pid_t, 64>(), 64),
            CALL(TLIBReadPidFile, kNoCode, kPidFile),
            CALL(TLIBSysRemove, 0, kSections),
            CALL(TLIBSystem, kAnswers | kNoCode, "true"),
            CALL(TLIBTimedExec, kMayAbort | kHolds, 5, "/bin/true", nullptr),

            // The appliance.
            CALL(RAIDSizeLimitGet, kLeavesCode),
            CALL(TAVOEBoxDevIs, kAnswers, 0),
            CALL(TAVOEBoxInfoEnum, kAnswers, Made<std::free, TAVOEBOX *>()),
            BODY(TAVOEBoxIsPoweron, kAnswers,
                 {
                     TAVOEBOX box = {};
                     box.iUnit = 1;
                     run(f, &box);
                 }),
            CALL(TAVOMaxDiskGet, kAnswers),
            CALL(TAVONetBkpService, 0, 3),
            CALL(TAVOPushDUserUsed, 0, ListOf()),
            CALL(TAVOSchedulerHup, 0, SIGHUP),
            CALL(TAVOUserModifySmbConf, 0, HashOf()),
            CALL(TLIBScemdNotify, 0, SIGHUP),
        },
        [] { return std::make_shared<Core>(); },
        {"/tmp/every_call", "/etc", "/usr/tavo/etc"},
    };
}

}  // namespace every_call

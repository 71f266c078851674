// The core: error state, containers, texts, settings files, locks, processes, and what the appliance says of itself.
#include "call.h"
#include "support/captured_log.h"
#include "support/container_text.h"
#include "support/scratch_dir.h"

#include <csignal>
#include <cstdlib>
#include <filesystem>

#include <unistd.h>

namespace every_call {
namespace {

using test::MakeList;

constexpr const char *kLines = "/tmp/every_call/lines.conf";
constexpr const char *kSections = "/tmp/every_call/sections.conf";
constexpr const char *kOther = "/tmp/every_call/other";
constexpr const char *kMarked = "/tmp/every_call/marked.conf";
constexpr const char *kPidFile = "/tmp/every_call/own.pid";

const std::string kLarge(600, 'x');

// Containers of a row; the call may move them.
struct Two {
    TLIBSZLIST *list = MakeList({"b", "a", "c"}).release();
    TLIBSZLIST *other = MakeList({"c", "d"}).release();

    ~Two()
    {
        TLIBSzListFree(list);
        TLIBSzListFree(other);
    }
};

struct Pair {
    TLIBSZHASH *hash = PshTLIBSzHashAlloc(64);

    Pair() { TLIBSzHashSetValue(&hash, "key", "value"); }
    ~Pair() { TLIBSzHashFree(hash); }
};

template <class Function, class... Args>
void OnList(Trial &run, Function &function, Args... args)
{
    const Two two;
    run(function, two.list, args...);
}

template <class Function, class... Args>
void OnHash(Trial &run, Function &function, Args... args)
{
    const Pair pair;
    run(function, pair.hash, args...);
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
            CALL(TAVOErrorBackTraceLog, kNoCode, { run(f); }),
            CALL(TAVOErrorBackTracePanic, kNoCode | kInChild, { run(f); }),
            CALL(TAVOErrorBackTracePrint, kNoCode | kInChild, { run(f); }),
            CALL(TAVOErrorGetFile, kAnswers,
                 {
                     TLIBErrSetEx(ERR_READ_FAILED, "module", 7);
                     run(f);
                 }),
            CALL(TAVOErrorGetLine, 0, { run(f); }),
            CALL(TAVOVolGetErr, 0, { run(f); }),
            CALL(TAVOVolISetErr, 0, { run(f, 0); }),
            CALL(TLIBErrGet, 0, { run(f); }),
            CALL(TLIBErrLogInitial, kNoCode, { run(f, kOther); }),
            CALL(TLIBErrLogSet, kCreates, { run(f, kOther, "message"); }),
            CALL(TLIBErrPrint, kNoCode | kInChild, { run(f); }),
            CALL(TLIBErrSet, 0, { run(f, ERR_SUCCESS); }),
            CALL(TLIBErrSetEx, 0, { run(f, ERR_SUCCESS, "module", 7); }),
            CALL(codeNum, 0, { run.Show(f); }),
            CALL(errNum, 0, { run.Show(f); }),
            CALL(rgszErrMsg, 0, { run.Show(std::string_view(f[1])); }),
            CALL(tavoerrno, 0, { run.Show(f); }),
            CALL(volerr, 0, { run.Show(f); }),

            // Lists.
            CALL(PslTLIBISzListExpand, 0,
                 {
                     Two two;
                     TLIBSZLIST *grown = run(f, two.list);
                     two.list = grown ? grown : two.list;
                 }),
            CALL(PslTLIBSzListAlloc, 0, { TLIBSzListFree(run(f, 512)); }),
            CALL(PslTLIBSzListAnd, 0,
                 {
                     const Two two;
                     TLIBSZLIST *made = run(f, two.list, two.other, int{TLIB_SZLIST_NEW});
                     run.Show(made);
                     TLIBSzListFree(made);
                 }),
            CALL(PslTLIBSzListOr, 0,
                 {
                     Two two;
                     TLIBSZLIST *made = run(f, &two.list, two.other, int{TLIB_SZLIST_NEW});
                     run.Show(made);
                     TLIBSzListFree(made);
                 }),
            CALL(PslTLIBSzListSub, 0,
                 {
                     const Two two;
                     TLIBSZLIST *made = run(f, two.list, two.other, int{TLIB_SZLIST_NEW});
                     run.Show(made);
                     TLIBSzListFree(made);
                 }),
            CALL(SzTLIBSzListGet, 0, { OnList(run, f, 1); }),
            CALL(SzTLIBSzListPop, 0, { OnList(run, f); }),
            CALL(SzTLIBSzListRemove, 0, { OnList(run, f, 1); }),
            CALL(SzTLIBSzListShift, 0, { OnList(run, f); }),
            CALL(TLIBISzListClean, 0, { OnList(run, f); }),
            CALL(TLIBISzListDump, kInChild, { OnList(run, f); }),
            CALL(TLIBISzListFind, kNoCode,
                 {
                     const Two two;
                     TLIBSzListSortItems(two.list, TLIB_SZLIST_SORTED);
                     run(f, two.list, 2, 0, "b", 0);
                 }),
            CALL(TLIBISzListStrcmp, 0,
                 {
                     const char *left = "a";
                     const char *right = "b";
                     run.Show(run(f, &right, &left) > 0);
                 }),
            CALL(TLIBISzListUTF8StrCasecmp, kAnswers,
                 {
                     const char *left = "\xC3\xA4";
                     const char *right = "\xC3\x84";
                     run(f, &left, &right);
                 }),
            CALL(TLIBSzListCaseFind, kNoCode, { OnList(run, f, "C"); }),
            CALL(TLIBSzListDump2Str, 0,
                 {
                     const Two two;
                     char text[64] = "";
                     run(f, two.list, ",", text, 64);
                     run.Show(text);
                 }),
            CALL(TLIBSzListFind, kNoCode, { OnList(run, f, "c"); }),
            CALL(TLIBSzListFree, 0, { run(f, MakeList({"a"}).release()); }),
            CALL(TLIBSzListInsert, 0,
                 {
                     Two two;
                     run(f, &two.list, 1, kLarge.c_str());
                     run.Show(two.list);
                 }),
            CALL(TLIBSzListPush, 0,
                 {
                     Two two;
                     run(f, &two.list, kLarge.c_str());
                     run.Show(two.list);
                 }),
            CALL(TLIBSzListRemoveAll, 0, { OnList(run, f); }),
            CALL(TLIBSzListSet, 0,
                 {
                     Two two;
                     run(f, &two.list, 1, kLarge.c_str());
                     run.Show(two.list);
                 }),
            CALL(TLIBSzListSortItems, 0,
                 {
                     const Two two;
                     run(f, two.list, int{TLIB_SZLIST_SORTED});
                     run.Show(two.list);
                 }),
            CALL(TLIBSzListSorted, 0, { OnList(run, f); }),
            CALL(TLIBSzListUnshift, 0,
                 {
                     Two two;
                     run(f, &two.list, kLarge.c_str());
                     run.Show(two.list);
                 }),

            // Hashes.
            CALL(PshTLIBICheckSpace, kNoCode,
                 {
                     Pair pair;
                     TLIBSZHASH *grown = run(f, pair.hash, 5000);
                     pair.hash = grown ? grown : pair.hash;
                 }),
            CALL(PshTLIBIHashAllocator, 0, { TLIBSzHashFree(run(f, 16, 100)); }),
            CALL(PshTLIBIInsertNewPair, kNoCode,
                 {
                     Pair pair;
                     int slot = TLIBIGetLookDict(pair.hash, "another");
                     TLIBSZHASH *grown = run(f, pair.hash, &slot, "another", kLarge.c_str());
                     pair.hash = grown ? grown : pair.hash;
                     run.Show(pair.hash);
                 }),
            CALL(PshTLIBIReSizeHash, kNoCode,
                 {
                     Pair pair;
                     TLIBSZHASH *grown = run(f, pair.hash, 50, 500);
                     pair.hash = grown ? grown : pair.hash;
                     run.Show(pair.hash);
                 }),
            CALL(PshTLIBIUpdateValue, kNoCode,
                 {
                     Pair pair;
                     int slot = TLIBIGetLookDict(pair.hash, "key");
                     TLIBSZHASH *grown = run(f, pair.hash, &slot, "key", kLarge.c_str());
                     pair.hash = grown ? grown : pair.hash;
                     run.Show(pair.hash);
                 }),
            CALL(PshTLIBSzHashAlloc, 0, { TLIBSzHashFree(run(f, 64)); }),
            CALL(PslSzHashRemoveAll, 0, { OnHash(run, f); }),
            CALL(SzTLIBSzHashGetValue, 0, { OnHash(run, f, "key"); }),
            CALL(SzTLIBSzHashRemoveKey, 0, { OnHash(run, f, "key"); }),
            CALL(TLIBICopyHash, 0,
                 {
                     const Pair from;
                     TLIBSZHASH *to = PshTLIBIHashAllocator(from.hash->nSlot, 100);
                     run(f, to, from.hash);
                     run.Show(to);
                     TLIBSzHashFree(to);
                 }),
            CALL(TLIBIGetLookDict, 0, { OnHash(run, f, "key"); }),
            CALL(TLIBIHashDump, kInChild, { OnHash(run, f); }),
            CALL(TLIBIInsertPair, 0,
                 {
                     const Pair pair;
                     run(f, pair.hash, TLIBISetLookDict(pair.hash, "k"), "k", "v");
                     run.Show(pair.hash);
                 }),
            CALL(TLIBIRadixHashCode, 0, { run(f, "key", 16); }),
            CALL(TLIBISetLookDict, 0, { OnHash(run, f, "key"); }),
            CALL(TLIBSzHashEnumKey, 0,
                 {
                     const Pair pair;
                     Two two;
                     run(f, pair.hash, &two.list);
                     run.Show(two.list);
                 }),
            CALL(TLIBSzHashFree, 0, { run(f, PshTLIBSzHashAlloc(64)); }),
            CALL(TLIBSzHashGetLength, 0, { OnHash(run, f); }),
            CALL(TLIBSzHashPairNum, 0, { OnHash(run, f); }),
            CALL(TLIBSzHashSetValue, kNoCode,
                 {
                     Pair pair;
                     run(f, &pair.hash, "another", kLarge.c_str());
                     run.Show(pair.hash);
                 }),

            // Texts.
            CALL(TLIBIStrTok, 0,
                 {
                     char text[] = ",,a,b";
                     char *cursor = text;
                     run(f, &cursor, ",");
                 }),
            CALL(TLIBStrDecodeColon, 0,
                 {
                     char text[16] = "";
                     run(f, "a", text, 16);
                     run.Show(text);
                 }),
            CALL(TLIBStrEncodeColon, 0,
                 {
                     char text[16] = "";
                     run(f, "a:b", text, 16);
                     run.Show(text);
                 }),
            CALL(TLIBStrSep, 0,
                 {
                     char text[] = "a,b";
                     char *cursor = text;
                     run(f, &cursor, ",");
                 }),
            CALL(TLIBStrTok, 0,
                 {
                     char text[] = ",,a,b";
                     char *cursor = text;
                     run(f, &cursor, ",");
                 }),
            CALL(TLIBStrTrimSpace, 0,
                 {
                     char text[] = "  a ";
                     run(f, text, static_cast<char *>(nullptr));
                     run.Show(text);
                 }),
            CALL(TLIBUnicodeUTF8StrCaseCmp, 0, { run(f, "\xC3\xA4", "\xC3\x84"); }),
            CALL(TLIBUnicodeUTF8StrCountChar, 0, { run(f, "\xC3\xA4"); }),
            CALL(TLIBUnicodeUTF8StrUpper, 0,
                 {
                     char text[16] = "";
                     run(f, "\xC3\xA4", text, 16);
                     run.Show(text);
                 }),

            // Settings files.
            CALL(BlTAVOFileCheckKeyValue, kZeroFails, { run(f, kLines, "key", "value"); }),
            CALL(TAVOINFOSetKeyValue, 0, { run(f, "runweb", "yes"); }),
            CALL(TLIBFileAddLine, 0, { run(f, kLines, 2, "added=1"); }),
            CALL(TLIBFileAddLineByKey, 0, { run(f, kLines, "other", "added=1"); }),
            CALL(TLIBFileAppendKey, 0, { run(f, kLines, "added", "1", static_cast<const char *>(nullptr)); }),
            CALL(TLIBFileComment, kSteps, { run(f, kLines, "key"); }),
            CALL(TLIBFileGetKeyValue, 0,
                 {
                     char value[16] = "";
                     run(f, kLines, "key", value, 16, 0);
                     run.Show(value);
                 }),
            CALL(TLIBFileGetKeys, 0,
                 {
                     TLIBSZHASH *hash = PshTLIBSzHashAlloc(64);
                     run(f, kLines, static_cast<const TLIBSZLIST *>(nullptr), &hash, "=");
                     run.Show(hash);
                     TLIBSzHashFree(hash);
                 }),
            CALL(TLIBFileGetLine, 0,
                 {
                     char line[64] = "";
                     run(f, kLines, 2, line, 64);
                     run.Show(line);
                 }),
            CALL(TLIBFileGetLineByKey, 0,
                 {
                     char line[64] = "";
                     run(f, kLines, "other", line, 64);
                     run.Show(line);
                 }),
            CALL(TLIBFileITmpName, 0,
                 {
                     char name[64] = "";
                     run(f, "/tmp/every_call/x", name, 64);
                 }),
            CALL(TLIBFileMatchLineNo, 0, { run(f, kLines, "other"); }),
            CALL(TLIBFileReadLines, 0,
                 {
                     Two two;
                     run(f, kLines, &two.list);
                     run.Show(two.list);
                 }),
            CALL(TLIBFileRemoveKey, 0, { run(f, kLines, "other"); }),
            CALL(TLIBFileReplaceSubStr, 0, { run(f, kLines, "/a", "/c"); }),
            CALL(TLIBFileSetKeyValue, 0, { run(f, kLines, "key", "new", static_cast<const char *>(nullptr)); }),
            CALL(TLIBFileSetKeys, 0,
                 {
                     const Pair pair;
                     run(f, kLines, pair.hash, static_cast<const char *>(nullptr));
                 }),
            CALL(TLIBFileSetLine, 0, { run(f, kLines, 2, "key=2"); }),
            CALL(TLIBFileSetLineByKey, 0, { run(f, kLines, "other", "other=2"); }),
            CALL(TLIBFileTempFileOpen, 0,
                 {
                     char name[] = "/tmp/every_call/XXXXXX";
                     std::FILE *file = run(f, name);
                     if (file) {
                         std::fclose(file);
                         ::unlink(name);
                     }
                 }),
            CALL(TLIBFileTouch, 0, { run(f, kOther); }),
            CALL(TLIBFileUTF8BomStrip, 0, { run(f, kMarked); }),
            CALL(TLIBILineKeyMatch, 0, { run(f, "key=value", "key"); }),

            // Sections.
            CALL(ErrTLIBFileAddSection, 0,
                 {
                     const Pair pair;
                     run(f, kSections, "three", pair.hash, static_cast<const char *>(nullptr));
                 }),
            CALL(ErrTLIBFileRemoveSection, 0, { run(f, kSections, "two"); }),
            CALL(ErrTLIBFileSetSection, 0,
                 {
                     const Pair pair;
                     run(f, kSections, "two", static_cast<const char *>(nullptr), pair.hash, 1,
                         static_cast<const char *>(nullptr));
                 }),
            CALL(ErrTLIBIFileHash2File, 0,
                 {
                     const Pair pair;
                     std::FILE *file = std::fopen(kOther, "we");
                     run(f, file, "one", pair.hash, static_cast<const char *>(nullptr));
                     std::fclose(file);
                 }),
            CALL(TLIBFileEnumSection, 0,
                 {
                     Two two;
                     run(f, kSections, &two.list);
                     run.Show(two.list);
                 }),
            CALL(TLIBFileGetSection, 0,
                 {
                     Pair pair;
                     run(f, kSections, "two", &pair.hash);
                     run.Show(pair.hash);
                 }),
            CALL(TLIBIFileCheckFormat, 0, { run(f, "%s=%s\n"); }),
            CALL(TLIBIFileIsSection, 0, { run(f, "[one]\n", 6); }),
            CALL(TLIBIFileMatchSection, 0, { run(f, "[one]\n", 6, "one"); }),
            CALL(TLIBIFileModifySection, 0,
                 {
                     const Pair pair;
                     run(f, kSections, "two", "renamed", pair.hash, 1, static_cast<const char *>(nullptr));
                 }),

            // Locks.
            CALL(ErrTLIBFileCloseLock, kInChild, { run(f); }),
            CALL(ErrTLIBFileLock, kInChild | kHolds, { run(f, 0x805u, 1); }),
            CALL(ErrTLIBFileResetLock, kInChild, { run(f, 0x800u); }),
            CALL(ErrTLIBFileUnlock, kInChild,
                 {
                     ErrTLIBFileLock(0x801, 0);
                     run(f, 0x800u);
                 }),
            CALL(ErrTLIBILockCheckDir, 0, { run(f); }),
            CALL(rgslckList, 0, { run.Show(std::string_view(f[0].szPath)); }),

            // Processes.
            CALL(BlTLIBProcAlive, kZeroFails | kNoCode, { run(f, ::getpid()); }),
            CALL(TAVOProcPidFileCreate, 0, { run(f, "/tmp/every_call.pid"); }),
            CALL(TLIBBackgroundExec, kAnswers | kInChild,
                 { run.Show(run(f, "/bin/true", static_cast<const char *>(nullptr)) > 0); }),
            CALL(TLIBExec, 0, { run(f, "/bin/true", static_cast<const char *>(nullptr)); }),
            CALL(TLIBExecv, kNoCode,
                 {
                     char word[] = "true";
                     char *const words[] = {word, nullptr};
                     run(f, "/bin/true", words, 1);
                 }),
            CALL(TLIBProcAliveByPidFile, kZeroFails, { run(f, kPidFile); }),
            CALL(TLIBProcSignalByPidFile, 0, { run(f, kPidFile, 0); }),
            CALL(TLIBPs, kAnswers,
                 {
                     pid_t pids[64];
                     run(f, "fault_every_call_test", pids, 64);
                 }),
            CALL(TLIBReadPidFile, kNoCode, { run(f, kPidFile); }),
            CALL(TLIBSysRemove, 0, { run(f, kSections); }),
            CALL(TLIBSystem, kAnswers | kNoCode, { run(f, "true"); }),
            CALL(TLIBTimedExec, kMayAbort | kHolds, { run(f, 5, "/bin/true", static_cast<const char *>(nullptr)); }),

            // The appliance.
            CALL(RAIDSizeLimitGet, kLeavesCode, { run(f); }),
            CALL(TAVOEBoxDevIs, kAnswers, { run(f, 0); }),
            CALL(TAVOEBoxInfoEnum, kAnswers,
                 {
                     TAVOEBOX *boxes = nullptr;
                     run(f, &boxes);
                     std::free(boxes);
                 }),
            CALL(TAVOEBoxIsPoweron, kAnswers,
                 {
                     TAVOEBOX box = {};
                     box.iUnit = 1;
                     run(f, &box);
                 }),
            CALL(TAVOMaxDiskGet, kAnswers, { run(f); }),
            CALL(TAVONetBkpService, 0, { run(f, 3); }),
            CALL(TAVOPushDUserUsed, 0,
                 {
                     Two two;
                     run(f, &two.list);
                     run.Show(two.list);
                 }),
            CALL(TAVOSchedulerHup, 0, { run(f, SIGHUP); }),
            CALL(TAVOUserModifySmbConf, 0, { OnHash(run, f); }),
            CALL(TLIBScemdNotify, 0, { run(f, SIGHUP); }),
        },
        [] { return std::make_shared<Core>(); },
        {"/tmp/every_call", "/etc", "/usr/tavo/etc"},
    };
}

}  // namespace every_call

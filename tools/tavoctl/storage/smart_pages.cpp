// The health of a drive from its pages.
#include "storage/smart_pages.h"

#include <algorithm>

namespace tavoctl {
namespace {

struct Name {
    int id;
    const char *name;
};

constexpr Name names[] = {
    {1, "read error rate"},         {3, "spin-up time"},           {4, "starts and stops"},
    {5, "reallocated sectors"},     {7, "seek error rate"},        {9, "power-on hours"},
    {10, "spin-up retries"},        {12, "power cycles"},          {173, "wear leveling"},
    {184, "end-to-end errors"},     {187, "uncorrectable errors"}, {188, "command timeouts"},
    {190, "airflow temperature"},   {192, "emergency retracts"},   {193, "load cycles"},
    {194, "temperature"},           {196, "reallocation events"},  {197, "pending sectors"},
    {198, "offline uncorrectable"}, {199, "interface CRC errors"}, {241, "sectors written"},
    {242, "sectors read"},
};

constexpr std::size_t execution_status = 363;  // the result, and the tenths that are left
constexpr std::size_t short_minutes_at = 372;
constexpr std::size_t long_minutes_at = 373;
constexpr std::size_t long_minutes_word = 375;  // when they do not fit a byte
constexpr int does_not_fit = 0xFF;
constexpr int runs = 15;

constexpr const char *results[] = {
    "passed",
    "stopped",
    "stopped by a reset",
    "failed: it could not be finished",
    "failed",
    "failed: its electronics",
    "failed: its heads cannot find their place",
    "failed: it cannot read",
    "failed: it was damaged in handling",
};
constexpr int first_failure = 3;

// The error log: a ring of five entries, each with the last commands and then the registers of the failed one.
constexpr std::size_t newest_error_at = 1;  // from 1; 0 for none
constexpr std::size_t error_count_at = 452;
constexpr int error_entries = 5;
constexpr std::size_t error_entry_size = 90;
constexpr std::size_t failed_command = 55;
constexpr std::size_t error_registers = 60;

int Word(const unsigned char *bytes)
{
    return bytes[0] | bytes[1] << 8;
}

const char *ErrorText(unsigned char error)
{
    constexpr struct {
        int bit;
        const char *text;
    } texts[] = {
        {0x80, "data was damaged on the cable"},
        {0x40, "the sector cannot be read"},
        {0x10, "the sector is not found"},
        {0x04, "the drive refused the command"},
    };
    for (const auto &[bit, text] : texts)
        if (error & bit)
            return text;
    return "not known";
}

}  // namespace

SelfTest ParseSelfTest(const unsigned char (&page)[512])
{
    SelfTest test = {};
    const int status = page[execution_status] >> 4;
    test.running = status == runs;
    test.percent = test.running ? 100 - (page[execution_status] & 15) * 10 : 0;
    test.failed = status >= first_failure && status < static_cast<int>(std::size(results));
    test.result = test.running                                    ? "running"
                  : status < static_cast<int>(std::size(results)) ? results[status]
                                                                  : "not known";
    test.short_minutes = page[short_minutes_at];
    test.long_minutes = page[long_minutes_at] == does_not_fit
                            ? page[long_minutes_word] | page[long_minutes_word + 1] << 8
                            : page[long_minutes_at];
    return test;
}

ErrorLog ParseErrorLog(const unsigned char (&page)[512])
{
    ErrorLog log = {.count = Word(page + error_count_at), .last = {}};
    const int newest = page[newest_error_at];
    if (newest < 1 || newest > error_entries)
        return log;
    for (int i = 0; i < std::min(log.count, error_entries); ++i) {
        const int slot = (newest - 1 - i + error_entries) % error_entries;
        const unsigned char *entry = page + 2 + static_cast<std::size_t>(slot) * error_entry_size;
        const unsigned char *registers = entry + error_registers;
        const uint64_t sector =
            (registers[6] & 15U) << 24 | uint32_t{registers[5]} << 16 | uint32_t{registers[4]} << 8 | registers[3];
        log.last.push_back({.number = log.count - i,
                            .hours = Word(registers + 28),
                            .error = ErrorText(registers[1]),
                            .sector = sector,
                            .command = entry[failed_command]});
    }
    return log;
}

std::optional<uint64_t> RawOf(const std::vector<SmartAttribute> &attributes, int id)
{
    for (const SmartAttribute &attribute : attributes)
        if (attribute.id == id)
            return attribute.raw;
    return std::nullopt;
}

Verdict Judge(const std::vector<SmartAttribute> &attributes, const SelfTest &test)
{
    for (const SmartAttribute &attribute : attributes)
        if (attribute.Fails()) {
            const std::string name = SmartName(attribute.id);
            return {"failing", (name.empty() ? "attribute " + std::to_string(attribute.id) : name) +
                                   " has reached the threshold of the drive"};
        }
    if (test.failed)
        return {"failing", "its self-test " + test.result};
    constexpr struct {
        int id;
        const char *text;
    } counts[] = {
        {197, " sectors cannot be read at present"},
        {198, " sectors could not be read"},
        {5, " sectors were replaced by spare ones"},
    };
    // The upper bytes are makers' own.
    constexpr uint64_t count_of = 0xFFFFFFFF;
    for (const auto &[id, text] : counts)
        if (const uint64_t count = RawOf(attributes, id).value_or(0) & count_of; count > 0)
            return {"worn", std::to_string(count) + text};
    return {"good", ""};
}

const char *SmartName(int id)
{
    for (const Name &known : names)
        if (known.id == id)
            return known.name;
    return "";
}

std::optional<NvmeHealth> ParseNvmeHealth(const unsigned char (&page)[512])
{
    constexpr int zero_celsius = 273;
    constexpr struct {
        int bit;
        const char *text;
    } warnings[] = {
        {0x01, "its spare blocks run out"},
        {0x02, "it is too hot or too cold"},
        {0x04, "it is no longer reliable"},
        {0x08, "it can only be read"},
        {0x10, "its cache is not saved when the power fails"},
    };
    const int kelvin = page[1] | page[2] << 8;
    if (kelvin == 0)
        return std::nullopt;
    for (const auto &[bit, text] : warnings)
        if (page[0] & bit)
            return NvmeHealth{kelvin - zero_celsius, std::string("failing: ") + text};
    return NvmeHealth{kelvin - zero_celsius, "good"};
}

}  // namespace tavoctl

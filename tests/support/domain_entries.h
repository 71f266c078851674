// A user and a group of a domain, as the domain's client puts them into the stores.
#ifndef TAVO_TESTS_DOMAIN_ENTRIES_H
#define TAVO_TESTS_DOMAIN_ENTRIES_H

#include "tavo_bdb.h"
#include "tavo_group.h"
#include "tavo_user.h"

#include "support/test.h"

#include <ctime>

namespace test {

inline void PutEntry(const char *store, std::string key, std::string value)
{
    TAVOBDB *db = TAVOBDbOpen(store, O_RDWR, 1);
    ASSERT_TRUE(db) << store;
    EXPECT_EQ(TAVOBDbSet(db, key.c_str(), static_cast<int>(key.size()) + 1, value.c_str(),
                         static_cast<int>(value.size()) + 1),
              0);
    EXPECT_EQ(TAVOBDbClose(db), 0);
}

// DOM\eva and her group DOM\crew, refreshed so many seconds ago.
inline void PutDomainEntries(int age)
{
    ASSERT_GE(TAVOUserTotalNum(TAVO_USER_LOCAL), 0);
    ASSERT_GE(TAVOGroupTotalNum(TAVO_GROUP_LOCAL), 0);
    PutEntry(TAVO_USER_DB_NAME, "DOM\\EVA", "DOM\\eva:x:70001:70000:Eva:/home/eva:/bin/sh");
    PutEntry(TAVO_USER_DB_UID, "070001", "DOM\\EVA");
    PutEntry(TAVO_GROUP_DB_NAME, "DOM\\CREW", "DOM\\crew:x:70000:DOM\\eva");
    for (const char *store : {TAVO_USER_DB_NAME, TAVO_GROUP_DB_NAME}) {
        TAVOBDB *db = TAVOBDbOpen(store, O_RDWR, 1);
        ASSERT_TRUE(db);
        const int32_t time = static_cast<int32_t>(std::time(nullptr)) - age;
        EXPECT_EQ(TAVOBDbSet(db, TAVO_BDB_KEY_EXPIRE, TAVO_BDB_KEY_EXPIRE_LEN, &time, sizeof time), 0);
        EXPECT_EQ(TAVOBDbClose(db), 0);
    }
}

}  // namespace test

#endif

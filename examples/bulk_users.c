/* Adds many users in one batch. Each line of standard input is NAME:PASSWORD:DESCRIPTION.
 * One batch locks, rewrites and syncs the account files once, however many users are in it. */
#include <tavosdk.h>

#include <stdio.h>
#include <string.h>

#define MOST 1000

int main(void)
{
    static TAVOUSER *users[MOST];
    static const char *no_old_names[MOST]; /* NULL: a new account */
    char line[1024];
    int count = 0, missing = 0, i;

    while (count < MOST && fgets(line, sizeof line, stdin)) {
        char *cursor = line;
        const char *name, *password, *description;

        line[strcspn(line, "\n")] = '\0';
        name = TLIBStrSep(&cursor, ":");
        password = TLIBStrSep(&cursor, ":");
        description = cursor;
        /* -1: choose a user id, take the default group. A negative day: the account never expires. */
        if (TAVOUserAlloc(&users[count], name, password, -1, -1, description, "", "", -1, 0, "", 0) == 0)
            count++;
        else
            fprintf(stderr, "skipped: \"%s\"\n", name);
    }
    if (TAVOUserSet(no_old_names, (const TAVOUSER *const *)users, count) != 0) {
        fprintf(stderr, "nothing was added: 0x%04X\n", (unsigned)TLIBErrGet());
        return 1;
    }
    /* A batch skips the entries that it refuses, so look at what is there now. */
    for (i = 0; i < count; i++) {
        TAVOUSER *stored = NULL;

        if (TAVOUserGet(users[i]->szName, &stored) == 0) {
            printf("%s has the user id %d\n", stored->szName, stored->nUid);
        } else {
            fprintf(stderr, "refused: %s (the system log says why)\n", users[i]->szName);
            missing++;
        }
        TAVOUserFree(stored);
        TAVOUserFree(users[i]);
    }
    return missing != 0;
}

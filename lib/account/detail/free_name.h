// Gets whatever stands at a name below /tmp out of the way.
#ifndef TAVO_ACCOUNT_DETAIL_FREE_NAME_H
#define TAVO_ACCOUNT_DETAIL_FREE_NAME_H

namespace tavo {

// In one step, however large the thing is: a file, a link or an empty directory is removed, any other directory is renamed
// to "PATH.aside.XXXXXX" and stays there until the machine starts again. Everybody can put a tree of a million
// folders there, and nobody may wait for the library to walk through it. True when the name was free or is now.
bool FreeName(const char *path) noexcept;

}  // namespace tavo

#endif

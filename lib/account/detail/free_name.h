// Removes or renames the object at a name below /tmp.
#ifndef TAVO_ACCOUNT_DETAIL_FREE_NAME_H
#define TAVO_ACCOUNT_DETAIL_FREE_NAME_H

namespace tavo {

// Takes one step, however large the object is: a file, a link or an empty directory is removed, any other directory is
// renamed to "PATH.aside.XXXXXX" and stays there until the machine starts again. Every user can create a tree of a
// million folders there, and walking through it would block all callers. Returns true when the name was free or is now.
bool FreeName(const char *path) noexcept;

}  // namespace tavo

#endif

// From bay to volume in one tree.
#ifndef TAVOCTL_STORAGE_TREE_H
#define TAVOCTL_STORAGE_TREE_H

#include "frame/table.h"

#include <vector>

namespace tavoctl {

// Wakes no disk.
Table StorageTree();
std::vector<ColumnFacts> StorageColumns();

}  // namespace tavoctl

#endif

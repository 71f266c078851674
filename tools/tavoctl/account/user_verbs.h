// The verbs of the user family, by the file that they are in.
#ifndef TAVOCTL_USER_VERBS_H
#define TAVOCTL_USER_VERBS_H

namespace tavoctl {

class Family;

void AddUserChanges(Family &user);
void AddUserImport(Family &user);
void AddUserExport(Family &user);
void AddUserCheck(Family &user);

}  // namespace tavoctl

#endif

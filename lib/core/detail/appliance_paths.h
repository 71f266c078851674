// Files of the appliance that several families read.
#ifndef TAVO_CORE_DETAIL_APPLIANCE_PATHS_H
#define TAVO_CORE_DETAIL_APPLIANCE_PATHS_H

namespace tavo {

inline constexpr char kSettings[] = "/etc/tavoinfo.conf";                  // the administrator's switches
inline constexpr char kFactorySettings[] = "/etc.defaults/tavoinfo.conf";  // the model's capabilities
inline constexpr char kShareFile[] = "/usr/tavo/etc/share.conf";           // shared folders, a section each
inline constexpr char kSambaFile[] = "/usr/tavo/etc/smb.conf";             // Samba's settings

}  // namespace tavo

#endif

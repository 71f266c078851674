"""The network: interfaces, addresses, name servers, routes."""
from __future__ import annotations

import dataclasses

from ._core import c_names, call, ffi, lib, text, text_of, to_c, wraps
from .lists import StringList, taken

__getattr__, __dir__ = c_names("net", globals())


@dataclasses.dataclass
class Card:
    interface: str
    dhcp: bool
    address: str
    mask: str
    gateway: str
    mac: str
    mtu: int
    link: bool   #: the cable has something at its other end


@wraps("TAVONetGetCard1")
def first_card() -> Card:
    """The first wired interface."""
    record = ffi.new("TAVONETCARD *")
    call("TAVONetGetCard1", record)
    return Card(text(record.szInterface), record.nMode == lib.TAVO_NET_DHCP, text(record.szIp), text(record.szMask),
                text(record.szGateway), text(record.szMac), record.nMtu, bool(record.fLink))


@wraps("TAVONetDNSGet")
def name_servers() -> list[str]:
    return taken("TAVONetDNSGet")


@wraps("TAVONetDNSSet")
def set_name_servers(addresses: list[str]) -> None:
    with StringList(addresses) as given:
        call("TAVONetDNSSet", given.pointer)


@wraps("TAVOLnxGetHostname")
def host_name() -> str:
    return text_of("TAVOLnxGetHostname")


@wraps("TAVOLnxSetHostname")
def set_host_name(name: str) -> None:
    call("TAVOLnxSetHostname", name)


@wraps("TAVONetDefaultGatewayGet")
def gateway() -> str:
    return text_of("TAVONetDefaultGatewayGet")


@wraps("TAVONetLinkAggrEnum")
def bonds() -> list[str]:
    return taken("TAVONetLinkAggrEnum")


@wraps("ErrTLIBIpMaskToSubnet")
def subnet(address: str, mask: str) -> str:
    """"192.168.1.7" and "255.255.255.0" are in "192.168.1.0/24"."""
    return _converted("ErrTLIBIpMaskToSubnet", f"{address}/{mask}")


@wraps("ErrTLIBSubnetToIpMask")
def mask(subnet: str) -> str:
    """"10.1.2.3/8" becomes "10.0.0.0/255.0.0.0"."""
    return _converted("ErrTLIBSubnetToIpMask", subnet)


def _converted(function: str, value: str) -> str:
    given, out = ffi.new("char[]", to_c(value)), ffi.new("char[64]")
    call(function, given, out)
    return text(out)


@wraps("BlTLIBIsIpAddr")
def is_address(value: str) -> bool:
    """Whether a host can have this IPv4 address."""
    return bool(lib.BlTLIBIsIpAddr(to_c(value)))


@wraps("BlTLIBIsHostname")
def is_host_name(value: str) -> bool:
    return bool(lib.BlTLIBIsHostname(to_c(value)))


@wraps("BlTLIBIsMailbox")
def is_mailbox(value: str) -> bool:
    return bool(lib.BlTLIBIsMailbox(to_c(value)))

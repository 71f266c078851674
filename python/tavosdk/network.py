"""The network: interfaces, addresses, name servers, routes."""
from __future__ import annotations

import dataclasses
from typing import Any

from ._core import ask, c_names, call, ffi, lib, text, text_of, to_c, wraps
from .lists import StringList, taken

__getattr__, __dir__ = c_names("net", globals())


@dataclasses.dataclass
class Card:
    interface: str
    dhcp: bool = True
    address: str = ""
    mask: str = ""
    gateway: str = ""
    mac: str = ""
    mtu: int = 0
    link: bool = False   #: the cable has something at its other end


def _read(function: str, *before: str) -> Any:
    record = ffi.new("TAVONETCARD *")
    call(function, *before, record)
    return record


def _from_c(record: Any) -> Card:
    return Card(text(record.szInterface), record.nMode == lib.TAVO_NET_DHCP, text(record.szIp), text(record.szMask),
                text(record.szGateway), text(record.szMac), record.nMtu, bool(record.fLink))


@wraps("TAVONetGetCard1")
def first_card() -> Card:
    """The first wired interface."""
    return _from_c(_read("TAVONetGetCard1"))


@wraps("TAVONetGetCard")
def card(interface: str) -> Card:
    return _from_c(_read("TAVONetGetCard", interface))


@wraps("TAVONetSetCard1")
def set_card(wanted: Card) -> Card:
    """Sets the address of an interface, by DHCP or a static one, and returns the interface as it is afterwards. `set_mtu`
    sets the size of its packets."""
    previous = _read("TAVONetGetCard", wanted.interface)
    record = ffi.new("TAVONETCARD *", previous[0])
    record.nMode = lib.TAVO_NET_DHCP if wanted.dhcp else lib.TAVO_NET_STATIC
    addresses = wanted.address, wanted.mask, wanted.gateway
    record.szIp, record.szMask, record.szGateway = (_short(address) for address in addresses)
    call("TAVONetSetCard1", record, previous)
    return card(wanted.interface)


def _short(address: str) -> bytes:
    value: bytes = to_c(address)
    if len(value) >= 20:
        raise ValueError(f"not an address: {address}")
    return value


@wraps("TAVONetSetMTUValue")
def set_mtu(interface: str, size: int) -> None:
    """Sets the size of the interface's packets, 68 to 65535 bytes, now and for the next start."""
    call("TAVONetSetMTUValue", interface, size)


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
    return bool(ask("BlTLIBIsIpAddr", value))


@wraps("BlTLIBIsHostname")
def is_host_name(value: str) -> bool:
    return bool(ask("BlTLIBIsHostname", value))


@wraps("BlTLIBIsMailbox")
def is_mailbox(value: str) -> bool:
    return bool(ask("BlTLIBIsMailbox", value))

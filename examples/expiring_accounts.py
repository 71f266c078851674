#!/usr/bin/python3
"""Lists the accounts that expire within so many days, and those that have expired: expiring_accounts.py [DAYS]"""
import datetime
import sys

from tavosdk import users


def main(days: str = "30") -> int:
    today = datetime.date.today()
    last = today + datetime.timedelta(int(days))
    # The first days of 1970 mean an account that is switched off, as the guest's often is.
    off = datetime.date(1970, 1, 3)
    found = sorted((user.expires, user.name) for user in users.all()
                   if user.expires and off <= user.expires <= last)
    for expires, name in found:
        print(f"{name}: {'expired' if expires < today else 'expires'} {expires}")
    return 1 if found else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))

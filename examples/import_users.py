#!/usr/bin/python3
"""Makes accounts and groups from a table: import_users.py FILE

The table is CSV with the columns name, password, description and groups (separated by blanks). Accounts that exist are
brought up to date and keep their passwords.
"""
import csv
import sys

from tavosdk import Error, groups, users


def import_row(row: dict[str, str]) -> str:
    name = row["name"]
    if users.exists(name):
        user = users.get(name)
        user.description = row["description"]
        users.change(name, user)
        done = "updated"
    else:
        users.add(users.User(name, description=row["description"]), row["password"])
        done = "added"
    for group_name in row["groups"].split():
        group = groups.get(group_name) if groups.exists(group_name) else groups.Group(group_name)
        if name not in group.members:
            group.members.append(name)
            groups.set(group, group_name if group.gid >= 0 else None)
    return done


def main(path: str) -> int:
    failed = 0
    with open(path, newline="", encoding="utf-8") as table:
        for row in csv.DictReader(table):
            try:
                print(f"{row['name']}: {import_row(row)}")
            except Error as error:
                failed += 1
                print(f"{row['name']}: {error}", file=sys.stderr)
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]) if len(sys.argv) == 2 else __doc__)

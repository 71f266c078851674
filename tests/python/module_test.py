"""The Python module against a real library in an appliance root: names, failures, accounts, settings, memory."""
import datetime
import gc
import inspect
import os
import pathlib
import re
import subprocess
import sys
import threading
import unittest

import tavosdk
from tavosdk import _core, _reference

tree = pathlib.Path(__file__).resolve().parents[2]
FAMILIES = {"appliance": "appliance", "bdb": "stores", "disk": "disks", "error": "errors", "fhost": "discovery",
            "file": "settings", "group": "groups", "hash": "hashes", "list": "lists", "lock": "locks", "lvm": "volumes",
            "net": "network", "partition": "partitions", "proc": "processes", "quota": "quotas", "raid": "arrays",
            "section": "sections", "service": "services", "str": "text", "user": "users"}


class Names(unittest.TestCase):
    def test_every_exported_name_is_in_the_module_of_its_family(self):
        script = re.sub(r"/\*.*?\*/", "", (tree / "lib/tavosdk.map").read_text(), flags=re.S)
        exported = set(re.findall(r"(\w+);", script.partition("global:")[2].partition("local:")[0]))
        self.assertEqual(set(_reference.NAMES), exported)
        for name in sorted(exported):
            family, kind, prototype, _ = _reference.NAMES[name]
            module = getattr(tavosdk, FAMILIES[family])
            thing = getattr(module, name)
            self.assertIn(name, dir(module))
            if kind == "function":
                self.assertIn(prototype, thing.__doc__)
        with self.assertRaises(AttributeError):
            tavosdk.users.TAVOGroupGet

    def test_wrappers_have_the_comments_of_the_header(self):
        self.assertIn("there is no such account", tavosdk.users.get.__doc__)
        self.assertEqual(inspect.signature(tavosdk.locks.hold).parameters["timeout"].default, 5)


class Failures(unittest.TestCase):
    def test_a_failure_has_its_code_and_place(self):
        with self.assertRaises(tavosdk.NotFoundError) as caught:
            tavosdk.users.get("nobody-of-this-name")
        error = caught.exception
        self.assertEqual((error.name, error.code), ("ERR_NO_SUCH_USER", 0x1D00))
        self.assertRegex(error.module, r"^\w+$")
        self.assertGreater(error.line, 0)
        self.assertEqual(tavosdk.errors.name_of(error.code), "ERR_NO_SUCH_USER")

    def test_each_thread_sees_its_own_failure(self):
        wrong = []

        def look(function, argument, expected):
            for _ in range(300):
                try:
                    function(argument)
                except tavosdk.Error as error:
                    if error.name != expected:
                        wrong.append(error.name)

        threads = [threading.Thread(target=look, args=(tavosdk.network.mask, "x/y", "ERR_INVALID_NETNAME")),
                   threading.Thread(target=look, args=(tavosdk.settings.lines, "/none", "ERR_OPEN_FAILED"))]
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join()
        self.assertEqual(wrong, [])

    def test_a_text_with_a_nul_is_not_cut(self):
        with self.assertRaises(ValueError):
            tavosdk.users.get("anna\0x")


class Accounts(unittest.TestCase):
    def setUp(self):
        if "anna" in tavosdk.users.names():
            tavosdk.users.delete("anna")

    def test_a_user_lives_and_dies(self):
        made = tavosdk.users.add(tavosdk.users.User("anna", description="Ännchen", mail="anna@example.com",
                                                    expires=datetime.date(2030, 1, 31)), "secret")
        self.assertGreaterEqual(made.uid, 1024)
        self.assertEqual((made.description, made.expires, made.expired),
                         ("Ännchen", datetime.date(2030, 1, 31), False))
        self.assertEqual(tavosdk.users.get("ANNA"), made)
        self.assertEqual(tavosdk.users.get_by_uid(made.uid), made)
        self.assertIn("anna", tavosdk.users.names(prefix="an"))
        self.assertIn("anna", tavosdk.users.names(containing="NN"))
        made.description = "Anna"
        changed = tavosdk.users.change("anna", made)
        self.assertEqual((changed.description, changed.hash), ("Anna", made.hash))
        tavosdk.users.delete("anna", "never-was")
        self.assertFalse(tavosdk.users.exists("anna"))

    def test_what_the_library_skips_is_raised(self):
        tavosdk.users.add(tavosdk.users.User("anna"), "secret")
        for user, name in ((tavosdk.users.User("anna"), "ERR_USER_EXISTS"),
                           (tavosdk.users.User("-x"), "ERR_INVALID_USERNAME")):
            with self.assertRaises(tavosdk.Error) as caught:
                tavosdk.users.add(user, "secret")
            self.assertEqual(caught.exception.name, name)
        with self.assertRaises(tavosdk.Error):
            tavosdk.users.delete("admin")

    def test_a_batch_adds_what_is_acceptable(self):
        for name in set(tavosdk.users.names()) & {"bert", "cleo"}:
            tavosdk.users.delete(name)
        user = tavosdk.users.User
        made = tavosdk.users.add(user("anna"), "secret")
        added = tavosdk.users.add_many((user(name), "secret") for name in ("bert", "-bad", "Anna", "cleo", "bert"))
        self.assertEqual([one.name for one in added], ["bert", "cleo"])
        self.assertEqual(tavosdk.users.get("anna"), made)
        self.assertEqual(tavosdk.users.add_many([]), [])
        tavosdk.users.delete("bert", "cleo")

    def test_a_locked_password_is_kept(self):
        made = tavosdk.users.add(tavosdk.users.User("anna"), "secret")
        tavosdk.users.lock("anna")
        self.assertEqual(tavosdk.users.get("anna").hash, "!" + made.hash)
        tavosdk.users.unlock("anna")
        self.assertEqual(tavosdk.users.get("anna"), made)
        tavosdk.users.set_password_age("anna", maximum=90)
        line = next(line for line in pathlib.Path("/etc/shadow").read_text().splitlines() if line.startswith("anna:"))
        self.assertEqual(line.split(":")[4], "90")
        with self.assertRaises(tavosdk.NotFoundError):
            tavosdk.users.lock("nobody-of-this-name")

    def test_groups(self):
        tavosdk.users.add(tavosdk.users.User("anna"), "secret")
        made = tavosdk.groups.set(tavosdk.groups.Group("team", members=["anna"], description="The team"))
        self.assertEqual((made.members, made.description), (["anna"], "The team"))
        self.assertEqual(tavosdk.groups.get_by_gid(made.gid), made)
        self.assertEqual(tavosdk.groups.members("team"), ["anna"])
        self.assertIn("team", tavosdk.groups.names())
        tavosdk.users.delete("anna")
        self.assertEqual(tavosdk.groups.get("team").members, [])
        tavosdk.groups.delete("team")
        with self.assertRaises(tavosdk.NotFoundError):
            tavosdk.groups.get("team")

    def test_stores_open_under_their_lock(self):
        tavosdk.users.names()
        with tavosdk.locks.hold("user", shared=True), tavosdk.stores.Store("/tmp/.db.user.name.1379") as store:
            keys = [key for key, _ in store.items()]
            self.assertIn(b"ADMIN\0", keys)
            self.assertTrue(store[b"ADMIN\0"].startswith(b"admin:"))
            with self.assertRaises(KeyError):
                store[b"NONE\0"]
        with self.assertRaises(ValueError):
            store[b"ADMIN\0"]


class Files(unittest.TestCase):
    def test_settings_are_a_map(self):
        path = "/tmp/settings.conf"
        pathlib.Path(path).write_text("# kept\na=1\nb=\"two\"\n")
        file = tavosdk.settings.File(path)
        self.assertEqual(dict(file), {"a": "1", "b": "two"})
        file["a"], file["c"] = "x" * 2000, "3"
        del file["b"]
        self.assertEqual(dict(file), {"a": "x" * 2000, "c": "3"})
        self.assertEqual(tavosdk.settings.lines(path)[0], "# kept")
        inode = os.stat(path).st_ino
        with self.assertRaises(tavosdk.Error):
            file.update({"a": "2", "bad": "line\nbreak"})  # all or nothing
        self.assertEqual((file["a"], os.stat(path).st_ino), ("x" * 2000, inode))
        file.update([("a", "2")], d="4")
        self.assertEqual(dict(file), {"a": "2", "c": "3", "d": "4"})
        for key in ("b", "none"):
            with self.assertRaises(KeyError):
                del file[key]
        self.assertEqual(tavosdk.settings.get(path, "none", "default"), "default")
        with self.assertRaises(tavosdk.Error):
            file["bad"] = "line\nbreak"

    def test_quoted_values_stay_quoted(self):
        path = pathlib.Path("/tmp/quoted.conf")
        path.write_text("# kept\n\nrunssh=\"no\"\n")
        file = tavosdk.settings.File(path)
        file["runssh"] = "yes"
        file.update(more="a b")
        self.assertEqual(path.read_text(), "# kept\n\nrunssh=\"yes\"\nmore=\"a b\"\n")
        new = pathlib.Path("/tmp/new.conf")
        tavosdk.settings.File(new)["a"] = "1"
        self.assertEqual(new.read_text(), "a=1\n")

    def test_sections(self):
        path = "/tmp/sections.conf"
        tavosdk.sections.add(path, "one", {"k": "v"})
        tavosdk.sections.add(path, "two", {"k": "w"})
        tavosdk.sections.set(path, "one", {"k": "x"}, new_name="uno")
        tavosdk.sections.remove(path, "two")
        self.assertEqual(tavosdk.sections.names(path), ["uno"])
        self.assertEqual(tavosdk.sections.get(path, "uno"), {"k": "x"})
        with self.assertRaises(tavosdk.NotFoundError):
            tavosdk.sections.remove(path, "two")

    def test_locks_exclude_other_processes_and_end_with_their_block(self):
        with tavosdk.locks.hold("tavoinfo", "user"):
            self.assertEqual(tavosdk.locks.held(), {"tavoinfo": 1, "user": 1})
            other = subprocess.run([sys.executable, "-c", "import tavosdk\n"
                                    "try:\n with tavosdk.locks.hold('user', timeout=0): print('held')\n"
                                    "except tavosdk.LockError: print('refused')"], capture_output=True, text=True)
            self.assertEqual(other.stdout, "refused\n", other.stderr)
        self.assertEqual(tavosdk.locks.held(), {})
        with self.assertRaises(ValueError):
            with tavosdk.locks.hold("usr"):
                pass

    def test_processes_and_services(self):
        self.assertEqual(tavosdk.processes.run("/bin/sh", "-c", "exit 7", timeout=5), 7)
        with self.assertRaises(tavosdk.Error) as caught:
            tavosdk.processes.run("/bin/sleep", "30", timeout=1)
        self.assertEqual(caught.exception.name, "ERR_TIMER_EXPIRED")
        telnet = tavosdk.services.get("telnet")
        self.assertFalse(telnet.on)
        telnet.enable()
        self.assertEqual(tavosdk.settings.get(tavosdk.settings.SYSTEM, telnet.key), "yes")
        telnet.disable()


class Memory(unittest.TestCase):
    def test_lists_and_maps_behave_as_those_of_python(self):
        with tavosdk.lists.StringList(["b", "a"]) as texts:
            texts.insert(0, "c")
            texts[-1] = "ä" * 1000
            del texts[1]
            self.assertEqual(list(texts), ["c", "ä" * 1000])
            self.assertEqual(texts[0:1], ["c"])
            with self.assertRaises(IndexError):
                texts[2]
        with tavosdk.hashes.StringHash({f"k{number}": "v" for number in range(100)}) as pairs:
            del pairs["k5"]
            self.assertEqual(len(pairs), 99)
            self.assertNotIn("k5", pairs)
            self.assertEqual(pairs["k6"], "v")
            pairs_of = iter(pairs)
        self.assertEqual(len(list(pairs_of)), 99)

    def test_objects_may_die_in_any_order_and_twice(self):
        texts, pairs = tavosdk.lists.StringList(["x"]), tavosdk.hashes.StringHash({"k": "v"})
        walk = iter(texts)
        for thing in (texts, pairs):
            thing.close()
            thing.close()
            self.assertEqual(len(thing), 0)
        self.assertEqual(list(walk), [])
        for change in (lambda: texts.append("y"), lambda: pairs.__setitem__("a", "b"), lambda: texts.sort()):
            with self.assertRaises(ValueError):
                change()
        half = tavosdk.lists.StringList.__new__(tavosdk.lists.StringList)
        half.close()
        del half, texts, pairs, walk
        gc.collect()

    # The sanitizers' allocator keeps what was freed for a while.
    @unittest.skipIf("TAVO_NO_MEMORY_TEST" in os.environ, "measured without the sanitizers")
    def test_nothing_grows(self):
        def work():
            tavosdk.users.get("admin")
            tavosdk.users.names()
            tavosdk.groups.get("users")
            tavosdk.network.mask("10.1.2.3/8")
            tavosdk.settings.read("/etc/tavoinfo.conf")
            with self.assertRaises(tavosdk.NotFoundError):
                tavosdk.users.get("none")

        def pages():
            return int(pathlib.Path("/proc/self/statm").read_text().split()[1])

        for _ in range(100):
            work()
        before = pages()
        for _ in range(300):
            work()
        gc.collect()
        self.assertLess(pages() - before, 100)


if __name__ == "__main__":
    unittest.main()

"""The families of the Python module against scripted tools and written files: conversions, records, what dies when."""
import contextlib
import os
import pathlib
import signal
import subprocess
import sys
import textwrap
import threading
import time
import unittest

import tavosdk


@contextlib.contextmanager
def scenario(*calls):
    """The tools answer so, as often as they are called: (output, command)."""
    subprocess.run(["scenario", "begin"], check=True)
    try:
        for output, *command in calls:
            pathlib.Path("/tmp/answer").write_text(output)
            subprocess.run(["scenario", "expect", "--stdout", "/tmp/answer", "--times", "any", "--", *command], check=True)
        yield
    finally:
        subprocess.run(["scenario", "reset"], check=True)


def python(program, **environment):
    return subprocess.run([sys.executable, "-W", "error", "-c", textwrap.dedent(program)], capture_output=True, text=True,
                          env=os.environ | environment)


class Conversions(unittest.TestCase):
    def test_text(self):
        self.assertEqual(tavosdk.text.decode_colon(tavosdk.text.encode_colon("a:b\\c")), "a:b\\c")
        self.assertNotIn(":", tavosdk.text.encode_colon("a:b" * 100))
        self.assertEqual(tavosdk.text.upper("straße ä" * 50), "STRASSE Ä" * 50 if tavosdk.text.upper("ß") == "SS"
                         else "STRAßE Ä" * 50)
        self.assertEqual([tavosdk.text.compare(*pair) for pair in (("ä", "Ä"), ("a", "b"), ("b", "A"))], [0, -1, 1])
        self.assertEqual(tavosdk.text.trim(" \t a b \n"), "a b")

    def test_addresses(self):
        self.assertEqual(tavosdk.network.subnet("192.168.1.7", "255.255.255.0"), "192.168.1.0/24")
        self.assertEqual(tavosdk.network.mask("10.1.2.3/8"), "10.0.0.0/255.0.0.0")
        for function, good, bad in ((tavosdk.network.is_address, "192.0.2.1", "192.0.2.300"),
                                    (tavosdk.network.is_host_name, "attic", "-attic"),
                                    (tavosdk.network.is_mailbox, "anna@example.com", "anna@"),
                                    (tavosdk.users.is_name, "anna", "-anna"), (tavosdk.groups.is_name, "team", "-team")):
            self.assertEqual((function(good), function(bad)), (True, False), function)

    def test_every_code_has_its_name(self):
        self.assertEqual(tavosdk.errors.CODES[0x1D00], "ERR_NO_SUCH_USER")
        self.assertEqual(tavosdk.errors.name_of(0x7FFFFF00), "")


class Records(unittest.TestCase):
    def test_disks_and_arrays_that_are_not_there(self):
        self.assertEqual((tavosdk.disks.all(), tavosdk.arrays.all()), ([], []))
        for look in (lambda: tavosdk.arrays.get("/dev/md77"), lambda: tavosdk.services.get("no-such-service"),
                     lambda: tavosdk.groups.get("no-such-group")):
            with self.assertRaises(tavosdk.NotFoundError):
                look()
        for path in ("/dev/sdc", "/etc/passwd"):
            with self.assertRaises(tavosdk.Error):
                tavosdk.disks.get(path)
        self.assertEqual(tavosdk.appliance.bays(), 6)
        self.assertEqual(tavosdk.appliance.expansion_units(), [])
        self.assertTrue(all(isinstance(name, str) and name for name in tavosdk.partitions.TYPES.values()))

    def test_physical_volumes(self):
        line = "  /dev/md{}|{}|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|1\n"
        with scenario((line.format(2, "vg1") + line.format(3, "vg2"), "/sbin/pvs", "...")):
            found = tavosdk.volumes.physical_volumes()
        self.assertEqual([(volume.path, volume.group) for volume in found],
                         [("/dev/md2", "/dev/vg1"), ("/dev/md3", "/dev/vg2")])
        self.assertEqual(found[0].uuid, "lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7")

    def test_services(self):
        services = {service.name: service for service in tavosdk.services.all()}
        self.assertIn("telnet", services)
        self.assertEqual(tavosdk.services.get("telnet"), services["telnet"])
        self.assertEqual(services["telnet"].key, "runtelnet")
        with self.assertRaises(AttributeError):  # records are values: a changed copy would change nothing
            services["telnet"].key = "runssh"

    def test_the_network_as_its_files_say(self):
        self.assertEqual(tavosdk.network.host_name(), "tavo")
        tavosdk.network.set_name_servers(["192.0.2.53", "2001:db8::53"])
        self.assertEqual(tavosdk.network.name_servers(), ["192.0.2.53", "2001:db8::53"])
        before = pathlib.Path("/etc/resolv.conf").read_text()
        with self.assertRaises(tavosdk.Error) as caught:
            tavosdk.network.set_name_servers(["192.0.2.53", "not an address"])
        self.assertEqual(caught.exception.name, "ERR_INVALID_NETNAME")
        self.assertEqual(pathlib.Path("/etc/resolv.conf").read_text(), before)
        self.assertEqual(tavosdk.network.bonds(), [])

    def test_interfaces_that_are_not_there(self):
        network = tavosdk.network
        for look in (lambda: network.card("eth77"), lambda: network.set_card(network.Card("eth77"))):
            with self.assertRaises(tavosdk.NotFoundError):
                look()

    def test_hosts_that_answered(self):
        list_file = pathlib.Path("/tmp/tavods.list")
        list_file.write_text("6,1,attic,192.0.2.7,eth0\nnonsense\n")
        try:
            hosts = tavosdk.discovery.collected()
        finally:
            list_file.unlink(missing_ok=True)
        self.assertLessEqual(len(hosts), 1)
        for name, address in hosts.items():
            self.assertEqual((name, address), ("attic(192.0.2.7)", "192.0.2.7"))

    def test_processes_and_their_files(self):
        with subprocess.Popen(["/bin/sleep", "60"]) as child:
            pid_file = pathlib.Path("/tmp/sleep.pid")
            pid_file.write_text(f"{child.pid}\n")
            self.assertTrue(tavosdk.processes.alive(child.pid))
            self.assertEqual(tavosdk.processes.pid_in(pid_file), child.pid)
            tavosdk.processes.signal(pid_file, signal.SIGTERM)
            self.assertEqual(child.wait(), -signal.SIGTERM)
        self.assertFalse(tavosdk.processes.alive(child.pid))
        pid_file.write_text("none\n")
        self.assertIsNone(tavosdk.processes.pid_in(pid_file))
        with self.assertRaises(tavosdk.Error):
            tavosdk.processes.signal("/tmp/no.pid", signal.SIGTERM)


class Accounts(unittest.TestCase):
    def setUp(self):
        for name in set(tavosdk.users.names()) & {"anna", "bert"}:
            tavosdk.users.delete(name)

    def test_a_new_name_keeps_what_belongs_to_the_account(self):
        made = tavosdk.users.add(tavosdk.users.User("anna"), "secret")
        tavosdk.groups.set(tavosdk.groups.Group("team", members=["anna"]))
        made.name = "bert"
        renamed = tavosdk.users.change("anna", made)
        self.assertEqual((renamed.uid, renamed.hash), (made.uid, made.hash))
        self.assertEqual(tavosdk.groups.get("team").members, ["bert"])
        group = tavosdk.groups.get("team")
        group.name = "crew"
        self.assertEqual(tavosdk.groups.set(group, old_name="team").gid, group.gid)
        self.assertFalse(tavosdk.groups.exists("team"))
        self.assertNotEqual(tavosdk.users.change("bert", renamed, password="other").hash, renamed.hash)
        tavosdk.groups.delete("crew")

    def test_what_the_library_refuses_leaves_the_files_as_they_are(self):
        files = [pathlib.Path(name) for name in ("/etc/passwd", "/etc/shadow", "/etc/group", "/etc/group_desc")]
        tavosdk.users.names(), tavosdk.groups.names()
        before = [file.read_bytes() for file in files]
        for change in (lambda: tavosdk.users.add(tavosdk.users.User("anna", mail="a:b"), "secret"),
                       lambda: tavosdk.users.change("nobody-of-this-name", tavosdk.users.User("anna"), "secret"),
                       lambda: tavosdk.groups.set(tavosdk.groups.Group("-team")),
                       lambda: tavosdk.users.add(tavosdk.users.User("anna\0x"), "secret"),
                       lambda: tavosdk.groups.delete("no-such-group")):
            with self.assertRaises((tavosdk.Error, ValueError)):
                change()
        self.assertEqual([file.read_bytes() for file in files], before)

    def test_a_walk_that_is_left_half_way(self):
        tavosdk.users.names()
        with tavosdk.locks.hold("user", shared=True):
            store = tavosdk.stores.Store("/tmp/.db.user.name.1379")
            walk = store.items()
            next(walk)
            store.close()
            store.close()
            with self.assertRaises(ValueError):
                next(walk)


class Lives(unittest.TestCase):
    def test_nothing_is_said_when_the_interpreter_ends(self):
        run = python("""
            import sys, tavosdk
            kept = tavosdk.lists.StringList(["a"]), tavosdk.hashes.StringHash({"k": "v"})
            ring = [tavosdk.lists.StringList(["b"])]
            ring.append(ring)
            sys.kept = kept
            held = tavosdk.locks.hold("tavoinfo")
            held.__enter__()
        """)
        self.assertEqual((run.returncode, run.stdout, run.stderr), (0, "", ""))

    def test_a_child_process_has_its_own_copies(self):
        texts = tavosdk.lists.StringList(["a"])
        child = os.fork()
        if child == 0:
            texts.append("b")
            texts.close()
            os._exit(0)
        self.assertEqual(os.waitpid(child, 0)[1], 0)
        self.assertEqual(list(texts), ["a"])

    def test_a_child_process_can_call_while_another_thread_is_in_the_library(self):
        thread = threading.Thread(target=tavosdk.processes.run, args=("/bin/sleep", "1"), kwargs={"timeout": 5})
        thread.start()
        time.sleep(0.2)
        child = os.fork()
        if child == 0:
            signal.alarm(10)  # a call that waits for the thread that the child does not have
            os._exit(0 if tavosdk.users.is_name("anna") else 1)
        self.assertEqual(os.waitpid(child, 0)[1], 0)
        thread.join()

    def test_a_list_may_be_closed_while_other_threads_read_it(self):
        run = python("""
            import sys, threading, tavosdk
            sys.setswitchinterval(1e-6)
            def read():
                try:
                    while True:
                        assert texts[7] == "7", "what was freed is read"
                except IndexError:
                    pass
            for _ in range(100):
                texts = tavosdk.lists.StringList(str(number) for number in range(20))
                threads = [threading.Thread(target=read) for _ in range(3)]
                for thread in threads:
                    thread.start()
                texts.append("more" * 1000)
                texts.close()
                for thread in threads:
                    thread.join()
        """, MALLOC_PERTURB_="165")
        self.assertEqual((run.returncode, run.stdout, run.stderr), (0, "", ""))

    def test_a_lock_ends_with_an_exception_in_its_block(self):
        with self.assertRaises(KeyError):
            with tavosdk.locks.hold("tavoinfo", shared=True):
                raise KeyError
        self.assertEqual(tavosdk.locks.held(), {})

    def test_a_list_that_cannot_be_filled_is_freed(self):
        with self.assertRaises(ValueError):
            tavosdk.lists.StringList(["good", "a\0b"])
        with self.assertRaises(TypeError):
            tavosdk.lists.StringList([1])


if __name__ == "__main__":
    unittest.main()

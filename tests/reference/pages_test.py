"""The pages that are made from the public headers: complete, silent under man's warnings, and without dead links."""
import dataclasses
import html.parser
import pathlib
import re
import subprocess
import sys
import tempfile
import unittest

tree = pathlib.Path(__file__).resolve().parents[2]
sys.path.insert(0, str(tree / "tools/reference"))
import headers  # noqa: E402
import html_pages  # noqa: E402
import man  # noqa: E402
import page as pages  # noqa: E402


class Reading(unittest.TestCase):
    def test_comments_keep_their_text_and_give_up_their_fixed_lines(self):
        comment = headers.read_comment("/* Does a thing.\n * Files: /etc/a (read), /etc/b (locked, written),\n"
                                       " *   /etc/c.\n * Locks: TAVO_LOCK_USER\n * Returns 0. */")
        self.assertEqual(comment.text, "Does a thing.\nReturns 0.")
        self.assertEqual(comment.fixed, {"Files": ["/etc/a (read)", "/etc/b (locked, written)", "/etc/c"],
                                         "Locks": ["TAVO_LOCK_USER"]})

    def test_declarations_belong_to_the_comment_above_their_group(self):
        names = headers.names()
        self.assertEqual(names["TAVOUserEnumBySubstr"].group,
                         ["TAVOUserEnum", "TAVOUserEnumByPrefix", "TAVOUserEnumBySubstr"])
        self.assertEqual(names["TLIBFileGetKeyValue"].parameters, ["szPath", "szKey", "szBuf", "cbBuf", "flags"])
        self.assertEqual(names["TLIBExec"].parameters, ["szProgram", "..."])
        self.assertEqual((names["rgslckList"].kind, names["rgslckList"].returns), ("datum", "TLIBLOCKFILE"))
        self.assertEqual(names["rgslckList"].section.text, "")
        self.assertIn("Each returns 1 when the text is valid", names["BlTLIBIsMailbox"].section.text)

    def test_records_come_with_the_remarks_on_their_fields(self):
        found = {record.name for record in headers.records_of(headers.names()["RAIDInfoEnum"])}
        self.assertEqual(found, {"RAIDLIST", "RAIDINFO", "RAIDMEMBER"})
        record = headers.records()["TAVOUSER"]
        self.assertIn("last valid day in days since 1970-01-01 UTC", record.code)
        self.assertTrue(record.comment.text.startswith("One user. A single block"))
        declared = {node.name for family in headers.families() for node in family.declarations
                    if type(node).__name__ == "Typedef"}
        self.assertEqual(set(headers.records()), declared)

    def test_every_exported_name_has_what_its_page_needs(self):
        names, known = headers.names(), headers.codes()
        self.assertEqual(set(names), headers.map_names())
        self.assertEqual([(entry.name, lack) for entry, page in pages.pages()
                          for lack in pages.wanting(entry, page, names, known)], [])

    def test_what_only_releases_or_only_looks_up_is_in_no_index(self):
        found = {entry.name: page for entry, page in pages.pages()}
        for name in ("RAIDInfoFree", "RAIDInfoDup", "DiskInfoEnumFree", "TAVOServiceNameGet"):
            self.assertEqual((found[name].files, found[name].runs, found[name].locks), ([], [], []), name)
        self.assertEqual(found["DiskInfoEnumFree"].errors, [])
        self.assertIn("/usr/tavo/etc/share.conf", found["TAVOServiceShareCreate"].files)

    def test_a_program_that_the_page_does_not_name_is_found(self):
        names, known = headers.names(), headers.codes()
        entry = dataclasses.replace(names["RCPartitionConfigs"])
        entry.comment = headers.Comment(entry.comment.text)
        self.assertIn('uses /sbin/sfdisk, which neither "Files:" nor "Runs:" names',
                      pages.wanting(entry, pages.page_of(entry, names, known), names, known))

    def test_a_name_without_its_contract_is_found(self):
        names, known = headers.names(), headers.codes()
        entry = names["TLIBStrTrimSpace"]
        for text, lack in (("", "has no comment"), ("Asks the disk for a certificate.", "does not say what it returns"),
                           ("Returns 0, or -1 with ERR_NO_SUCH_CODE.", "a code that does not exist"),
                           ("Returns what TAVOUserGot() returns.", "a function that does not exist")):
            changed = headers.Name(entry.name, entry.kind, entry.prototype, entry.returns, entry.parameters,
                                   headers.Comment(text), headers.Comment(""), 1, [entry.name],
                                   entry.family)
            found = pages.wanting(changed, pages.page_of(changed, names, known), names, known)
            self.assertTrue(any(lack in one for one in found), (text, found))


class ManualPages(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.folder = tempfile.TemporaryDirectory()
        cls.path = pathlib.Path(cls.folder.name)
        man.write(cls.path, "1.0")

    @classmethod
    def tearDownClass(cls):
        cls.folder.cleanup()

    def section(self, name, title):
        text = (self.path / f"{name}.3").read_text()
        return text.partition(f".SH {title}\n")[2].partition("\n.SH")[0]

    def test_there_is_one_for_each_name(self):
        self.assertEqual({file.stem for file in self.path.iterdir()}, headers.map_names())

    def test_man_has_no_warning(self):
        """All pages in one run of the formatter, with the warnings that man --warnings asks it for; one by man itself."""
        files = sorted(self.path.iterdir()) + sorted((tree / "docs/man").iterdir())
        run = subprocess.run(["groff", "-man", "-Tutf8", "-z", "-K", "utf8", "-wmac", "-wbreak", "-wdelim", "-wescape",
                              *files], capture_output=True, text=True)
        self.assertEqual((run.returncode, run.stderr), (0, ""))
        run = subprocess.run(["man", "--warnings", "-l", files[0]], capture_output=True, text=True)
        self.assertEqual((run.returncode, run.stderr), (0, ""))

    def test_whatis_reads_every_name(self):
        run = subprocess.run(["lexgrog", *sorted(self.path.iterdir()), *sorted((tree / "docs/man").iterdir())], capture_output=True, text=True)
        self.assertEqual(run.returncode, 0, run.stdout)
        self.assertEqual(len(re.findall(r': "[\w.-]+ - .+"', run.stdout)),
                         len(headers.names()) + len(list((tree / "docs/man").iterdir())))

    def test_the_page_of_the_settings_has_every_key_of_the_services(self):
        table = (tree / "lib/service/detail/service_table.cpp").read_text()
        keys = set(re.findall(r'"((?:run|support)\w+|netbkp|download_enabled|userHomeEnable)"', table))
        page = (tree / "docs/man/tavoinfo.conf.5").read_text()
        self.assertEqual({key for key in keys if not re.search(rf"\b{key}\b", page)}, set())
        self.assertGreater(len(keys), 20)

    def test_codes_are_sorted_from_all_places_that_name_them(self):
        errors = self.section("TAVOUserGet", "ERRORS")
        self.assertIn(".B ERR_NO_SUCH_USER\nthere is no such account", errors)       # its own table
        self.assertIn(".B ERR_LOCK_FAILED\na lock was not free", errors)             # that of its header
        self.assertIn(".B ERR_INVALID_NETNAME", self.section("BlTLIBIsIpAddr", "ERRORS"))  # that of its section
        self.assertIn("(/sys cannot be searched)"[1:-1], self.section("TAVOEBoxInfoEnum", "ERRORS"))  # in brackets
        self.assertIn(".B ERR_RENAME_FAILED\nthe new file could not take the old one",
                      self.section("TLIBFileSetKeyValue", "ERRORS"))                 # in a fixed line
        self.assertIn("TAVO_LOCK_SMB", self.section("TAVONetService", "LOCKS"))
        self.assertIn("/usr/tavo/etc/rc.d", self.section("TAVONetService", "PROGRAMS"))
        self.assertNotIn("ERR_NO_SUCH_USER", self.section("TAVOUserGet", "RETURN VALUE"))
        self.assertIn("/etc/shadow", self.section("TAVOUserSet", "FILES"))
        self.assertIn("char *szMail;             /* mail address */", self.section("TAVOUserGet", "TYPES"))


class HtmlPages(unittest.TestCase):
    def test_every_link_leads_somewhere(self):
        class Reader(html.parser.HTMLParser):
            def __init__(self):
                super().__init__()
                self.links, self.places, self.twice = [], set(), set()

            def handle_starttag(self, tag, attributes):
                attributes = dict(attributes)
                if tag in ("a", "link"):
                    self.links.append(attributes["href"])
                if "id" in attributes:
                    self.twice |= {attributes["id"]} & self.places
                    self.places.add(attributes["id"])

        with tempfile.TemporaryDirectory() as folder:
            folder = pathlib.Path(folder)
            html_pages.write(folder, "1.0")
            read = {}
            for file in folder.glob("*.html"):
                read[file.name] = Reader()
                read[file.name].feed(file.read_text())
            dead = [(name, link) for name, reader in read.items() for link in reader.links
                    for target, _, place in [link.partition("#")]
                    if not (folder / target).exists() or place and place not in read[target].places]
            self.assertEqual(dead, [])
            self.assertEqual({name: reader.twice for name, reader in read.items() if reader.twice}, {})
            self.assertEqual({place for reader in read.values() for place in reader.places} & headers.map_names(),
                             headers.map_names())


if __name__ == "__main__":
    unittest.main()

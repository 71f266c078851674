"""The tests of the module once more under the sanitizers' allocator: memory that the library returns is freed.

Python itself keeps memory until it ends, so only blocks that libtavosdk asked for count.
"""
import glob
import os
import pathlib
import re
import subprocess
import sys
import unittest

here = pathlib.Path(__file__).resolve().parent
libraries = [found[0] for found in (glob.glob(f"/usr/lib/x86_64-linux-gnu/{name}")
                                    for name in ("libasan.so.*", "libcrypt.so.1")) if found]


def leaks(*arguments):
    """How many leaked blocks have a frame of the library, and what the program printed."""
    run = subprocess.run(
        [sys.executable, *arguments], capture_output=True, text=True,
        env=dict(os.environ, LD_PRELOAD=" ".join(libraries), PYTHONMALLOC="malloc", TAVO_NO_MEMORY_TEST="1",
                 ASAN_OPTIONS="detect_leaks=1:exitcode=0:symbolize=0:fast_unwind_on_malloc=0:malloc_context_size=12"))
    blocks = re.split(r"\n\s*\n", run.stderr)
    return [block for block in blocks if " leak of " in block and "libtavosdk" in block], run


@unittest.skipUnless(len(libraries) == 2, "the root has no sanitizer")
class Leaks(unittest.TestCase):
    def test_a_forgotten_list_is_found(self):
        found, run = leaks("-c", "import tavosdk\ntavosdk.lists.PslTLIBSzListAlloc(4096)")
        self.assertEqual(len(found), 1, run.stderr)

    def test_the_modules_free_what_they_were_given(self):
        for program, *cases in (("module_test.py", "Accounts", "Files", "Memory",
                                 "Failures.test_a_failure_has_its_code_and_place"),
                                ("families_test.py", "Conversions", "Records", "Accounts",
                                 "Lives.test_a_child_process_has_its_own_copies",
                                 "Lives.test_a_list_that_cannot_be_filled_is_freed")):
            with self.subTest(program):
                found, run = leaks(str(here / program), *cases)
                self.assertEqual(run.returncode, 0, run.stderr[:3000])
                self.assertIn("LeakSanitizer", run.stderr)
                self.assertEqual(found, [])


if __name__ == "__main__":
    unittest.main()

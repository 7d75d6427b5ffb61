#!/usr/bin/python3
"""Shows that the architecture check finds each kind of violation, in a small tree of its own."""

import pathlib
import subprocess
import sys
import tempfile
import unittest

sys.dont_write_bytecode = True
sys.path.insert(0, str(pathlib.Path(__file__).resolve().parent))

import architecture  # noqa: E402

FILE_MAP = architecture.SOURCE / "scripts" / "file-map"
PAGE = """# Architecture

Lower first:

| floor | files |
|---|---|

## File map

All files.

## End
"""
FILES = {
    "src/Log/Log.h": "// The log. It rotates.\n",
    "src/Log/Log.cpp": '#include "Log/Log.h"\n#include <dlog.h>\n',
    "src/App/App.cpp": '// Start\n// and end.\n#include "Log/Log.h"\n#include "WApp.h"\n',
    "platform/dlog/dlog.h": "// The platform's log.\n",
    "platform/app/WApp.h": "// The frame.\n",
    "platform/app/Pump.h": "// Turns the loop.\n",
    "platform/app/Pump.cpp": '#include "Pump.h"\n',
    "service/server/main.cpp": "// The server.\n#include <boost/asio.hpp>\n",
    "companions/viewer/main.cpp": "// The viewer.\n#include <dlog.h>\n",
}


class Architecture(unittest.TestCase):
    def setUp(self):
        self.folder = tempfile.TemporaryDirectory()
        self.addCleanup(self.folder.cleanup)
        self.root = pathlib.Path(self.folder.name)
        for name, text in FILES.items():
            self.write(name, text)
        self.write("docs/architecture.md", PAGE)
        self.update_map()

    def write(self, name, text):
        path = self.root / name
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_text(text, encoding="utf-8")

    def append(self, name, text):
        self.write(name, (self.root / name).read_text(encoding="utf-8") + text)

    def page(self):
        return (self.root / "docs/architecture.md").read_text(encoding="utf-8")

    def update_map(self):
        subprocess.run([FILE_MAP, "--root", self.root], check=True)

    def assert_found(self, *expected):
        self.assertEqual(architecture.violations(self.root), list(expected))

    def test_a_tree_in_order_has_no_violation(self):
        self.assert_found()
        check = pathlib.Path(architecture.__file__)
        self.assertEqual(subprocess.run([check, "--root", self.root], check=False,
                                        stdout=subprocess.DEVNULL).returncode, 0)

    def test_a_violation_fails_the_program(self):
        self.append("src/Log/Log.cpp", "#include <boost/asio.hpp>\n")
        check = pathlib.Path(architecture.__file__)
        run = subprocess.run([check, "--root", self.root], check=False, stdout=subprocess.PIPE)
        self.assertEqual(run.returncode, 1)
        self.assertIn(b"src/Log/Log.cpp includes boost/asio.hpp", run.stdout)

    def test_a_file_missing_from_the_map(self):
        self.write("service/server/New.cpp", "// New.\n")
        self.assert_found("service/server/New.cpp is missing from the file map "
                          "(scripts/file-map adds it)")

    def test_a_file_that_is_gone(self):
        (self.root / "platform/app/Pump.cpp").unlink()
        self.assert_found("the file map names platform/app/Pump.cpp, which is gone "
                          "(scripts/file-map takes it out)")

    def test_a_page_without_map(self):
        self.write("docs/architecture.md", "# Architecture\n")
        self.assert_found("docs/architecture.md has no section “## File map”")

    def test_the_application_includes_an_inner_header_of_the_platform(self):
        self.append("src/App/App.cpp", '#include "Pump.h"\n')
        self.assert_found("src/App/App.cpp includes Pump.h: it is no public header of platform/")

    def test_the_platform_includes_the_application(self):
        self.append("platform/app/Pump.cpp", '#include "Log/Log.h"\n')
        self.assert_found("platform/app/Pump.cpp includes Log/Log.h: platform/ never includes src/")

    def test_the_platform_includes_a_service(self):
        self.write("service/client/client.h", "// The client.\n")
        self.append("platform/app/Pump.cpp", '#include "client.h"\n')
        self.update_map()
        self.assert_found("platform/app/Pump.cpp includes client.h: "
                          "platform/ never includes service/")

    def test_a_service_includes_the_application_by_a_relative_path(self):
        self.append("service/server/main.cpp", '#include "../../src/Log/Log.h"\n')
        self.assert_found("service/server/main.cpp includes ../../src/Log/Log.h: "
                          "service/ never includes src/")

    def test_a_companion_includes_an_inner_header(self):
        self.append("companions/viewer/main.cpp", '#include "Pump.h"\n#include "Log/Log.h"\n')
        self.assert_found(
            "companions/viewer/main.cpp includes Pump.h: it is no public header of platform/",
            "companions/viewer/main.cpp includes Log/Log.h: companions/ use only public headers of "
            "platform/ and service/")

    def test_a_file_of_the_application_on_no_floor(self):
        self.write("src/App/New.cpp", "// New.\n")
        self.assertIn("src/App/New stands on no floor (scripts/file-map adds it)",
                      architecture.violations(self.root))

    def test_a_floor_includes_a_higher_one(self):
        self.write("src/App/App.h", "// The application.\n")
        self.write("src/App/App.cpp", '#include "App/App.h"\n')
        self.append("src/Log/Log.cpp", '#include "App/App.h"\n')
        self.update_map()
        self.assert_found("src/Log/Log (floor 1) includes src/App/App (floor 2); "
                          "a file includes only lower floors")

    def test_a_circle(self):
        self.write("platform/app/Other.h", '// Other.\n#include "Pump.h"\n')
        self.append("platform/app/Pump.h", '#include "Other.h"\n')
        self.update_map()
        self.assert_found("includes form a circle: platform/app/Other.h -> platform/app/Pump.h -> "
                          "platform/app/Other.h")

    def test_libraries_outside_their_files(self):
        self.append("platform/app/Pump.cpp", "#include <curl/curl.h>\n#include <sqlite3.h>\n"
                                             "#include <boost/asio.hpp>\n")
        self.append("src/Log/Log.cpp", "#include <SQLiteCpp/Database.h>\n")
        self.assert_found(
            "platform/app/Pump.cpp includes curl/curl.h: transfers go through CurlTransfer, CurlPost or Wire",
            "platform/app/Pump.cpp includes sqlite3.h: only the files that own a table know SQLite",
            "platform/app/Pump.cpp includes boost/asio.hpp: Boost is for the share server",
            "src/Log/Log.cpp includes SQLiteCpp/Database.h: the application uses SQLite's own "
            "interface")

    def test_the_map_keeps_descriptions_and_takes_first_sentences(self):
        self.assertIn("- `src/Log/Log.h` The log\n", self.page())
        self.assertIn("- `src/Log/Log.cpp` Implements `Log.h`\n", self.page())
        self.assertIn("- `src/App/App.cpp` Start and end\n", self.page())
        self.assertIn("|---|---|\n| 1 | `Log/Log` |\n| 2 | `App/App` |\n\n", self.page())
        self.write("docs/architecture.md", self.page().replace("` The log\n", "` My own words\n"))
        (self.root / "platform/app/Pump.cpp").unlink()
        self.update_map()
        self.assertIn("- `src/Log/Log.h` My own words\n", self.page())
        self.assertNotIn("Pump.cpp", self.page())
        self.assertTrue(self.page().startswith(PAGE[:PAGE.index("|---|")]))
        self.assertTrue(self.page().endswith("\n## End\n"))
        before = self.page()
        self.update_map()
        self.assertEqual(self.page(), before)


    def test_a_file_that_says_nothing_stays_out_of_the_map(self):
        self.write("platform/app/Silent.cpp", "int silent;\n")
        run = subprocess.run([FILE_MAP, "--root", self.root], check=True, stderr=subprocess.PIPE)
        self.assertIn(b"platform/app/Silent.cpp has no leading comment", run.stderr)
        self.assert_found("platform/app/Silent.cpp is missing from the file map "
                          "(scripts/file-map adds it)")


if __name__ == "__main__":
    unittest.main()

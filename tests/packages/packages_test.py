"""The package descriptions in debian/ fit what is built: packages_test.py BUILD-TREE VERSION."""

import fnmatch
import glob
import os
import re
import subprocess
import sys
import tempfile
import unittest

SOURCE = os.path.normpath(os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", ".."))
DEBIAN = os.path.join(SOURCE, "debian")
BUILD = VERSION = ""
INSTALLED = re.compile(r'file\(INSTALL DESTINATION "([^"]+)" TYPE (\w+)[^")]*((?:"[^"]+"\s*)+)')


def read(*path):
    with open(os.path.join(*path), encoding="utf-8") as file:
        return file.read()


def installed_files():
    """What CMake installs, as paths below the root of a system whose prefix is /usr."""
    for script in glob.glob(f"{BUILD}/**/cmake_install.cmake", recursive=True):
        for to, kind, names in INSTALLED.findall(read(script)):
            folder = to.replace("${CMAKE_INSTALL_PREFIX}", "/usr").strip("/")
            for name in re.findall(r'"([^"]+)"', names):
                if kind == "DIRECTORY":
                    yield from files_below(name, folder)
                else:
                    yield f"{folder}/{os.path.basename(name)}"


def files_below(source, folder):
    """A trailing slash means the folder's content, else the folder itself goes there."""
    if not source.endswith("/"):
        folder = f"{folder}/{os.path.basename(source)}"
    for inside, _, names in os.walk(source):
        below = os.path.relpath(inside, source)
        yield from (os.path.normpath(f"{folder}/{below}/{name}") for name in names if name != ".made")


def install_lines():
    """{path or pattern: the lists that name it}, without what comes from debian/ itself."""
    lines = {}
    for path in [*glob.glob(f"{DEBIAN}/*.install"), f"{DEBIAN}/not-installed"]:
        for line in read(path).splitlines():
            words = line.split("#")[0].split()
            if words and not words[0].startswith("debian/"):
                lines.setdefault(words[0], []).append(os.path.basename(path))
    return lines


def takes(pattern, path):
    """Packages have a folder per architecture for modules, a build tree has not."""
    pattern = pattern.replace("/lib/*/", "/lib/")
    return fnmatch.fnmatchcase(path, pattern) or path.startswith(pattern + "/")


class Packages(unittest.TestCase):
    def test_their_version_is_the_projects(self):
        self.assertEqual(re.match(r"pelliko \(([^)]+)\)", read(DEBIAN, "changelog")).group(1), VERSION)

    def test_every_installed_file_is_in_exactly_one_of_them(self):
        lines = install_lines()
        used = set()
        for path in installed_files():
            patterns = [pattern for pattern in lines if takes(pattern, path)]
            used.update(patterns)
            self.assertEqual(sum(len(lines[pattern]) for pattern in patterns), 1, f"{path} is named by {patterns}")
        self.assertEqual(set(lines) - used, set(), "these lines name nothing that is built")

    def test_the_server_starts_with_its_configuration_file(self):
        self.serve(read(SOURCE, "service/server/server.conf"))

    def test_the_defaults_that_the_file_shows_are_settings_of_the_server(self):
        text = re.sub(r"^# (?=[a-z-]+ = )", "", read(SOURCE, "service/server/server.conf"), flags=re.M)
        self.assertIn("\nshare-lifetime = 172800\n", text)
        self.serve(text)

    def serve(self, configuration):
        with tempfile.TemporaryDirectory() as folder:
            path = f"{folder}/server.conf"
            with open(path, "w", encoding="utf-8") as file:
                file.write(configuration)
            ready, tell = os.pipe()
            with subprocess.Popen([f"{BUILD}/bin/pelliko-server", "serve", "--data", f"{folder}/data", "--config", path,
                                   "--listen", "127.0.0.1:0", "--ready-fd", str(tell)],
                                  pass_fds=[tell], stderr=subprocess.PIPE, text=True) as server:
                os.close(tell)
                with os.fdopen(ready) as line:
                    said = line.readline()
                server.terminate()
                _, error = server.communicate(timeout=60)
            self.assertRegex(said, "^http://", error)


if __name__ == "__main__":
    BUILD, VERSION = sys.argv[1:3]
    unittest.main(argv=sys.argv[:1])

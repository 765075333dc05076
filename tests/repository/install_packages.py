"""tools/install_packages on machines of all kinds, played by small scripts in place of apt-get and its kin.

Usage: install_packages.py ROOT
"""

import pathlib
import shutil
import subprocess
import sys
import tempfile
import unittest

SCRIPT = pathlib.Path(sys.argv.pop(1)) / "tools" / "install_packages"
TOOLS = ["awk", "bash", "cat", "dirname", "env", "flock", "grep", "mkdir", "sed", "sort", "tail", "touch"]

LIST = """# Comments and empty lines are skipped, and so is what is listed twice.
libwidget-dev
gizmo         gizmo
libwidget-dev <widget/widget.h>   # so are these
data-only
"""

# Knows the packages in $HOME/installed.
DPKG_QUERY = """#!/bin/bash
for package in "$@"; do
  if grep -qx "$package" "$HOME/installed"; then echo "$package installed"
  elif [[ $package == half-done ]]; then echo "$package unpacked"; fi
done
exit 1
"""

# Installs what it is told to, if the lists that it needs are there; writes down what it was asked for.
APT_GET = """#!/bin/bash
while [[ $1 == -* ]]; do
  if [[ $1 == -o ]]; then shift; fi
  shift
done
echo "$*" >>"$HOME/asked"
case $1 in
  update) if [[ -e $HOME/offline ]]; then echo "E: no network"; exit 100; fi; touch "$HOME/lists" ;;
  install) if [[ ! -e $HOME/lists ]]; then echo "E: no lists"; exit 100; fi
           shift 2; printf '%s\\n' "$@" >>"$HOME/installed" ;;
esac
"""


class InstallPackages(unittest.TestCase):

    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.root = pathlib.Path(folder.name)
        (self.root / "tools").mkdir()
        (self.root / "bin").mkdir()
        shutil.copy(SCRIPT, self.root / "tools")
        (self.root / "list").write_text(LIST)
        (self.root / "installed").touch()
        (self.root / "asked").touch()
        for tool in TOOLS:
            (self.root / "bin" / tool).symlink_to(shutil.which(tool))
        self.command("id", "#!/bin/bash\necho 0\n")
        self.command("dpkg-query", DPKG_QUERY)
        self.command("apt-get", APT_GET)

    def command(self, name, text):
        path = self.root / "bin" / name
        path.write_text(text)
        path.chmod(0o755)

    def run_script(self):
        """Exit code and what was said."""
        done = subprocess.run([self.root / "tools" / "install_packages", self.root / "list"], capture_output=True,
                              text=True, env={"PATH": str(self.root / "bin"), "HOME": str(self.root)}, timeout=60)
        self.assertEqual(done.stdout, "")
        return done.returncode, done.stderr

    def asked(self):
        return (self.root / "asked").read_text().splitlines()

    def test_all_there_asks_for_nothing(self):
        (self.root / "installed").write_text("gizmo\nlibwidget-dev\ndata-only\n")
        self.assertEqual(self.run_script(), (0, ""))
        self.assertEqual(self.asked(), [])

    def test_fresh_machine_fetches_lists_and_installs_what_is_missing(self):
        (self.root / "installed").write_text("gizmo\n")
        self.assertEqual(self.run_script(), (0, "Installing data-only libwidget-dev\n"))
        install = "install --no-install-recommends data-only libwidget-dev"
        self.assertEqual(self.asked(), [install, "update", install])
        self.assertEqual(self.run_script(), (0, ""))

    def test_lists_that_are_there_are_used(self):
        (self.root / "lists").touch()
        self.assertEqual(self.run_script()[0], 0)
        self.assertEqual(self.asked(), ["install --no-install-recommends data-only gizmo libwidget-dev"])

    def test_half_installed_is_missing(self):
        (self.root / "lists").touch()
        (self.root / "list").write_text("half-done\n")
        self.assertEqual(self.run_script(), (0, "Installing half-done\n"))

    def test_without_network(self):
        (self.root / "offline").touch()
        code, said = self.run_script()
        self.assertEqual(code, 1)
        self.assertIn("E: no network", said)
        self.assertIn("could not be installed: data-only gizmo libwidget-dev\n", said)

    def test_ordinary_user_without_sudo_is_told_what_to_run(self):
        self.command("id", "#!/bin/bash\necho 1000\n")
        code, said = self.run_script()
        self.assertEqual(code, 1)
        self.assertIn("apt-get install --no-install-recommends data-only gizmo libwidget-dev\n", said)
        self.assertEqual(self.asked(), [])

    def test_ordinary_user_with_sudo(self):
        (self.root / "lists").touch()
        self.command("id", "#!/bin/bash\necho 1000\n")
        self.command("sudo", '#!/bin/bash\necho "sudo $1" >>"$HOME/asked"\nexec "$@"\n')
        self.assertEqual(self.run_script(), (0, "Installing data-only gizmo libwidget-dev\n"))
        self.assertEqual(self.asked()[0], "sudo env")

    def test_system_without_apt_looks_for_commands_and_headers(self):
        (self.root / "bin" / "apt-get").unlink()
        code, said = self.run_script()
        self.assertEqual(code, 1)
        self.assertIn("  gizmo (Debian: gizmo)\n", said)
        self.assertIn("  <widget/widget.h> (Debian: libwidget-dev)\n", said)
        self.assertNotIn("data-only", said)
        self.command("gizmo", "#!/bin/bash\n")
        (self.root / "list").write_text("gizmo gizmo\nlibc <stdio.h>\n")
        self.assertEqual(self.run_script(), (0, ""))


if __name__ == "__main__":
    unittest.main()

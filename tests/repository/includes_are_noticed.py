"""Each rule of tools/check_includes, broken once: the check has to notice. Usage: includes_are_noticed.py ROOT"""

import pathlib
import subprocess
import sys
import tempfile
import unittest

CHECK = pathlib.Path(sys.argv.pop(1)) / "tools" / "check_includes"
HEADERS = ["values/A.h", "plugin/HIDReportVeskPlugin.h", "plugin/PaddedReport.h", "plugin/Own.h", "reports/one/O.h",
           "reports/two/T.h", "host/H.h"]


class Includes(unittest.TestCase):

    def check(self, name, line):
        with tempfile.TemporaryDirectory() as folder:
            root = pathlib.Path(folder)
            for header in HEADERS:
                (root / header).parent.mkdir(parents=True, exist_ok=True)
                (root / header).write_text("#include <vector>\n")
            (root / name).write_text(f"// A file.\n{line}\n")
            done = subprocess.run([sys.executable, CHECK, root], capture_output=True, text=True)
            return done.returncode, done.stdout

    def test_allowed(self):
        for name, line in [("values/X.cpp", '#include "values/A.h"'), ("plugin/X.cpp", '#include "values/A.h"'),
                           ("plugin/X.cpp", '#include "plugin/Own.h"'), ("reports/one/X.cpp", '#include "values/A.h"'),
                           ("reports/one/X.cpp", '#include "plugin/HIDReportVeskPlugin.h"'),
                           ("reports/one/X.cpp", '#include "reports/one/O.h"'), ("host/X.cpp", '#include "host/H.h"'),
                           ("host/X.cpp", '#include "plugin/PaddedReport.h"'), ("host/X.cpp", "#include <zlib.h>"),
                           ("values/X.cpp", "#include <string_view>")]:
            with self.subTest(f"{name}: {line}"):
                self.assertEqual(self.check(name, line), (0, ""))

    def test_forbidden(self):
        for name, line in [("values/X.cpp", '#include "plugin/Own.h"'), ("plugin/X.cpp", '#include "reports/one/O.h"'),
                           ("plugin/X.cpp", '#include "host/H.h"'), ("reports/one/X.cpp", '#include "reports/two/T.h"'),
                           ("reports/one/X.cpp", '#include "plugin/Own.h"'),
                           ("reports/one/X.cpp", '#  include "plugin/PaddedReport.h"'),
                           ("reports/one/X.cpp", '#include "host/H.h"'), ("host/X.cpp", '#include "reports/one/O.h"'),
                           ("host/X.cpp", '#include "plugin/Own.h"'), ("values/X.h", "#include <zlib.h>"),
                           ("values/X.h", "#include <sys/stat.h>"), ("reports/one/X.cpp", '#include "O.h"'),
                           ("host/X.cpp", "#include <host/H.h>"), ("plugin/X.cpp", "#include HEADER")]:
            with self.subTest(f"{name}: {line}"):
                code, complaint = self.check(name, line)
                self.assertEqual(code, 1)
                self.assertIn(f"{name}:2: ", complaint)


if __name__ == "__main__":
    unittest.main()

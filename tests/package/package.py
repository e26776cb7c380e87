"""The packages, unpacked into empty roots and used by an ordinary user; and the manual pages and completions, held
against what the programs themselves say that they take."""
import glob
import os
import re
import subprocess
import sys
import tempfile
import unittest

sys.dont_write_bytecode = True
ROOT = os.path.dirname(os.path.dirname(os.path.dirname(os.path.realpath(__file__))))
PACKAGES = os.path.join(ROOT, "build", "release", "packages")
NOBODY = 65534
OPTION = re.compile(r"(?<![\w-])(--?[A-Za-z][\w-]*)")


def run(command, **options):
    return subprocess.run(command, capture_output=True, text=True, timeout=120, **options)


class Root:
    """One package, unpacked. `top` is its "/usr"."""

    def __init__(self, package):
        self.folder = tempfile.TemporaryDirectory()
        os.chmod(self.folder.name, 0o755)
        if package.endswith(".deb"):
            subprocess.run(["dpkg-deb", "-x", package, self.folder.name], check=True)
            self.top = os.path.join(self.folder.name, "usr")
        else:
            subprocess.run(["tar", "xf", package, "-C", self.folder.name], check=True)
            self.top = os.path.join(self.folder.name, os.listdir(self.folder.name)[0])

    def program(self, name):
        return os.path.join(self.top, "bin", name)

    def share(self, *names):
        return os.path.join(self.top, "share", *names)

    def text(self, *names):
        with open(self.share(*names), encoding="utf-8") as f:
            return f.read()


def options_of_help(text):
    """The names that a program's help lists, each at the beginning of its line."""
    return {name for line in text.split("\n") if line.startswith("  -") for name in line.split()[0].split(",")}


class Package(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.roots = [Root(package) for package in sorted(glob.glob(PACKAGES + "/*.deb") + glob.glob(PACKAGES + "/*.gz"))]
        assert len(cls.roots) == 2, "tools/package makes two packages"
        cls.root = cls.roots[0]

    @classmethod
    def tearDownClass(cls):
        for root in cls.roots:
            root.folder.cleanup()

    def commands(self):
        """(name of the program, verb or None, names of the options that it tells of)"""
        for program in ("panelglow-board", "panelglow-board-sim", "panelglow-sim"):
            own = run([self.root.program(program), "--help"]).stdout
            yield program, None, options_of_help(own)
            verbs = own.partition("Subcommands:\n")[2]
            for verb in re.findall(r"^  ([a-z]+) ", verbs, re.M):
                yield program, verb, options_of_help(run([self.root.program(program), verb, "--help"]).stdout)
        for program in ("panelglow-diags", "panelglow-diags-sim"):
            usage = run([self.root.program(program), "-help=true"]).stdout
            yield program, None, set(re.findall(r"^(-\w+)=", usage, re.M))
            catalog = run([self.root.program(program), "-catalog=true"]).stdout
            for test in re.findall(r'<TEST Name="(\w+)".*?</TEST>', catalog, re.S):
                entry = re.search('<TEST Name="%s".*?</TEST>' % test, catalog, re.S).group()
                yield program, test, set(re.findall(r'<ARGUMENT Name="(-\w+)"', entry))

    def test_an_ordinary_user_runs_the_main_job(self):
        for root in self.roots:
            with self.subTest(root.top), tempfile.TemporaryDirectory() as home:
                subprocess.run(["cp", "-r", root.share("panelglow-diags", "installation"), home + "/bench"], check=True)
                subprocess.run(["chmod", "-R", "a+rX,u+w", home], check=True)
                as_user = {}
                if os.geteuid() == 0:
                    subprocess.run(["chown", "-R", str(NOBODY), home], check=True)
                    as_user = {"user": NOBODY, "group": NOBODY, "extra_groups": []}
                result = run([root.program("panelglow-sim"), "--machine",
                              root.share("panelglow-diags", "machines", "notebook.toml"), "--", "-subtest=CustomLEDTest",
                              "-SectionID=Notebook"], cwd=home + "/bench", env={"HOME": home, "PATH": "/usr/bin:/bin"},
                             **as_user)
                self.assertEqual(result.returncode, 0, result.stdout + result.stderr)
                self.assertIn("PASSED", result.stdout)
                self.assertEqual(result.stderr, "")
                check = run([root.program("panelglow-board"), "check"], cwd=home + "/bench", **as_user)
                self.assertEqual(check.returncode, 0, check.stdout + check.stderr)

    def test_what_it_needs_can_be_had(self):
        package = glob.glob(PACKAGES + "/*.deb")[0]
        result = run(["apt-get", "install", "--simulate", package])
        self.assertEqual(result.returncode, 0, result.stdout + result.stderr)
        for file in glob.glob(self.root.top + "/bin/*") + glob.glob(self.root.top + "/lib/*/*.so"):
            self.assertNotIn("RUNPATH", run(["readelf", "-d", file]).stdout, file)

    def test_pages_and_completions_tell_of_every_option(self):
        told = 0
        for program, verb, options in self.commands():
            self.assertTrue(options, (program, verb))
            page = self.root.text("man", "man1", program + ".1").replace("\\-", "-").replace("\\fB", " ")
            page = page.replace("\\fR", " ")
            bash = self.root.text("bash-completion", "completions", program)
            zsh = self.root.text("zsh", "vendor-completions", "_" + program)
            fish = self.root.text("fish", "vendor_completions.d", program + ".fish")
            if verb and not program.startswith("panelglow-diags"):
                page = page.partition("\n.SS %s\n" % verb)[2].partition("\n.SS ")[0]
                options = options - {"-h", "--help"}
                fish = "\n".join(line for line in fish.split("\n") if "seen_subcommand_from " + verb in line)
            fish = re.sub(r" -([ls]) ([\w-]+)", lambda m: " --" + m[2] if m[1] == "l" else " -" + m[2], fish)
            for place, text in (("man", page), ("bash", bash), ("zsh", zsh), ("fish", fish)):
                missing = options - set(OPTION.findall(text))
                self.assertEqual(missing, set(), (program, verb, place))
            told += len(options)
        self.assertGreater(told, 100)
        self.assertIn("-ChipIni=' -d 'chip.ini file name'\n", fish)

    def test_the_pages_can_be_read(self):
        for page in glob.glob(self.root.share("man", "man*", "*")):
            result = run(["man", "-l", "--warnings=w", page], env={**os.environ, "MANPAGER": "cat", "LC_ALL": "C.UTF-8"})
            self.assertEqual(result.returncode, 0, page)
            self.assertNotRegex(result.stderr, "macro|escape|font", page)
            self.assertNotIn("&quot;", result.stdout, page)
            self.assertGreater(len(result.stdout.split("\n")), 40, page)

    def test_the_shells_complete(self):
        cases = [("panelglow-board", ["che"], "check"), ("panelglow-board", ["check", "--for"], "--format"),
                 ("panelglow-board", ["check", "--format", "s"], "sarif"), ("panelglow-sim", ["--op"], "--operator"),
                 ("panelglow-diags", ["-subtest", "=", "Cus"], "CustomLEDTest"),
                 ("panelglow-diags", ["-subtest", "=", "LEDTest", "-Cap"], "-CapsLock="),
                 ("panelglow-diags", ["-subtest", "=", "LEDStatusIndicator", "-BlinkType", "="], "GreenPower"),
                 # A bar would begin another program: the shell has to put it behind a backslash.
                 ("panelglow-diags", ["-subtest", "=", "LEDStatusIndicator", "-BlinkType", "=", "Red"],
                  "RedPower\\|HardDrive"),
                 ("panelglow-diags", ["-subtest", "=", "CustomLEDTest", "-UIFile", "=", "/etc/passw"], "/etc/passwd"),
                 ("panelglow-diags", ["-sub"], "-subtest=")]
        for program, words, expected in cases:
            script = 'source "$1"; shift; function=$1; shift; COMP_WORDS=("$@"); COMP_CWORD=$(($# - 1)); $function; ' \
                'printf "%s\\n" "${COMPREPLY[@]}"'
            result = run(["bash", "-c", script, "bash", self.root.share("bash-completion", "completions", program),
                          "_" + program.replace("-", "_"), program, *words])
            self.assertIn(expected, result.stdout.split("\n"), (program, words, result.stderr))
            line = program + " " + " ".join(words).replace(" = ", "=").replace(" =", "=")
            result = run(["fish", "-c", 'source $argv[1]; complete -C $argv[2]',
                          self.root.share("fish", "vendor_completions.d", program + ".fish"), line],
                         env={**os.environ, "HOME": self.root.folder.name})
            found = [text.split("\t")[0] for text in result.stdout.split("\n")]
            plain = expected.replace("\\", "")  # fish itself adds what is needed
            self.assertTrue(any(plain in text for text in found), (line, result.stdout))
            self.assertEqual(result.stderr, "", line)
        for file in glob.glob(self.root.share("zsh", "*", "*")):
            self.assertEqual(run(["zsh", "-n", file]).stderr, "", file)
            with open(file, encoding="utf-8") as f:
                choices = re.findall(r":\(([^()]*)\)'", f.read())
            for words in choices:  # which the shell evaluates when it is asked for them
                self.assertEqual(run(["zsh", "-fc", "eval ws=\\( $1 \\)", "zsh", words]).stderr, "", (file, words))


if __name__ == "__main__":
    unittest.main(warnings="ignore")

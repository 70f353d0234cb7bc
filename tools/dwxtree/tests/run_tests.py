#!/usr/bin/env python3
# Runs dwxtree as a process on the bundled examples and on broken inputs and
# checks its output and exit codes.
#
# usage: run_tests.py DWXTREE EXAMPLES_DIR
import json, os, re, resource, shlex, signal, stat, subprocess, sys, tempfile, time

DWXTREE, EXAMPLES = os.path.abspath(sys.argv[1]), os.path.abspath(sys.argv[2])
APP, USER = os.path.join(EXAMPLES, "app.cfg"), os.path.join(EXAMPLES, "user.cfg")
SANITIZED = b"__asan_init" in open(DWXTREE, "rb").read()  # also when run without the preset's ASAN_OPTIONS
SCRATCH = tempfile.TemporaryDirectory()
TMP = SCRATCH.name
failures = []


# ARGS: a list, or a shell-quoted string where APP and USER name the examples.
# OUT: the exact stdout (str) or fragments it holds (list). ERR: a regular
# expression stderr matches (None: no stderr when RC is 0).
def expect(args, rc, out=None, err=None, stdin=b"", env=None, cwd=TMP, **popen):
    if isinstance(args, str):
        args = [{"APP": APP, "USER": USER}.get(a, a) for a in shlex.split(args)]
    full = {k: v for k, v in os.environ.items() if k not in ("DWX_ETC_PATH", "DWX_PRO_PATH")}
    full.update(env or {}, HOME=TMP)  # keeps a real ~/.config/dwxcore-viewer/local.cfg out
    done = subprocess.run([DWXTREE] + args, cwd=cwd, input=stdin, env=full, capture_output=True, timeout=120, **popen)
    text, stderr = done.stdout.decode("utf-8", "replace"), done.stderr.decode("utf-8", "replace")
    problems = [] if done.returncode == rc else ["exit %d, wanted %d" % (done.returncode, rc)]
    if isinstance(out, str) and text != out:
        problems.append("stdout %r, wanted %r" % (text, out))
    problems += ["stdout lacks %r" % s for s in (out if isinstance(out, list) else []) if s not in text]
    if (err is not None and not re.search(err, stderr)) or (err is None and rc == 0 and stderr):
        problems.append("stderr %r, wanted %r" % (stderr, err))
    if problems:
        failures.append("dwxtree %s: %s" % (" ".join(args), "; ".join(problems)))
    return done.stdout


def json_pairs(stdout):  # strict JSON (ASCII, no NaN or Infinity) as lists of (key, value)
    return json.loads(stdout.decode("ascii"), object_pairs_hook=list,
                      parse_constant=lambda constant: failures.append("JSON has " + constant))


ODD = "a|b c.cfg"  # names are used byte for byte: '|' and blanks are part of them
FILES = {
    "top.cfg": "(a Integer 1)\n(b String)\n(c Integer 3)\n", "cycle_a.cfg": "(a Integer 1)\n(@include cycle_b.cfg)\n",
    "nested.cfg": "# comment\n(t SubTree\n  (x Integer 1)\n  (u SubTree\n    oops\n  )\n  (y Integer 2)\n)\n",
    "inc_main.cfg": "(@include inc_bad.cfg)\n(z Integer 1)\n", "inc_bad.cfg": "(a Integer 1)\n\n(b Bool)\n",
    "cycle_b.cfg": "(b SubTree\n  (@include cycle_a.cfg)\n  (@include nowhere.cfg)\n  (x Integer 1)\n)\n",
    # Found next to the includer before the working directory, then through
    # $NAME and DWX_PRO_PATH; c.cfg (a diamond) is read twice, listed once.
    "conf/main.cfg": "(m SubTree\n  (@include a.cfg)\n  (@include b.cfg)\n"
                     "  (@include $PARTS/p.cfg)\n  (@include pro.cfg)\n)\n",
    "conf/a.cfg": "(a SubTree\n  (@include c.cfg)\n)\n", "conf/b.cfg": "(b SubTree\n  (@include c.cfg)\n)\n",
    "conf/c.cfg": "(c Integer 3)\n", "parts/p.cfg": "(p Integer 4)\n", "prodir/pro.cfg": "(q Integer 5)\n",
    "conf/top.cfg": "(app SubTree\n  (@include deep/mid.cfg)\n)\n", "run/leaf.cfg": "(width Integer 1)\n",
    "conf/deep/mid.cfg": "(mid SubTree\n  (x Integer 1)\n  (@include leaf.cfg)\n)\n", "secret.cfg": "(x Integer 1)\n",
    "conf/deep/leaf.cfg": "# the leaf\n(width Integer 800)\n", "wi.cfg": '(d Double 1.5x)\n(s String "a" "b")\n',
    "w.cfg": "(t SubTree\n  (port Integr 8080)\n  (n Integer 12abc)\n  (@include wi.cfg)\n)\n",
    # A warning on every line (the writer writes IntegerList, the reader skips
    # it): the file must not be reread per warning, or this would not finish.
    "lists.cfg": "".join("(v%d IntegerList 1 2)\n" % i for i in range(100000)),
    "text.cfg": b'(s String "q\\q t\\\\ \x01 \xe9 \xc3\xa9 \xf0\x9f\x99\x82 \xed\xa0\x80")\n(c Char \xff)\n'
                b"(d Integer 1)\n(d Double inf)\n(e SubTree\n)\n(l StringList )\n(b Base64 YWI)\n",
    "wrapped.txt": "YWJj\nYWJj\n", "bad.txt": "YW*J\n", "lone.txt": "YWJjZ", "after.txt": "YQ==YQ==",
    "dir.cfg/x": "", "empty.cfg": "# nothing but a comment\n\n", "-odd.cfg": "(x Integer 1)\n",
    "leaf.cfg": "(n Integer 7)\n(t SubTree\n  (a Integer 1)\n  (A String \"second\")\n  (b[0] Integer 3)\n)\n",
    ODD: "(t SubTree\n  (a Integer 1)\n  (q Integer 2)\n  (p SubTree\n    (a Integer 2)\n  )\n)\n",
    "u.cfg": "(t SubTree\n  (a Integer 8)\n  (q Integer 9)\n  (p Integer 9)\n  (new Integer 3)\n)\n",
    "deep.cfg": "(a SubTree\n" * 1000000 + ")\n" * 1000000 + "(x Integer 5)\n",
}
FILES.update({"chain%d.cfg" % i: "(@include chain%d.cfg)\n" % (i + 1) for i in range(70)})
FILES["base.cfg"] = FILES[ODD]
ENV = {"env": {"PARTS": os.path.join(TMP, "parts"), "DWX_PRO_PATH": os.path.join(TMP, "prodir")}}
RUN, NOBODY = {"cwd": os.path.join(TMP, "run")}, {"user": 65534} if os.geteuid() == 0 else {}  # root reads all
CORRUPT = r"error: corrupt line: expected '\(NAME TYPE VALUE', '\(NAME SubTree', '\)' or a comment\n"
VERSION = re.search(r"project\(dwxcore VERSION (\S+)", open(os.path.join(EXAMPLES, "../CMakeLists.txt")).read())[1]
READ = "%s: ok, 31 nodes, 6 subtrees, depth 4, 3 files read\n" % APP + "".join(
    "  %s\n" % os.path.join(EXAMPLES, n) for n in ("app.cfg", "network.cfg", "plugins.cfg"))
MERGED = "(t SubTree\n  (a Integer 8)\n  (q Integer 9)\n  (p SubTree\n    (a Integer 2)\n  )\n)\n"
ROWS = [
    ("check APP -name VIEWER", 0, READ), ("show --version", 0, "dwxtree (dwxcore) %s\n" % VERSION),
    ("check APP -name view", 1, [": not ok, 1 error, 0 warnings, 3 files read\n"], "named 'view'"),
    ("get APP VIEWER/Window/WIDTH", 0, "1280\n"), ("get APP viewer/plugins/enabled", 0, "raw\nexif\ngeo tags\n"),
    ("get APP viewer/greeting", 0, 'Say "cheese"!\nThen press \\ to start.\n'),
    ("get APP viewer/plugins/raw", 0, '(raw SubTree\n  (quality Integer 90)\n  (engine String "fast")\n)\n'),
    ("get APP viewer/window/depth", 1, "", r"'viewer/window/depth' not found: no 'viewer/window/depth'"),
    ("get APP viewer/title/x", 1, "", r"'viewer/title' is a String, not a SubTree"),
    ("merge APP USER -except network proxy -o merged.cfg", 0, ""),
    ("get merged.cfg viewer/title", 0, "My Photos\n"), ("get merged.cfg viewer/network/port", 0, "8443\n"),
    ("get merged.cfg viewer/plugins/raw/quality", 0, "100\n"), ("get deep.cfg x", 0, "5\n"),
    # A million nested subtrees: the tool's walks (check's count, get, json)
    # must not use the call stack per level.
    ("check deep.cfg", 0, "deep.cfg: ok, 1000001 nodes, 1000000 subtrees, depth 1000000, 1 files read\n  deep.cfg\n"),
    # Reports are FILE:LINE: error|warning: with the line's text below; reading
    # stops at a corrupt line, keeping what came before, and the exit code is 1.
    ("show top.cfg", 1, "(a Integer 1)\n", r"^top\.cfg:2: " + CORRUPT + r"     2 \| \(b String\)\n$"),
    ("show nested.cfg", 1, "(t SubTree\n  (x Integer 1)\n  (u SubTree\n  )\n)\n",
     r"^nested\.cfg:5: " + CORRUPT + r"     5 \|     oops\n$"),
    ("show inc_main.cfg", 1, "(a Integer 1)\n", r"^inc_bad\.cfg:3: error: .*\n     3 \| \(b Bool\)\n$"),
    ("show -", 1, "(a Integer 1)\n", r"^<stdin>:2: error: .*\n     2 \| \(b String\)\n$",
     {"stdin": FILES["top.cfg"].encode()}),
] + [(c, 1, "" if "merge" in c else None, r"^nested\.cfg:5: error: " + "[\\s\\S]*nothing written" * ("merge" in c))
     for c in ("check nested.cfg", "json nested.cfg", "get nested.cfg t", "merge nested.cfg top.cfg")] + [
    ("show cycle_a.cfg", 1, "(a Integer 1)\n(b SubTree\n  (x Integer 1)\n)\n", r"^cycle_b\.cfg:2: warning: include "
     r"cycle: 'cycle_a\.cfg' is already being read; ignored\n.*\ncycle_b\.cfg:3: warning: cannot find include file "
     r"'nowhere\.cfg'; ignored\n     3 \|   \(@include nowhere\.cfg\)\n$"),
    ("check chain0.cfg", 1, ["65 files read"], r"^chain64\.cfg:1: warning: include depth limit of 64 "
     r"reached at 'chain65\.cfg'; ignored\n     1 \| \(@include chain65\.cfg\)\n$"),
    ("check w.cfg", 1, "w.cfg: not ok, 0 errors, 4 warnings, 2 files read\n  w.cfg\n  wi.cfg\n",
     r"(?s)^w\.cfg:2: warning: type keyword 'Integr' builds no node.*\n     2 \|   \(port Integr 8080\)\n.*"
     r"w\.cfg:3: warning: integer value '12abc'.*wi\.cfg:1: warning: double value '1\.5x'.*wi\.cfg:2: "),
    ("show w.cfg", 0, ["(n Integer 12)"], "w.cfg:2: warning"),
    ("check lists.cfg", 1, ["not ok, 0 errors, 100000 warnings"], r"\n 99999 \| \(v99998 IntegerList"),
    # The read log: which files were read, and where a node came from.
    ("check conf/main.cfg", 0, "conf/main.cfg: ok, 7 nodes, 3 subtrees, depth 3, 6 files read\n  conf/main.cfg\n"
     "  conf/a.cfg\n  conf/c.cfg\n  conf/b.cfg\n  {0}/parts/p.cfg\n  {0}/prodir/pro.cfg\n".format(TMP), None, ENV),
    ("get ../conf/top.cfg APP/mid/width --where", 0, "800\n../conf/deep/leaf.cfg:2\n"
     "  included from ../conf/deep/mid.cfg:3\n  included from ../conf/top.cfg:2\n", None, RUN),
    ("get - t/b --where", 0, "2\n<stdin>:3\n", None, {"stdin": b"(t SubTree\n  (a Integer 1)\n  (b Integer 2)\n)\n"}),
    # Every reason a file cannot be read is named; nothing reaches stdout.
] + [(c, 1, "", r"^%s: error: cannot read: %s\n$" % (re.escape(c.split()[-1]), why), NOBODY if "secret" in c else {})
     for c, why in [("show absent.cfg", "no such file"), ("show secret.cfg", "permission denied"),
                    ("show fifo.cfg", "not a regular file"), ("show top.cfg/x", ".*not a directory"),
                    ("show dir.cfg", "is a directory"), ("base64 --encode dir.cfg", "is a directory")]] + [
    ("base64 --encode -", 0, "YWJj\n", None, {"stdin": b"abc"}), ("base64 --encode", 0, "\n"),
    ("base64 -decode wrapped.txt", 0, "abcabc"), ("base64 -decode", 0, "ab", None, {"stdin": b"YWI"}),
    ("base64 -decode bad.txt", 1, "", r"^bad\.txt: error: not Base64: byte 0x2a at offset 2"),
    ("base64 -decode lone.txt", 1, "", r"^lone\.txt: error: not Base64: the last group has a single"),
    ("base64 -decode after.txt", 1, "", r"^after\.txt: error: not Base64: byte 0x59 at offset 4"),
    # The tool decodes in blocks of 192 KiB: offsets count from the start of
    # the input, and a group or a pad after a block boundary still closes.
    ("base64 -d -", 1, "", r"byte 0x2a at offset 196608\n", {"stdin": b"\n" * 196608 + b"*"}),
    ("base64 -d", 1, "", "single character", {"stdin": b"\n" * 196607 + b"QUJDQ"}),
    ("base64 -d", 0, "AB", None, {"stdin": b"\n" * 196606 + b"QUI=\n"}),
    ("json empty.cfg", 0, "{}\n"), ("check leaf.cfg -name n", 1, None, "named 'n'"),
    # Nodes outside every subtree are written one per line; get takes the
    # first node of a name, or the one an index picks.
    ("show leaf.cfg", 0, FILES["leaf.cfg"]), ("get leaf.cfg T/a", 0, "1\n"), ("get leaf.cfg t/a[1]", 0, "second\n"),
    ("get leaf.cfg t/b[0]", 0, "3\n"), ("get leaf.cfg t/a[2]", 1, "", r"no 't/a\[2\]'"),
    # A leaf does not replace a subtree, and names the first file lacks are
    # not added; '-' is stdin for a FILE and stdout for -o, '--' ends options.
    (["merge", ODD, "u.cfg"], 0, MERGED), (["merge", ODD, "u.cfg", "-o", "x|y z.cfg"], 0, ""),
    (["show", "x|y z.cfg"], 0, MERGED), ("get -- -odd.cfg x", 0, "1\n"),
    ("check - --name T", 0, ["<stdin>: ok, 1 nodes", "read\n  <stdin>\n"], None, {"stdin": b"(t SubTree\n)\n"}),
    (["merge", ODD, "-", "-o", "-"], 0, ["(q Integer 3)"], None, {"stdin": b"(t SubTree\n  (q Integer 3)\n)\n"}),
] + [(args, 0, ["(a Integer 1)", "(q Integer %d)" % q]) for q, args in [  # options anywhere, old spellings too
    (9, ["-except", "a", "merge", ODD, "u.cfg"]), (9, ["merge", ODD, "--except=a", "u.cfg"]),
    (9, ["merge", ODD, "u.cfg", "-EXCEPT", "x,a"]), (2, ["merge", ODD, "u.cfg", "-except", "a", "q"])]] + [
    # -h and --help anywhere, also beside errors, and -o takes -h as its name.
    ("--help", 0, ["usage: dwxtree SUBCOMMAND"]), ("-HELP show", 0, ["usage: dwxtree show"]),
    ("show x -h --bogus", 0, ["usage: dwxtree show"]), ("merge -o x -h", 0, ["usage: dwxtree merge"]),
    (["show", ODD, "-o", "-h"], 0, "")] + [(c, 2, "", err) for c, err in [
        ("", "usage: dwxtree SUBCOMMAND"), ("frobnicate x", "unknown subcommand 'frobnicate'"),
        ("show", "dwxtree show: missing arguments\nTry 'dwxtree show --help'"), ("show a b", "too many arguments"),
        ("show APP -name x", "unknown option '-name'"), ("get APP viewer//title", "names separated by single '/'"),
        ("merge APP USER -o", "option -o needs a value"), ("merge APP USER -o a --output b", "more than once"),
        ("merge - -", "standard input can be only one"), ("base64 --encode=yes", "option --encode takes no value"),
        ("base64 -encode -decode", "exactly one of --encode and"), ("base64 x", "exactly one of --encode and")]]


def examples():
    shown = expect("show APP", 0, ["(viewer SubTree\n", "  (network SubTree\n", "    (proxy SubTree\n      (enabled"])
    with open(os.path.join(TMP, "shown.cfg"), "wb") as f:
        f.write(shown)
    expect("show shown.cfg", 0, shown.decode())  # the written text reads back the same
    viewer = dict(dict(json_pairs(expect("json APP", 0)))["viewer"])
    wanted = {"version": 2.5, "startMaximized": False, "formats": "jpg|png|tiff", "signature": "dmlld2Vy",
              "build": 1842, "recentFiles": ["/home/ana/pictures/harbour.jpg", "/home/ana/pictures/night sky.png"]}
    if repr({k: viewer.get(k) for k in wanted}) != repr(wanted):  # repr: 1842 is not 1842.0
        failures.append("json example: %r" % viewer)
    text = json_pairs(expect("json text.cfg", 0))
    wanted = [("s", 'q" t\\ \x01 \xe9 \xe9 \U0001F642 \xed\xa0\x80'), ("c", "\xff"), ("d", 1),
              ("d", None), ("e", []), ("l", []), ("b", "YWI")]
    if repr(text) != repr(wanted):
        failures.append("json escapes: %r, wanted %r" % (text, wanted))
    # Too deep for a recursive JSON reader: check the shape instead; the
    # indent stops growing, so the text grows with the size only.
    out, levels = expect("json deep.cfg", 0), 1000000
    if (out.count(b"{") != levels + 1 or out.count(b"}") != levels + 1 or len(out) > 80 * levels
            or out.count(b'"a": {') != levels or not out.endswith(b'  },\n  "x": 5\n}\n')):
        failures.append("deep json: wrong shape (%d bytes, ends %r)" % (len(out), out[-40:]))


def base64_stream():
    # 20 MiB through a pipe both ways under a 16 MiB address space limit: the
    # codec must stream, block after block in order. (The sanitizers reserve
    # huge address ranges: there a smaller run checks only the result.)
    data = os.urandom(1 << 20) * (3 if SANITIZED else 20)
    limit = "" if SANITIZED else "ulimit -v 16384; "
    script = "(%s'%s' base64 --encode) | (%s'%s' base64 --decode)" % (limit, DWXTREE, limit, DWXTREE)
    done = subprocess.run(["bash", "-o", "pipefail", "-c", script], input=data, capture_output=True)
    if done.returncode != 0 or done.stdout != data:
        failures.append("base64 stream: exit %d, %d of %d bytes" % (done.returncode, len(done.stdout), len(data)))


def outputs():
    # -o writes a temporary and renames it over the file: on a failure (over
    # the file size limit, EFBIG and not the signal; a corrupt input; a signal)
    # the old file stays and no temporary is left.
    base = os.path.join(TMP, "base.cfg")
    os.chmod(base, 0o640)
    temporaries = lambda: [n for n in os.listdir(TMP) if n.startswith(".base")]

    def unchanged(label):
        if open(base).read() != FILES["base.cfg"] or temporaries():
            failures.append("%s: base.cfg changed or a temporary is left" % label)

    expect("merge base.cfg u.cfg -o base.cfg", 1, "", r"cannot write 'base\.cfg': file too large\n.*'base\.cfg' "
           r"left unchanged", preexec_fn=lambda: resource.setrlimit(resource.RLIMIT_FSIZE, (50, 50)))
    unchanged("over the size limit")
    expect("show nested.cfg -o base.cfg", 1, "", r"left unchanged")
    unchanged("read problems")
    proc = subprocess.Popen([DWXTREE, "base64", "-e", "-o", "base.cfg"], cwd=TMP, stdin=subprocess.PIPE)
    proc.stdin.write(b"abc")  # the input stays open: the tool waits with its temporary
    proc.stdin.flush()
    deadline = time.time() + 5
    while not temporaries() and time.time() < deadline:
        time.sleep(0.01)
    proc.terminate()
    if proc.wait() != -signal.SIGTERM:
        failures.append("interrupted: exit %d" % proc.returncode)
    proc.stdin.close()
    unchanged("interrupted")
    expect("show base.cfg -o /dev/full", 1, "", r"cannot write '/dev/full': no space left")
    expect("show base.cfg -o no/such/dir/x.cfg", 1, "", r"cannot write 'no/such/dir/x\.cfg': no such file")
    # In place the file keeps its mode; through a link the file it names is
    # replaced, not the link.
    expect("merge base.cfg u.cfg -o base.cfg", 0, "")
    if open(base).read() != MERGED or stat.S_IMODE(os.stat(base).st_mode) != 0o640:
        failures.append("merge in place: mode %o" % stat.S_IMODE(os.stat(base).st_mode))
    os.symlink("base.cfg", os.path.join(TMP, "link.cfg"))
    expect("merge link.cfg u.cfg --output=link.cfg", 0, "")
    if not os.path.islink(os.path.join(TMP, "link.cfg")):
        failures.append("merge through a link: the link was replaced")


def main():
    for name, content in FILES.items():
        path = os.path.join(TMP, name)
        os.makedirs(os.path.dirname(path), exist_ok=True)
        with open(path, "wb") as f:
            f.write(content if isinstance(content, bytes) else content.encode())
    os.chmod(os.path.join(TMP, "secret.cfg"), 0)
    os.mkfifo(os.path.join(TMP, "fifo.cfg"))
    os.chmod(TMP, 0o755)
    for row in ROWS:
        expect(*row[:4], **(row[4] if len(row) > 4 else {}))
    for group in (examples, base64_stream, outputs):
        group()
    print("".join("FAIL %s\n" % f for f in failures) + "%s: %d failures" % (os.path.basename(__file__), len(failures)))
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())

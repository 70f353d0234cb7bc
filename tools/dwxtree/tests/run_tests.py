#!/usr/bin/env python3
"""Runs dwxtree as a process on the bundled examples and on broken inputs and
checks its output and exit codes.

usage: run_tests.py DWXTREE EXAMPLES_DIR
"""
import base64 as b64
import hashlib
import json
import os
import re
import resource
import stat
import signal
import subprocess
import sys
import tempfile
import time

DWXTREE = os.path.abspath(sys.argv[1])
EXAMPLES = os.path.abspath(sys.argv[2])
APP = os.path.join(EXAMPLES, "app.cfg")
USER = os.path.join(EXAMPLES, "user.cfg")
failures = []


SANITIZED = "ASAN_OPTIONS" in os.environ


def run(args, cwd, stdin=b"", env_extra=None, **popen):
    env = {k: v for k, v in os.environ.items() if k not in ("DWX_ETC_PATH", "DWX_PRO_PATH")}
    env["HOME"] = cwd  # keeps a real ~/.config/dwxcore-viewer/local.cfg out of the results
    env.update(env_extra or {})
    done = subprocess.run([DWXTREE] + args, cwd=cwd, input=stdin, env=env,
                          stdout=subprocess.PIPE, stderr=subprocess.PIPE, timeout=120, **popen)
    return done.returncode, done.stdout, done.stderr.decode("utf-8", "replace")


def expect(label, args, cwd, rc, out=None, err=None, out_has=(), out_lacks=(), **kw):
    """out: exact stdout text; err: regular expression stderr must match."""
    code, stdout, stderr = run(args, cwd, **kw)
    text = stdout.decode("utf-8", "replace")
    problems = []
    if code != rc:
        problems.append("exit %d, wanted %d" % (code, rc))
    if out is not None and text != out:
        problems.append("stdout %r, wanted %r" % (text, out))
    if err is not None and not re.search(err, stderr):
        problems.append("stderr %r does not match %r" % (stderr, err))
    if err is None and rc == 0 and stderr:
        problems.append("unexpected stderr %r" % stderr)
    problems += ["stdout lacks %r" % s for s in out_has if s not in text]
    problems += ["stdout has %r" % s for s in out_lacks if s in text]
    if problems:
        failures.append("%s: dwxtree %s: %s" % (label, " ".join(args), "; ".join(problems)))
    return stdout


def write(directory, files):
    for name, content in files.items():
        path = os.path.join(directory, name)
        os.makedirs(os.path.dirname(path), exist_ok=True)
        with open(path, "wb") as f:
            f.write(content if isinstance(content, bytes) else content.encode())


def json_pairs(stdout, label):
    """The JSON as nested lists of (key, value) pairs, after json.tool accepted it."""
    tool = subprocess.run([sys.executable, "-m", "json.tool"], input=stdout,
                          stdout=subprocess.PIPE, stderr=subprocess.PIPE)
    if tool.returncode != 0:
        failures.append("%s: json.tool refused the output: %s" % (label, tool.stderr.decode()))
        return []
    return json.loads(stdout.decode("ascii"), object_pairs_hook=lambda pairs: pairs)


def examples(tmp):
    shown = expect("show example", ["show", APP], tmp, 0,
                   out_has=["(viewer SubTree\n", "  (network SubTree\n",
                            "    (proxy SubTree\n      (enabled Bool FALSE)\n",
                            '  (formats String "jpg|png|tiff")\n'])
    # The written text reads back to the same tree.
    write(tmp, {"shown.cfg": shown})
    expect("show round trip", ["show", "shown.cfg"], tmp, 0, out=shown.decode())

    summary = "%s: ok, 31 nodes, 6 subtrees, depth 4, 3 files read\n"
    expect("check example", ["check", APP, "-name", "VIEWER"], tmp, 0, out=summary % APP)
    expect("check wrong name", ["check", APP, "-name", "view"], tmp, 1, out="",
           err=r"does not open a subtree named 'view'")

    for path, value in [
        ("viewer/title", "Photo Viewer\n"),
        ("VIEWER/Window/WIDTH", "1280\n"),
        ("viewer/version", "2.5\n"),
        ("viewer/startMaximized", "FALSE\n"),
        ("viewer/network/useTls", "TRUE\n"),
        ("viewer/window/listSeparator", ";\n"),
        ("viewer/greeting", 'Say "cheese"!\nThen press \\ to start.\n'),
        ("viewer/plugins/enabled", "raw\nexif\ngeo tags\n"),
        ("viewer/network/retryDelays", "2.5\n10\n30\n"),
        ("viewer/signature", "dmlld2Vy\n"),
        ("viewer/plugins/raw", '(raw SubTree\n  (quality Integer 90)\n  (engine String "fast")\n)\n'),
    ]:
        expect("get", ["get", APP, path], tmp, 0, out=value)
    expect("get missing", ["get", APP, "viewer/window/depth"], tmp, 1, out="",
           err=r"'viewer/window/depth' not found: no 'viewer/window/depth'")
    expect("get through leaf", ["get", APP, "viewer/title/x"], tmp, 1, out="",
           err=r"'viewer/title' is a String, not a SubTree")

    merged = os.path.join(tmp, "merged.cfg")
    expect("merge", ["merge", APP, USER, "-except", "network", "proxy", "-o", merged], tmp, 0, out="")
    for path, value in [("viewer/title", "My Photos\n"), ("viewer/window/width", "1920\n"),
                        ("viewer/window/BackgroundColor", "0,0,0\n"),
                        ("viewer/window/zoomSteps", "0.25\n0.5\n1\n2\n4\n"),
                        ("viewer/network/port", "8443\n"),
                        ("viewer/plugins/raw/quality", "100\n")]:
        expect("merged value", ["get", merged, path], tmp, 0, out=value)
    expect("merge adds nothing", ["get", merged, "viewer/theme"], tmp, 1, err="not found")
    expect("merge to stdout", ["merge", APP, USER], tmp, 0, out_has=["(port Integer 80)"])

    pairs = json_pairs(expect("json example", ["json", APP], tmp, 0), "json example")
    viewer = dict(dict(pairs)["viewer"]) if pairs else {}
    wanted = {"title": "Photo Viewer", "version": 2.5, "build": 1842, "startMaximized": False,
              "formats": "jpg|png|tiff", "signature": "dmlld2Vy",
              "recentFiles": ["/home/ana/pictures/harbour.jpg", "/home/ana/pictures/night sky.png"]}
    for key, value in wanted.items():
        if viewer.get(key) != value or type(viewer.get(key)) is not type(value):
            failures.append("json example: %s is %r, wanted %r" % (key, viewer.get(key), value))
    if viewer and dict(viewer["window"])["zoomSteps"] != [0.25, 0.5, 1, 2, 4]:
        failures.append("json example: zoomSteps %r" % (dict(viewer["window"])["zoomSteps"],))


CORRUPT = r"error: corrupt line: expected '\(NAME TYPE VALUE', '\(NAME SubTree', '\)' or a comment\n"


def broken(tmp):
    cases = {
        "top.cfg": "(a Integer 1)\n(b String)\n(c Integer 3)\n",
        "nested.cfg": "# comment\n(t SubTree\n  (x Integer 1)\n  (u SubTree\n    oops\n"
                      "  )\n  (y Integer 2)\n)\n(z Integer 3)\n",
        "inc_main.cfg": "(@include inc_bad.cfg)\n(z Integer 1)\n",
        "inc_bad.cfg": "(a Integer 1)\n\n(b Bool)\n",
        "missing.cfg": "(t SubTree\n  (@include nowhere.cfg)\n  (x Integer 1)\n)\n",
        "optional.cfg": "(t SubTree\n  (@TRY_INCLUDE nowhere.cfg)\n  (x Integer 1)\n)\n",
        "self.cfg": "(s SubTree\n  (@include self.cfg)\n  (x Integer 1)\n)\n",
        "cycle_a.cfg": "(a Integer 1)\n(@include cycle_b.cfg)\n",
        "cycle_b.cfg": "(b Integer 2)\n(@include cycle_a.cfg)\n",
    }
    write(tmp, cases)
    # A corrupt line at each level: the reading stops there, what came before
    # is kept, the report is FILE:LINE: error: with the line's text below it,
    # and the exit code is 1.
    expect("corrupt top", ["show", "top.cfg"], tmp, 1, out="(a Integer 1)\n",
           err=r"^top\.cfg:2: " + CORRUPT + r"     2 \| \(b String\)\n$")
    expect("corrupt nested", ["show", "nested.cfg"], tmp, 1,
           out="(t SubTree\n  (x Integer 1)\n  (u SubTree\n  )\n)\n",
           err=r"^nested\.cfg:5: " + CORRUPT + r"     5 \|     oops\n$")
    expect("corrupt included", ["show", "inc_main.cfg"], tmp, 1, out="(a Integer 1)\n",
           err=r"^inc_bad\.cfg:3: error: .*\n     3 \| \(b Bool\)\n$")
    expect("corrupt stdin", ["show", "-"], tmp, 1, stdin=cases["top.cfg"].encode(),
           out="(a Integer 1)\n", err=r"^<stdin>:2: error: .*\n     2 \| \(b String\)\n$")
    for command in (["check"], ["json"], ["get", "?", "t"]):
        args = command[:1] + ["nested.cfg"] + command[2:]
        expect("corrupt " + command[0], args, tmp, 1, err=r"^nested\.cfg:5: error: ")
    expect("merge refuses", ["merge", "nested.cfg", "top.cfg"], tmp, 1, out="",
           err=r"nothing written")

    expect("missing include", ["check", "missing.cfg"], tmp, 1, out="",
           err=r"^missing\.cfg:2: warning: cannot find include file 'nowhere\.cfg'; ignored\n"
               r"     2 \|   \(@include nowhere\.cfg\)\n$")
    expect("missing include kept reading", ["show", "missing.cfg"], tmp, 1,
           out="(t SubTree\n  (x Integer 1)\n)\n", err="cannot find include")
    expect("optional include", ["check", "optional.cfg"], tmp, 0,
           out="optional.cfg: ok, 2 nodes, 1 subtrees, depth 2, 1 files read\n")
    expect("self include", ["show", "self.cfg"], tmp, 1, out="(s SubTree\n  (x Integer 1)\n)\n",
           err=r"^self\.cfg:2: warning: include cycle: 'self\.cfg' is already being read")
    expect("include cycle", ["show", "cycle_a.cfg"], tmp, 1,
           out="(a Integer 1)\n(b Integer 2)\n", err=r"^cycle_b\.cfg:2: warning: include cycle")
    write(tmp, {"chain%d.cfg" % i: "(@include chain%d.cfg)\n" % (i + 1) for i in range(70)})
    expect("include depth", ["check", "chain0.cfg"], tmp, 1, out="",
           err=r"^chain64\.cfg:1: warning: include depth limit of 64 reached at 'chain65\.cfg'; "
               r"ignored\n     1 \| \(@include chain65\.cfg\)\n$")


def unreadable(tmp):
    # Every reason a file cannot be read is named, for tree files and for
    # base64 alike, and nothing reaches standard output.
    write(tmp, {"secret.cfg": "(x Integer 1)\n", "dir.cfg/x": ""})
    os.chmod(os.path.join(tmp, "secret.cfg"), 0)
    os.mkfifo(os.path.join(tmp, "fifo.cfg"))
    os.chmod(tmp, 0o755)
    # root reads anything: the unreadable file is tried as an ordinary user.
    user = {"user": 65534} if os.geteuid() == 0 else {}
    for name, reason, extra in [("absent.cfg", "no such file", {}),
                                ("secret.cfg", "permission denied", user),
                                ("dir.cfg", "is a directory", {}),
                                ("fifo.cfg", "not a regular file", {}),
                                ("top.cfg/x", "no such file|not a directory", {})]:
        expect("unreadable " + name, ["show", name], tmp, 1, out="",
               err=r"^%s: error: cannot read: (%s)\n$" % (re.escape(name), reason), **extra)
    expect("base64 of a directory", ["base64", "--encode", "dir.cfg"], tmp, 1, out="",
           err=r"^dir\.cfg: error: cannot read: is a directory\n$")
    expect("base64 missing", ["base64", "-d", "absent.cfg"], tmp, 1, out="",
           err=r"^absent\.cfg: error: cannot read: no such file\n$")


def includes(tmp):
    # Includes are found as named, then through DWX_ETC_PATH and DWX_PRO_PATH;
    # dwxtree adds the directory of FILE to the "etc" search, and $NAME in an
    # include is expanded from the environment. A file included twice (a
    # diamond) is read twice but counted once.
    write(tmp, {
        "conf/main.cfg": "(m SubTree\n  (@include a.cfg)\n  (@include b.cfg)\n"
                         "  (@include $PARTS/p.cfg)\n  (@include pro.cfg)\n)\n",
        "conf/a.cfg": "(a SubTree\n  (@include c.cfg)\n)\n",
        "conf/b.cfg": "(b SubTree\n  (@include c.cfg)\n)\n",
        "conf/c.cfg": "(c Integer 3)\n",
        "parts/p.cfg": "(p Integer 4)\n",
        "prodir/pro.cfg": "(q Integer 5)\n",
    })
    env = {"PARTS": os.path.join(tmp, "parts"), "DWX_PRO_PATH": os.path.join(tmp, "prodir")}
    expect("include search", ["check", "conf/main.cfg"], tmp, 0, env_extra=env,
           out="conf/main.cfg: ok, 7 nodes, 3 subtrees, depth 3, 6 files read\n")
    expect("include search values", ["get", "conf/main.cfg", "m/b/c"], tmp, 0,
           env_extra=env, out="3\n")


def json_escapes(tmp):
    write(tmp, {"text.cfg": b'(s String "q\\q t\\\\ \x01 \xe9 \xc3\xa9 \xf0\x9f\x99\x82 \xed\xa0\x80")\n'
                            b"(c Char \xff)\n(d Integer 1)\n(d Double inf)\n(e SubTree\n)\n"
                            b'(l StringList )\n(b Base64 YWI)\n'})
    pairs = json_pairs(expect("json escapes", ["json", "text.cfg"], tmp, 0), "json escapes")
    wanted = [("s", 'q" t\\ \x01 \xe9 \xe9 \U0001F642 \xed\xa0\x80'), ("c", "\xff"), ("d", 1),
              ("d", None), ("e", []), ("l", []), ("b", "YWI")]
    if pairs != wanted:
        failures.append("json escapes: %r, wanted %r" % (pairs, wanted))


def base64(tmp):
    data = bytes(range(256)) * 3 + b"\x00"
    write(tmp, {"bytes.bin": data, "wrapped.txt": "YWJj\nYWJj\n", "bad.txt": "YW*J\n",
                "lone.txt": "YWJjZ", "after.txt": "YQ==YQ=="})
    text = expect("encode", ["base64", "-encode", "bytes.bin"], tmp, 0)
    code, back, _ = run(["base64", "-decode"], tmp, stdin=text)
    if back != data:
        failures.append("base64: the bytes did not come back (%d of %d)" % (len(back), len(data)))
    expect("encode stdin", ["base64", "--encode", "-"], tmp, 0, stdin=b"abc", out="YWJj\n")
    expect("encode empty", ["base64", "--encode"], tmp, 0, stdin=b"", out="\n")
    expect("decode wrapped", ["base64", "-decode", "wrapped.txt"], tmp, 0, out="abcabc")
    expect("decode unpadded", ["base64", "-decode"], tmp, 0, stdin=b"YWI", out="ab")
    for name, message in [("bad.txt", r"byte 0x2a at offset 2"), ("lone.txt", r"the last group has a single character"),
                          ("after.txt", r"byte 0x59 at offset 4")]:
        expect("decode " + name, ["base64", "-decode", name], tmp, 1, out="",
               err="^%s: error: not Base64: %s" % (re.escape(name), message))


def base64_blocks(tmp):
    # The tool decodes in blocks of 192 KiB; white space, pads, a lone last
    # character and a bad byte are moved across the boundary, and every
    # result must be what decoding the whole text gives.
    block = 3 * 64 * 1024
    data = os.urandom(145000)  # a little less than a block as wrapped text
    flat = b64.b64encode(data)
    wrapped = b"\n".join(flat[i:i + 76] for i in range(0, len(flat), 76)) + b"\n"
    for shift in range(block - len(wrapped) - 4, block - len(wrapped) + 5):
        for text, want in [(wrapped, data), (wrapped.replace(b"=", b""), data)]:
            code, out, err = run(["base64", "-d"], tmp, stdin=b" " * shift + text)
            if code != 0 or out != data:
                failures.append("base64 blocks: shift %d: exit %d, %d bytes, %s"
                                % (shift, code, len(out), err))
    for position in (block - 1, block, block + 1):
        text = bytearray(b"\n" * (block + 8))
        text[:len(flat)] = flat[:len(flat)]
        text[position] = ord("*")
        expect("base64 bad byte at %d" % position, ["base64", "-d", "-"], tmp, 1,
               stdin=bytes(text), err=r"byte 0x2a at offset %d\n" % position)
    single = b"\n" * (block - 1) + b"QUJD" + b"Q"
    expect("base64 lone character after a block", ["base64", "-d"], tmp, 1, stdin=single,
           err="single character")
    expect("base64 pad after a block", ["base64", "-d"], tmp, 0,
           stdin=b"\n" * (block - 2) + b"QUI=\n", out="AB")


def base64_large(tmp):
    # 200 MB through a pipe, both ways, under a virtual memory limit far
    # below the data: the codec must stream. (The sanitizers reserve huge
    # address ranges, so there a smaller run checks only the result.)
    size = 20 * 1000 * 1000 if SANITIZED else 200 * 1000 * 1000
    limit = "" if SANITIZED else "ulimit -v 65536; "
    tool = "'%s'" % DWXTREE
    script = ("head -c %d /dev/zero | tr '\\0' 'x' | (%s%s base64 --encode) | "
              "(%s%s base64 --decode)" % (size, limit, tool, limit, tool))
    proc = subprocess.Popen(["bash", "-o", "pipefail", "-c", script], cwd=tmp,
                            stdout=subprocess.PIPE, stderr=subprocess.PIPE)
    digest, count = hashlib.sha256(), 0
    for chunk in iter(lambda: proc.stdout.read(1 << 20), b""):
        digest.update(chunk)
        count += len(chunk)
    err = proc.stderr.read().decode("utf-8", "replace")
    want = hashlib.sha256()
    for _ in range(size // 1000000):
        want.update(b"x" * 1000000)
    if proc.wait() != 0 or count != size or digest.digest() != want.digest():
        failures.append("base64 large: exit %d, %d of %d bytes, %s"
                        % (proc.returncode, count, size, err))


def depth(tmp):
    # A million nested subtrees: the library reads them, and the tool's own
    # walks (json, check's count, get) must not use the call stack per level.
    levels = 1000000
    with open(os.path.join(tmp, "deep.cfg"), "w") as f:
        f.write("(a SubTree\n" * levels + ")\n" * levels + "(x Integer 5)\n")
    expect("deep check", ["check", "deep.cfg"], tmp, 0,
           out="deep.cfg: ok, %d nodes, %d subtrees, depth %d, 1 files read\n"
               % (levels + 1, levels, levels))
    expect("deep get", ["get", "deep.cfg", "x"], tmp, 0, out="5\n")
    out = expect("deep json", ["json", "deep.cfg"], tmp, 0)
    # Too deep for a recursive JSON reader: check the shape instead.
    if (out.count(b"{") != levels + 1 or out.count(b"}") != levels + 1
            or out.count(b'"a": {') != levels or not out.endswith(b'  },\n  "x": 5\n}\n')):
        failures.append("deep json: wrong shape (%d bytes, ends %r)" % (len(out), out[-40:]))
    # The indent stops growing, so the text grows with the size only.
    if len(out) > 80 * levels:
        failures.append("deep json: %d bytes for %d levels" % (len(out), levels))


def outputs(tmp):
    write(tmp, {"base.cfg": "(t SubTree\n  (a Integer 1)\n  (s String \"x\")\n)\n",
                "other.cfg": "(t SubTree\n  (a Integer 5)\n  (s String \"%s\")\n)\n" % ("y" * 4000),
                "bad.cfg": "(t SubTree\n  oops\n)\n"})
    base = os.path.join(tmp, "base.cfg")
    os.chmod(base, 0o640)
    before = open(base, "rb").read()

    def unchanged(label, rc_wanted, args, err, **kw):
        expect(label, args, tmp, rc_wanted, out="", err=err, **kw)
        if open(base, "rb").read() != before:
            failures.append("%s: base.cfg changed" % label)
        strays = [n for n in os.listdir(tmp) if n.startswith(".base.cfg")]
        if strays:
            failures.append("%s: temporary files left: %r" % (label, strays))

    # The merged text (over 4000 bytes) does not fit under a 1000-byte file
    # size limit: the write fails with EFBIG, not by the signal.
    limit = lambda: resource.setrlimit(resource.RLIMIT_FSIZE, (1000, 1000))
    unchanged("write over the size limit", 1, ["merge", "base.cfg", "other.cfg", "-o", "base.cfg"],
              r"cannot write 'base\.cfg': file too large\n.*'base\.cfg' left unchanged",
              preexec_fn=limit)
    # Interrupted while its input is still open: the temporary goes too.
    proc = subprocess.Popen([DWXTREE, "base64", "-e", "-o", "base.cfg"], cwd=tmp,
                            stdin=subprocess.PIPE, stderr=subprocess.PIPE)
    proc.stdin.write(b"abc")
    proc.stdin.flush()
    for _ in range(500):
        if any(n.startswith(".base.cfg") for n in os.listdir(tmp)):
            break
        time.sleep(0.01)
    proc.terminate()
    proc.wait()
    proc.stdin.close()
    proc.stderr.close()
    unchanged("interrupted", 1, ["show", "bad.cfg", "-o", "base.cfg"], r"left unchanged")
    if proc.returncode != -signal.SIGTERM:
        failures.append("interrupted: exit %d" % proc.returncode)
    unchanged("read problems", 1, ["show", "bad.cfg", "-o", "base.cfg"], r"left unchanged")
    unchanged("merge of a bad file", 1, ["merge", "bad.cfg", "other.cfg", "-o", "base.cfg"],
              r"nothing written")
    expect("full standard output", ["show", "base.cfg", "-o", "/dev/full"], tmp, 1,
           err=r"cannot write '/dev/full': no space left")
    # In place, and the file keeps its permissions.
    expect("merge in place", ["merge", "base.cfg", "other.cfg", "-o", "base.cfg"], tmp, 0, out="")
    expect("merged in place", ["get", "base.cfg", "t/a"], tmp, 0, out="5\n")
    if stat.S_IMODE(os.stat(base).st_mode) != 0o640:
        failures.append("merge in place: mode %o" % stat.S_IMODE(os.stat(base).st_mode))
    # Through a symbolic link, the file it names is replaced, not the link.
    os.symlink("base.cfg", os.path.join(tmp, "link.cfg"))
    expect("merge through a link", ["merge", "link.cfg", "base.cfg", "--output=link.cfg"], tmp, 0)
    if not os.path.islink(os.path.join(tmp, "link.cfg")):
        failures.append("merge through a link: the link was replaced")
    expect("merge unwritable", ["merge", "base.cfg", "other.cfg", "-o", "no/such/dir/x.cfg"],
           tmp, 1, err=r"cannot write 'no/such/dir/x\.cfg': no such file")


def edges(tmp):
    write(tmp, {
        "empty.cfg": "# nothing but a comment\n\n",
        "leaf.cfg": "(n Integer 7)\n(t SubTree\n  (a Integer 1)\n  (A String \"second\")\n)\n",
        "base.cfg": "(t SubTree\n  (a Integer 1)\n  (s SubTree\n    (a Integer 2)\n  )\n)\n",
        "other.cfg": "(t SubTree\n  (a Integer 5)\n  (s Integer 9)\n  (new Integer 3)\n)\n",
    })
    expect("empty file", ["check", "empty.cfg"], tmp, 0,
           out="empty.cfg: ok, 0 nodes, 0 subtrees, depth 0, 1 files read\n")
    expect("empty json", ["json", "empty.cfg"], tmp, 0, out="{}\n")
    # Nodes outside every subtree are written one per line and read back.
    expect("top-level leaf", ["show", "leaf.cfg"], tmp, 0,
           out='(n Integer 7)\n(t SubTree\n  (a Integer 1)\n  (A String "second")\n)\n')
    expect("first of a name", ["get", "leaf.cfg", "T/a"], tmp, 0, out="1\n")
    expect("validate leaf first", ["check", "leaf.cfg", "-name", "n"], tmp, 1, err="named 'n'")
    # A leaf of OTHER does not replace a subtree of BASE, and names BASE
    # lacks are not added.
    expect("merge kinds", ["merge", "base.cfg", "other.cfg"], tmp, 0,
           out="(t SubTree\n  (a Integer 5)\n  (s SubTree\n    (a Integer 2)\n  )\n)\n")


def habits(tmp):
    write(tmp, {"a|b c.cfg": "(t SubTree\n  (a Integer 1)\n  (p Integer 2)\n)\n",
                "-odd.cfg": "(x Integer 1)\n",
                "u.cfg": "(t SubTree\n  (a Integer 8)\n  (p Integer 9)\n)\n"})
    odd = "a|b c.cfg"
    # Names are used byte for byte: '|' and blanks are part of them.
    expect("name with | and blanks", ["get", odd, "t/a"], tmp, 0, out="1\n")
    expect("output with | and blanks", ["merge", odd, "u.cfg", "-o", "x|y z.cfg"], tmp, 0, out="")
    expect("written with | and blanks", ["get", "x|y z.cfg", "t/a"], tmp, 0, out="8\n")
    # '-' is standard input for a FILE and standard output for -o; '--'
    # ends the options.
    expect("stdin", ["get", "-", "t/p"], tmp, 0, stdin=open(os.path.join(tmp, odd), "rb").read(),
           out="2\n")
    expect("stdin check", ["check", "-", "--name", "T"], tmp, 0, stdin=b"(t SubTree\n)\n",
           out="<stdin>: ok, 1 nodes, 1 subtrees, depth 1, 1 files read\n")
    expect("stdin merge", ["merge", odd, "-", "-o", "-"], tmp, 0,
           stdin=b"(t SubTree\n  (p Integer 3)\n)\n", out_has=["(p Integer 3)"])
    expect("after --", ["get", "--", "-odd.cfg", "x"], tmp, 0, out="1\n")
    # Options before, between or after the operands; the old spellings too.
    for args in (["merge", "-except", "a", odd, "u.cfg"], ["merge", odd, "--except=a", "u.cfg"],
                 ["-except", "a", "merge", odd, "u.cfg"], ["merge", odd, "u.cfg", "-EXCEPT", "a"],
                 ["merge", odd, "u.cfg", "--except", "x,a"],
                 ["merge", odd, "u.cfg", "-except", "x", "a"]):
        expect("except " + " ".join(args), args, tmp, 0, out_has=["(a Integer 1)", "(p Integer 9)"])
    expect("except after the files takes several", ["merge", odd, "u.cfg", "-except", "a", "p"],
           tmp, 0, out_has=["(a Integer 1)", "(p Integer 2)"])
    # -h and --help anywhere, also beside errors; --version is project()'s.
    for args in (["--help"], ["-h"], ["-help"], ["show", "--help"], ["--help", "show"],
                 ["show", "x", "-h", "--bogus"], ["merge", "-o", "x", "-h"]):
        sub = args[0] if args[0] in ("show", "merge") else ("show" if "show" in args else "")
        expect("help " + " ".join(args), args, tmp, 0,
               out_has=["usage: dwxtree " + (sub or "SUBCOMMAND")])
    expect("-o takes -h as its name", ["show", odd, "-o", "-h"], tmp, 0, out="")
    cmake = open(os.path.join(EXAMPLES, "..", "CMakeLists.txt")).read()
    version = re.search(r"project\(dwxcore VERSION (\S+)", cmake).group(1)
    expect("version", ["show", "--version"], tmp, 0, out="dwxtree (dwxcore) %s\n" % version)


def usage(tmp):
    for args, err in [
        ([], r"usage: dwxtree SUBCOMMAND"),
        (["frobnicate", "x"], r"unknown subcommand 'frobnicate'"),
        (["show"], r"dwxtree show: missing arguments\nTry 'dwxtree show --help'"),
        (["show", "a", "b"], r"too many arguments"),
        (["show", APP, "-name", "x"], r"unknown option '-name'"),
        (["show", APP, "--bogus"], r"unknown option '--bogus'"),
        (["get", APP], r"missing arguments"),
        (["get", APP, "viewer//title"], r"names separated by single '/'"),
        (["merge", APP, USER, "-o"], r"option -o needs a value"),
        (["merge", APP, USER, "-o", "a", "--output", "b"], r"given more than once"),
        (["merge", APP, USER, "-except"], r"option -except needs a value"),
        (["merge", "-", "-"], r"standard input can be only one"),
        (["base64", "--encode=yes"], r"option --encode takes no value"),
        (["base64", "-encode", "-decode"], r"exactly one of --encode and --decode"),
        (["base64", "x"], r"exactly one of --encode and --decode"),
    ]:
        expect("usage", args, tmp, 2, out="", err=err)
    for command in ("show", "check", "get", "merge", "json", "base64"):
        expect("help " + command, [command, "-HELP"], tmp, 0,
               out_has=["usage: dwxtree " + command])


def main():
    for group in (examples, broken, unreadable, includes, json_escapes, base64, base64_blocks,
                  base64_large, depth, outputs, edges, habits, usage):
        with tempfile.TemporaryDirectory() as tmp:
            group(tmp)
    for failure in failures:
        print("FAIL", failure)
    print("%s: %d failures" % (os.path.basename(__file__), len(failures)))
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())

#!/usr/bin/env python3
"""Runs dwxtree as a process on the bundled examples and on broken inputs and
checks its output and exit codes.

usage: run_tests.py DWXTREE EXAMPLES_DIR
"""
import json
import os
import re
import subprocess
import sys
import tempfile

DWXTREE = os.path.abspath(sys.argv[1])
EXAMPLES = os.path.abspath(sys.argv[2])
APP = os.path.join(EXAMPLES, "app.cfg")
USER = os.path.join(EXAMPLES, "user.cfg")
failures = []


def run(args, cwd, stdin=b"", env_extra=None):
    env = {k: v for k, v in os.environ.items() if k not in ("DWX_ETC_PATH", "DWX_PRO_PATH")}
    env["HOME"] = cwd  # keeps a real ~/.config/dwxcore-viewer/local.cfg out of the results
    env.update(env_extra or {})
    done = subprocess.run([DWXTREE] + args, cwd=cwd, input=stdin, env=env,
                          stdout=subprocess.PIPE, stderr=subprocess.PIPE, timeout=60)
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
    # is kept, the report names file and line, and the exit code is 1.
    expect("corrupt top", ["show", "top.cfg"], tmp, 1, out="(a Integer 1)\n",
           err=r"^dwxtree: Corrupt file top\.cfg at line 2 \.\.\. missing tokens\.\n$")
    expect("corrupt nested", ["show", "nested.cfg"], tmp, 1,
           out="(t SubTree\n  (x Integer 1)\n  (u SubTree\n  )\n)\n",
           err=r"^dwxtree: Corrupt file nested\.cfg at line 5 \.\.\. missing tokens\.\n$")
    expect("corrupt included", ["show", "inc_main.cfg"], tmp, 1, out="(a Integer 1)\n",
           err=r"Corrupt file inc_bad\.cfg at line 3")
    for command in (["check"], ["json"], ["get", "?", "t"]):
        args = command[:1] + ["nested.cfg"] + command[2:]
        expect("corrupt " + command[0], args, tmp, 1, err=r"at line 5")
    expect("merge refuses", ["merge", "nested.cfg", "top.cfg"], tmp, 1, out="",
           err=r"nothing written")

    expect("missing include", ["check", "missing.cfg"], tmp, 1, out="",
           err=r"Unable to locate file 'nowhere\.cfg' requested in @include directive on line 2 "
               r"of file 'missing\.cfg'\. Ignoring\.")
    expect("missing include kept reading", ["show", "missing.cfg"], tmp, 1,
           out="(t SubTree\n  (x Integer 1)\n)\n", err="Unable to locate")
    expect("optional include", ["check", "optional.cfg"], tmp, 0,
           out="optional.cfg: ok, 2 nodes, 1 subtrees, depth 2, 1 files read\n")
    expect("self include", ["show", "self.cfg"], tmp, 1,
           out="(s SubTree\n  (x Integer 1)\n)\n", err=r"Include cycle")
    expect("include cycle", ["show", "cycle_a.cfg"], tmp, 1,
           out="(a Integer 1)\n(b Integer 2)\n", err=r"Include cycle")
    expect("missing file", ["show", "absent.cfg"], tmp, 1, out="", err=r"cannot read 'absent\.cfg'")


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
    expect("decode", ["base64", "-decode"], tmp, 0, stdin=text, out=None)
    code, back, _ = run(["base64", "-decode"], tmp, stdin=text)
    if back != data:
        failures.append("base64: the bytes did not come back (%d of %d)" % (len(back), len(data)))
    expect("encode stdin", ["base64", "-encode"], tmp, 0, stdin=b"abc", out="YWJj\n")
    expect("decode wrapped", ["base64", "-decode", "wrapped.txt"], tmp, 0, out="abcabc")
    expect("decode unpadded", ["base64", "-decode"], tmp, 0, stdin=b"YWI", out="ab")
    for name, message in [("bad.txt", r"byte 0x2a at offset 2"), ("lone.txt", r"single character"),
                          ("after.txt", r"byte 0x59 at offset 4")]:
        expect("decode " + name, ["base64", "-decode", name], tmp, 1, out="", err=message)


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
    # Merging in place: a leaf of OTHER does not replace a subtree of BASE,
    # and names BASE lacks are not added.
    expect("merge in place", ["merge", "base.cfg", "other.cfg", "-o", "base.cfg"], tmp, 0, out="")
    expect("merged in place", ["show", "base.cfg"], tmp, 0,
           out="(t SubTree\n  (a Integer 5)\n  (s SubTree\n    (a Integer 2)\n  )\n)\n")
    expect("merge unwritable", ["merge", "base.cfg", "other.cfg", "-o", "no/such/dir/x.cfg"],
           tmp, 1, err=r"cannot write 'no/such/dir/x\.cfg'")


def usage(tmp):
    for args, err in [
        ([], r"usage: dwxtree SUBCOMMAND"),
        (["frobnicate", "x"], r"unknown subcommand 'frobnicate'"),
        (["show"], r"dwxtree show: missing arguments"),
        (["show", "a", "b"], r"too many arguments"),
        (["show", APP, "-name", "x"], r"unknown option '-name'"),
        (["get", APP], r"missing arguments"),
        (["get", APP, "viewer//title"], r"names separated by single '/'"),
        (["merge", APP, USER, "-o"], r"option -o needs a value"),
        (["merge", APP, USER, "-except"], r"option -except needs a value"),
        (["merge", APP, USER, "-except", "a", "-except", "b"], r"given more than once"),
        (["base64", "-encode", "-decode"], r"exactly one of -encode and -decode"),
        (["base64", "x"], r"exactly one of -encode and -decode"),
        (["check", "-", APP], r"unknown option '-'"),
    ]:
        expect("usage", args, tmp, 2, out="", err=err)
    expect("help", ["-help"], tmp, 0, out_has=["usage: dwxtree SUBCOMMAND", "Exit status"])
    for command in ("show", "check", "get", "merge", "json", "base64"):
        expect("help " + command, [command, "-HELP"], tmp, 0,
               out_has=["usage: dwxtree " + command])
    expect("help json states rules", ["json", "-help"], tmp, 0,
           out_has=["repeated key", "Latin-1"])
    # A value that begins with a hyphen is written with two.
    write(tmp, {"-odd.cfg": "(x Integer 1)\n"})
    expect("hyphen value", ["get", "--odd.cfg", "x"], tmp, 0, out="1\n")


def main():
    for group in (examples, broken, includes, json_escapes, base64, edges, usage):
        with tempfile.TemporaryDirectory() as tmp:
            group(tmp)
    for failure in failures:
        print("FAIL", failure)
    print("%s: %d failures" % (os.path.basename(__file__), len(failures)))
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())

#!/usr/bin/env python3
"""The vantrel command run as a user runs it, on real data.

    cli_test.py GROUP VANTREL FIXTURE_DIR WORK_DIR

GROUP: subcommands | errors | report | loop. Numbers are checked against the measurement files
themselves (and Argyll's xicclu where it is installed), never against earlier output.
"""
import json, math, os, shutil, subprocess, sys, tempfile

GROUP, VANTREL, FIXTURES, WORK = sys.argv[1], *map(os.path.abspath, sys.argv[2:5])
ICC = "/usr/share/color/icc"
F39, F40 = f"{ICC}/FOGRA39L.ti3", f"{ICC}/FOGRA40L.ti3"
PROFILE = f"{FIXTURES}/FOGRA39L.icc"
failures = []


def run(*args, expect=0):
    r = subprocess.run([VANTREL, *args, "--quiet"] if "--help" not in args else [VANTREL, *args],
                       capture_output=True, text=True, timeout=900)
    if r.returncode != expect:
        failures.append(f"{' '.join(args)}: exit {r.returncode}, expected {expect}\n{r.stderr}")
    return r


def check(ok, what):
    if not ok:
        failures.append(what)


def skip(why):
    print(f"SKIPPED: {why}")
    sys.exit(0)


def read_cgats(path):
    """Device values (CMYK) -> list of Lab, from a CGATS file's own columns."""
    lines = open(path, encoding="latin-1").read().splitlines()
    fields = lines[lines.index("BEGIN_DATA_FORMAT") + 1].split()
    start = lines.index("BEGIN_DATA") + 1
    rows = [l.split() for l in lines[start:lines.index("END_DATA")]]
    col = {name.upper(): i for i, name in enumerate(fields)}
    out = []
    for r in rows:
        cmyk = tuple(float(r[col[f"CMYK_{c}"]]) for c in "CMYK")
        lab = tuple(float(r[col[f"LAB_{c}"]]) for c in "LAB")
        out.append((cmyk, lab))
    return out


def de76(x, y):
    return math.dist(x, y)


def paired_des(ref_path, proof_path):
    ref = {}
    for cmyk, lab in read_cgats(ref_path):
        ref.setdefault(cmyk, lab)
    return [(cmyk, de76(ref[cmyk], lab)) for cmyk, lab in read_cgats(proof_path) if cmyk in ref]


for need in (PROFILE, F39, F40):
    if not os.path.exists(need):
        skip(f"{need} missing (tools/make_fixtures.sh, Debian icc-profiles-free)")
os.makedirs(WORK, exist_ok=True)
os.chdir(tempfile.mkdtemp(dir=WORK))

if GROUP == "subcommands":
    out = run("--version").stdout
    check(out.startswith("vantrel "), f"--version: {out!r}")
    for name in ("convert", "inks", "isd", "compare", "judge", "improve", "correct", "calibrate", "merge", "loop"):
        check("example: vantrel " + name in run(name, "--help").stdout, f"{name} --help has no example")

    # convert: the profile reproduces the data it was built from (colprof -qm: within a few dE).
    measured = dict(read_cgats(F39))
    res = json.loads(run("convert", PROFILE, "100,0,0,0", "0,0,0,100", "0,0,0,0", "--json").stdout)
    for rec in res:
        lab = measured[tuple(float(v) for v in rec["device"])]
        check(de76(rec["lab"], lab) < 2.5, f"convert {rec}: measured {lab}")
        check(abs(rec["xyz"][1] - 100 * (((rec["lab"][0] + 16) / 116) ** 3 if rec["lab"][0] > 8 else rec["lab"][0] / 903.3)) < 0.05,
              f"convert {rec}: Y does not follow L*")
    run("convert", PROFILE, "--in", F39, "--out", "conv.csv")
    rows = [l.split(",") for l in open("conv.csv").read().splitlines()[1:]]
    check(len(rows) == 1617, f"convert --in: {len(rows)} rows")
    mean = sum(de76([float(v) for v in r[4:7]], measured[tuple(float(v) for v in r[:4])]) for r in rows) / len(rows)
    check(mean < 1.5, f"convert --in: mean dE76 {mean:.2f} against the measurement")
    run("convert", PROFILE, "--in", "conv.csv", "--out", "conv.it8")
    check(len(read_cgats("conv.it8")) == 1617, "convert CSV in, CGATS out")

    # RGB through sRGB (absolute, as Argyll's xicclu -ia gives it); CMYK+RGB through a seven-colour profile.
    srgb = f"{ICC}/sRGB.icc"
    if os.path.exists(srgb) and shutil.which("xicclu"):
        rgb = json.loads(run("convert", srgb, "--rgb", "255,0,0", "0,0,255", "128,128,128", "--json").stdout)
        x = subprocess.run(["xicclu", "-v0", "-ff", "-ia", "-pl", srgb], input="1 0 0\n0 0 1\n0.50196 0.50196 0.50196\n",
                           capture_output=True, text=True).stdout.split()
        for i, rec in enumerate(rgb):
            check(de76(rec["lab"], [float(v) for v in x[3 * i:3 * i + 3]]) < 0.5, f"convert --rgb {rec}: xicclu {x}")
    if os.path.exists(f"{FIXTURES}/ink-7CLR.icc"):
        seven = json.loads(run("convert", f"{FIXTURES}/ink-7CLR.icc", "--cmykrgb", "0,0,0,0,0,0,0", "100,0,0,0,0,0,0",
                               "--json").stdout)
        check(seven[0]["lab"][0] > seven[1]["lab"][0] + 10, f"convert --cmykrgb: cyan no darker than paper {seven}")

    # inks: the CMYK found prints the Lab asked for (checked through xicclu when it is there).
    inks = json.loads(run("inks", PROFILE, "60", "-20", "-30", "--json").stdout)["cmyk"]
    if shutil.which("xicclu"):
        x = subprocess.run(["xicclu", "-v0", "-ff", "-ia", "-pl", PROFILE], input=" ".join(str(v / 100) for v in inks),
                           capture_output=True, text=True).stdout.split()
        check(de76([float(v) for v in x[-3:]], (60, -20, -30)) < 1, f"inks {inks} print {x[-3:]}")

    # compare: repeatability of one chart, and two charts against each other (mean from the files).
    check(json.loads(run("compare", F39, "--json").stdout)["analysis"] == "repeatability", "compare one chart")
    both = json.loads(run("compare", F40, F39, "--json").stdout)
    des = [d for _, d in paired_des(F39, F40)]
    check(abs(both["mean"] - sum(des) / len(des)) < 0.05 and abs(both["maximum"] - max(des)) < 0.05,
          f"compare: {both} against {sum(des) / len(des):.3f} / {max(des):.3f}")

    # judge: the four figures and the checks, the paper white from the files.
    j = json.loads(run("judge", PROFILE, PROFILE, F40, "--reference", F39, "--report", "judge.html", "--json").stdout)
    paper = max(d for cmyk, d in paired_des(F39, F40) if cmyk == (0, 0, 0, 0))
    checks = {c["check"]: c for c in j["checks"]}
    check(abs(checks["Paper white"]["value"] - paper) < 0.01, f"judge paper white {checks['Paper white']} vs {paper}")
    check(abs(j["figures"]["mean"] - checks["All patches, mean"]["value"]) < 0.05, f"judge mean {j}")
    check(j["pass"] is False and os.path.getsize("judge.html") > 10000, "judge: FOGRA40 is no proof of FOGRA39")
    # Without a reference measurement the reference profile's predictions are written, in a copy's place.
    shutil.copy(F40, "proof.ti3")
    shutil.copy(PROFILE, "ref.icc")
    listing, proof = sorted(os.listdir(".")), open("proof.ti3", "rb").read()
    run("judge", PROFILE, "ref.icc", "proof.ti3", "--report", "judge2.html")
    check(sorted(os.listdir(".")) == sorted(listing + ["judge2.html"]) and open("proof.ti3", "rb").read() == proof,
          f"judge wrote beside or over its input: {sorted(os.listdir('.'))}")

    # improve works on a copy; the input stays byte for byte.
    shutil.copy(f"{FIXTURES}/TR003.icc", "tr.icc")
    before = open("tr.icc", "rb").read()
    imp = json.loads(run("improve", "tr.icc", "--out", "tr2.icc", "--json").stdout)
    check(open("tr.icc", "rb").read() == before and open("tr2.icc", "rb").read() != before, "improve --out")
    check(0 < imp["round_trip_mean"] < imp["round_trip_maximum"], f"improve: {imp}")

    # correct: optimize2 corrects, or says that this build has none, and writes nothing then.
    r = subprocess.run([VANTREL, "correct", PROFILE, PROFILE, F40, "--reference", F39, "--out", "p2.icc", "--quiet"],
                       capture_output=True, text=True)
    check(r.returncode == 0 and os.path.exists("p2.icc") or
          r.returncode == 1 and "optimize2 is not available" in r.stderr, f"correct: {r.returncode} {r.stderr}")

    # calibrate a copy of the neutral link; merge a seven-colour profile; isd through the neutral 3CC.
    run("calibrate", "--write-neutral-link", "link.mcc")
    shutil.copy(F40, "print_cal1.ti3")
    run("calibrate", "link.mcc", "print_cal1.ti3", "--reference", F39, "--paper", f"{FIXTURES}/TR003.icc", "--out", "l1.mcc")
    check(open("link.mcc", "rb").read() != open("l1.mcc", "rb").read(), "calibrate changed nothing")
    if os.path.exists(f"{FIXTURES}/ink-7CLR.icc"):
        run("merge", f"{FIXTURES}/ink-7CLR.icc", f"{FIXTURES}/ink-CMYK.icc", "--out", "merged.icc")
        check(open("merged.icc", "rb").read()[36:40] == b"acsp", "merge wrote no profile")
    run("correct", "--write-neutral-3cc", "n.3cc")
    run("isd", "n.3cc", F40, "--out", "isd.it8")
    isd = read_cgats("isd.it8")
    check(len(isd) == 1617 and max(d for _, d in paired_des(F40, "isd.it8")) < 1.0, "isd through a neutral 3CC")

elif GROUP == "errors":
    open("short.icc", "wb").write(open(PROFILE, "rb").read()[:300])
    open("lab-only.it8", "w").write(
        "CGATS.17\nNUMBER_OF_FIELDS 4\nBEGIN_DATA_FORMAT\nSAMPLE_ID LAB_L LAB_A LAB_B\nEND_DATA_FORMAT\n"
        "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 95 0 -2\nEND_DATA\n")
    open("three.csv", "w").write("C;M;Y;K\n0;0;100\n")
    shutil.copy(f"{FIXTURES}/TR003.icc", "tr.icc")
    cases = [  # arguments, exit status, what stderr must say
        (["convert", "missing.icc", "1,2,3,4"], 1, "missing.icc: no such file"),
        (["convert", F39, "1,2,3,4"], 1, "FOGRA39L.ti3: not an ICC profile"),
        (["convert", "short.icc", "1,2,3,4"], 1, "short.icc: profile refused: "),
        (["convert", PROFILE, "--in", "lab-only.it8"], 1, "lab-only.it8: chart has no device columns"),
        (["judge", PROFILE, PROFILE, "lab-only.it8"], 1, "lab-only.it8: chart has no device columns"),
        (["compare", "missing.ti3"], 1, "missing.ti3: no such file"),
        (["convert", PROFILE, "--in", "three.csv"], 1, "three.csv: line 2: 3 values, 4 device values needed"),
        (["convert", PROFILE, "1,2,x"], 2, "not a list of numbers"),
        (["convert", PROFILE, "1,2,3"], 2, "4 device values"),
        (["inks", PROFILE, "50"], 2, "missing L* a* b*"),
        (["improve", "tr.icc"], 2, "--out FILE"),
        (["improve", "tr.icc", "--out", "./tr.icc"], 2, "is the input; use --in-place"),
        (["improve", "tr.icc", "--frobnicate", "1"], 2, "unknown option --frobnicate"),
        (["nonsense"], 2, "unknown command"),
    ]
    before = open("tr.icc", "rb").read()
    for args, status, says in cases:
        r = subprocess.run([VANTREL, *args, "--quiet"], capture_output=True, text=True)
        check(r.returncode == status, f"{args}: exit {r.returncode}, expected {status}")
        check(says in r.stderr and r.stderr.count("\n") <= 2 and r.stdout == "", f"{args}: stderr {r.stderr!r}")
    check(open("tr.icc", "rb").read() == before, "a refused command changed its input")
    # Ctrl-C: optimize1 hears it through the progress answer; the half-made copy goes away.
    import signal, time
    p = subprocess.Popen([VANTREL, "improve", "tr.icc", "--out", "cut.icc", "--quiet"], stderr=subprocess.PIPE, text=True)
    time.sleep(0.5)
    p.send_signal(signal.SIGINT)
    err = p.communicate(timeout=120)[1]
    if p.returncode == 0:
        print("note: improve finished before Ctrl-C reached it")
    else:
        check(p.returncode == 1 and "interrupted" in err and not os.path.exists("cut.icc"), f"Ctrl-C: {p.returncode} {err}")

elif GROUP in ("report", "loop"):
    if GROUP == "report":
        run("judge", PROFILE, PROFILE, F40, "--reference", F39, "--report", "report.html")
        ids = ["figures", "tolerances", "ab-plot", "de-histogram", "worst"]
    else:
        if not all(shutil.which(t) for t in ("xicclu", "colprof", "refine")):
            skip("Argyll's xicclu, colprof and refine are needed for the proof loop")
        loop = json.loads(run("loop", "--passes", "2", "--corrector", "refine", "--work", os.getcwd() + "/loop",
                              "--fixtures", FIXTURES, "--report", "report.html", "--json").stdout)
        means = [p["mean"] for p in loop["passes"]]
        check(len(means) == 2 and means[1] < means[0] - 0.5, f"loop means {means}")
        ids = ["passes", "loop-plot", "tolerances", "ab-plot", "de-histogram"]
    html = open("report.html").read()
    check("<script" not in html and "http" not in html.replace('xmlns="http://www.w3.org/2000/svg"', ""),
          "the report fetches or runs something")
    chromium = shutil.which("chromium") or shutil.which("chromium-browser")
    if not chromium:
        skip("no chromium (apt-get install chromium) to render the report in")
    flags = ["--headless", "--no-sandbox", "--disable-gpu", "--no-first-run", "--disable-background-networking",
             "--disable-component-update", "--disable-sync"]
    url = "file://" + os.path.abspath("report.html")
    dom = subprocess.run([chromium, *flags, f"--user-data-dir={tempfile.mkdtemp()}", "--dump-dom", url],
                         capture_output=True, text=True, timeout=120).stdout
    for i in ids:
        check(f'id="{i}"' in dom, f"rendered DOM has no {i}")
    check(dom.count("<circle") > 100 and dom.count('class="bar"') > 3, "the plots are empty")
    shot = os.path.join(WORK, f"{GROUP}-report.png")
    subprocess.run([chromium, *flags, f"--user-data-dir={tempfile.mkdtemp()}", f"--screenshot={shot}",
                    "--window-size=1200,2400", url], capture_output=True, timeout=120)
    check(os.path.exists(shot) and open(shot, "rb").read(8) == b"\x89PNG\r\n\x1a\n", f"no screenshot {shot}")
    print(f"screenshot: {shot}")

for f in failures:
    print("FAILED:", f)
sys.exit(1 if failures else 0)

"""Installs the build into a temporary prefix and packs it as a Debian package; from each, the
installed qensim is started and the installed qengui takes a screenshot against it.

Usage: package_test.py CMAKE CPACK BUILD_DIR WORK_DIR
"""
import os
import re
import select
import shutil
import subprocess
import sys
import time

CMAKE, CPACK, BUILD, WORK = sys.argv[1:5]
INSTALLED = [
    "bin/qengui",
    "bin/qensim",
    "share/applications/qengui.desktop",
    "share/icons/hicolor/scalable/apps/qengui.svg",
    "share/doc/qengui/README.md",
    "share/doc/qengui/guide/index.md",
    "share/doc/qengui/images/loopgrid.png",
]


def check(condition, text):
    if not condition:
        sys.exit("FAIL: " + text)


def run(args, timeout):
    done = subprocess.run(args, capture_output=True, text=True, timeout=timeout)
    check(done.returncode == 0, f"{' '.join(args)} exited {done.returncode}:\n{done.stdout}\n{done.stderr}")
    return done.stdout


def endpoint_of(sim):
    """The address qensim says it listens on, within ten seconds."""
    deadline = time.monotonic() + 10
    line = b""
    while time.monotonic() < deadline and b"\n" not in line:
        ready, _, _ = select.select([sim.stdout], [], [], 0.2)
        if ready:
            more = os.read(sim.stdout.fileno(), 4096)
            if not more:
                break
            line += more
    line = line.decode(errors="replace")
    found = re.search(r"listening on (\S+)", line)
    check(found is not None, f"qensim did not say where it listens: {line!r}")
    return found.group(1)


def screenshot_against_own_server(root, name):
    """The programs under `root` work together: a PNG of the main window comes out."""
    for path in INSTALLED:
        check(os.path.isfile(os.path.join(root, path)), f"{name}: {path} is not installed")
    data = os.path.join(WORK, name + "-data")
    os.makedirs(data, exist_ok=True)
    sim = subprocess.Popen([os.path.join(root, "bin/qensim"), "--port", "0", "--data-dir", data],
                           stdout=subprocess.PIPE, stderr=subprocess.DEVNULL)
    try:
        shot = os.path.join(WORK, name + ".png")
        env = dict(os.environ, QT_QPA_PLATFORM="offscreen")
        done = subprocess.run([os.path.join(root, "bin/qengui"), "--screenshot", shot, endpoint_of(sim)],
                              capture_output=True, text=True, timeout=120, env=env)
        check(done.returncode == 0, f"{name}: qengui --screenshot exited {done.returncode}: {done.stderr}")
        with open(shot, "rb") as png:
            check(png.read(8) == b"\x89PNG\r\n\x1a\n", f"{name}: the screenshot is not a PNG")
    finally:
        sim.terminate()
        sim.wait(timeout=10)


shutil.rmtree(WORK, ignore_errors=True)
os.makedirs(WORK)

prefix = os.path.join(WORK, "prefix")
run([CMAKE, "--install", BUILD, "--prefix", prefix], 300)
screenshot_against_own_server(prefix, "installed")

run([CPACK, "-G", "DEB", "--config", os.path.join(BUILD, "CPackConfig.cmake"), "-B", os.path.join(WORK, "deb")], 600)
debs = [f for f in os.listdir(os.path.join(WORK, "deb")) if f.endswith(".deb")]
check(len(debs) == 1, f"one package expected, found {debs}")
deb = os.path.join(WORK, "deb", debs[0])
depends = run(["dpkg-deb", "--field", deb, "Depends"], 60)
check("libqt6widgets6" in depends, f"the package does not depend on Qt's widgets: {depends!r}")
unpacked = os.path.join(WORK, "root")
run(["dpkg-deb", "--extract", deb, unpacked], 300)
screenshot_against_own_server(os.path.join(unpacked, "usr"), "packaged")
print("installed and packaged programs ran:", debs[0])

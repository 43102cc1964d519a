"""Scripts qensim through PyVISA (pyvisa-py backend) over its raw SCPI socket.

Usage: pyvisa_scpi_test.py QENSIM DATA_DIR
Starts qensim on free ports, then identifies, writes and reads parameters, reads the error
queue, and writes a segment's data as a binary block and reads it back. Exit code 0 on success.
"""
import os
import select
import subprocess
import sys

import pyvisa


def start_qensim(program, data_dir):
    sim = subprocess.Popen([program, "--port", "0", "--scpi-port", "0", "--quiet", "--data-dir", data_dir],
                           stdout=subprocess.PIPE)
    text = b""
    while text.count(b"\n") < 2:
        ready, _, _ = select.select([sim.stdout], [], [], 20)
        chunk = os.read(sim.stdout.fileno(), 4096) if ready else b""
        if not chunk:
            sim.kill()
            sys.exit("qensim printed no SCPI port within 20 s")
        text += chunk
    lines = text.decode().splitlines()
    if not lines[1].startswith("qensim SCPI on "):
        sim.kill()
        sys.exit("unexpected second line: %r" % lines[1])
    return sim, int(lines[1].rsplit(":", 1)[1])


def check(what, got, expected):
    if got != expected:
        raise AssertionError("%s: got %r, expected %r" % (what, got, expected))


def script(port):
    rm = pyvisa.ResourceManager("@py")
    inst = rm.open_resource("TCPIP::127.0.0.1::%d::SOCKET" % port, read_termination="\n",
                            write_termination="\n", timeout=5000)
    try:
        check("identity", inst.query("*IDN?").split(",")[:2], ["Corvane", "71300 qensim"])
        inst.write("CGR1:PER 2E-9")
        check("period", float(inst.query("CGR1:PER?")), 2e-9)
        check("coupled frequency", float(inst.query("CGR1:FREQ?")), 5e8)
        inst.write("CGR1:PER 5")
        check("first error", inst.query("SYST:ERR?"), '-222,"Data out of range"')
        check("empty queue", inst.query("SYST:ERR?"), '0,"No error"')
        check("event status", int(inst.query("*ESR?")), 128 | 16)

        seg = int(inst.query('EDIT:SEGM:OPEN? "pyvisa/demo"'))
        inst.write("EDIT:SEGM%d:PATT:MOD:INS 0,TRAC,BEF,8" % seg)
        inst.write("EDIT:SEGM%d:PATT:MOD:INS 0,VECT,BEF,64" % seg)
        rows = bytes((7 * i + 10) % 256 for i in range(64))  # holds line feeds and ';'
        inst.write_binary_values("EDIT:SEGM%d:PATT:DATA 0,0,7,63," % seg, rows, datatype="B", header_fmt="ieee")
        back = inst.query_binary_values("EDIT:SEGM%d:PATT:DATA? 0,0,7,63,BIN" % seg, datatype="B",
                                        container=bytes, header_fmt="ieee")
        check("segment data", back, rows)
        check("no error after the block", inst.query("SYST:ERR?"), '0,"No error"')
    finally:
        inst.close()
        rm.close()


def main():
    sim, port = start_qensim(sys.argv[1], sys.argv[2])
    try:
        script(port)
    finally:
        sim.terminate()
        sim.wait(10)
    print("PyVISA scripted qensim on port %d" % port)


if __name__ == "__main__":
    main()

"""Scripts qensim through PyVISA (pyvisa-py backend) over its raw SCPI socket.

Usage: pyvisa_scpi_test.py QENSIM DATA_DIR [SCRIPTING_MD]
Starts qensim on free ports, then identifies, writes and reads parameters, reads the error
queue, and writes a segment's data as a binary block and reads it back; scripts a whole test
(levels, a segment from a list, a sequence with a loop, run, *OPC?, error counts per port,
stop); and runs the Python example of docs/scripting.md as written. Exit code 0 on success.
"""
import os
import re
import select
import subprocess
import sys

import pyvisa
from scpi_checks import block_round_trip, check


def start_qensim(program, data_dir):
    sim = subprocess.Popen([program, "--port", "0", "--scpi-port", "0", "--quiet", "--test-control",
                            "--data-dir", data_dir],
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

        block_round_trip(inst, "pyvisa/demo", 64)
    finally:
        inst.close()
        rm.close()


GENERATORS = ["CGR1:MOD1:CONN1", "CGR1:MOD1:CONN2", "CGR2:MOD1:CONN1", "CGR2:MOD1:CONN2"]
ANALYSERS = ["CGR1:MOD3:CONN1", "CGR1:MOD3:CONN2", "CGR2:MOD2:CONN1", "CGR2:MOD2:CONN2"]


def block(length, segment):
    """A sequence block in which the ten data ports of the built-in rack play `segment`."""
    return "(BLOCK,0,%d,0,\"\",()%s)" % (length, ",%s,0,0" % segment * 10)


def whole_test(port):
    rm = pyvisa.ResourceManager("@py")
    inst = rm.open_resource("TCPIP::127.0.0.1::%d::SOCKET" % port, read_termination="\n",
                            write_termination="\n", timeout=5000)
    try:
        inst.write("*RST;*CLS")
        for gen in GENERATORS:
            inst.write("%s:VOLTage:AMPLitude 800 mV;%s:VOLT:OFFS 0.4 V" % (gen, gen))
        for ana in ANALYSERS:
            inst.write("%s:VOLT:THReshold 400 mV" % ana)
        check("levels", inst.query("CGR2:MOD1:CONN2:VOLT:HIGH?;CGR2:MOD2:CONN2:VOLT:THR?"),
              "8.000000000000E-01;4.000000000000E-01")

        seg = int(inst.query('EDIT:SEGM:OPEN? "pyvisa/list"'))
        inst.write("EDIT:SEGM%d:PATT:MOD:INS 0,TRAC,BEF,8;EDIT:SEGM%d:PATT:MOD:INS 0,VECT,BEF,64" % (seg, seg))
        rows = [(5 * i + 3) % 256 for i in range(64)]
        inst.write_binary_values("EDIT:SEGM%d:PATT:DATA 0,0,7,63," % seg, rows, datatype="B", header_fmt="ieee")
        inst.write("EDIT:SEGM%d:SAVE;EDIT:SEGM%d:CLOS" % (seg, seg))

        sequence = '(3.0,"start",(SEQ,%s,"loop",(LOOP1,0,5,"",%s)))' % (block(64, '"pyvisa/list"'),
                                                                        block(64, "PAUSE1"))
        inst.write("SGEN:GLOB:SEQ " + sequence)
        check("sequence", inst.query("SGEN:GLOB:SEQ?"), sequence)
        check("no error before the run", inst.query("SYST:ERR:COUN?"), "0")

        inst.write("%s:BER:INJ 1E-3" % ANALYSERS[0])
        inst.write("SGEN:GLOB:INIT:CONT ON")
        check("synchronised", inst.query("*OPC?;SGEN:GLOB:SYST:STAT?;STAT:OPER:COND?"), "1;RUNN;16")
        inst.write("SGEN:GLOB:INIT:CONT OFF")
        counts = [inst.query("%s:BER?" % ana).split(",") for ana in ANALYSERS]
        for ana, (compared, errors, _) in zip(ANALYSERS, counts):
            if int(compared) <= 0:
                raise AssertionError("%s compared no bits: %r" % (ana, counts))
        # The injected ratio stands out; the other ports keep their own small ones.
        if float(counts[0][2]) < 1000 * max(float(c[2]) for c in counts[1:]):
            raise AssertionError("the injected port does not stand out: %r" % counts)
        check("stopped", inst.query("STAT:OPER:COND?;SYST:ERR:COUN?"), "0;0")
    finally:
        inst.close()
        rm.close()


def documented_example(port, markdown):
    """The Python example of the scripting document, run as written on this qensim's port."""
    with open(markdown, encoding="utf-8") as f:
        text = f.read()
    code = re.search(r"```python\n(.*?)```", text, re.S).group(1)
    exec(compile(code.replace("5025", str(port)), markdown, "exec"), {})


def main():
    sim, port = start_qensim(sys.argv[1], sys.argv[2])
    try:
        script(port)
        whole_test(port)
        if len(sys.argv) > 3:
            documented_example(port, sys.argv[3])
    finally:
        sim.terminate()
        sim.wait(10)
    print("PyVISA scripted qensim on port %d" % port)


if __name__ == "__main__":
    main()

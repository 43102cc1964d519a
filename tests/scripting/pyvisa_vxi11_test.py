"""Scripts qensim through PyVISA (pyvisa-py backend) over VXI-11, and checks the RPC edges.

Usage: pyvisa_vxi11_test.py QENSIM DATA_DIR SCRIPTING_DOC
Runs the VXI-11 example of the scripting document exactly as written: first against a qensim
that registered with a port mapper on port 111 (a stand-in for the machine's, where pyvisa-py
asks), then against a qensim that answers the port mapper on 111 itself; where 111 cannot be
had, the registration is not checked and pyvisa-py is pointed at qensim's port mapper on a free
port instead. Then speaks ONC RPC to qensim itself
to check what PyVISA does not reach: fragments, wrong programs, bad links, partial reads, the
status byte and device clear. Exit code 0 on success.
"""
import os
import re
import select
import socket
import struct
import subprocess
import sys
import threading

from pyvisa_py.protocols import rpc
from scpi_checks import block_round_trip, check

CORE_PROG, CORE_VERS = 0x0607AF, 1


def start_qensim(program, data_dir, *args, lines=3):
    """qensim with the VXI-11 channel and `args`; (process, {line name: port}), or (None, why)."""
    sim = subprocess.Popen([program, "--port", "0", "--vxi11-port", "0", "--quiet", "--data-dir", data_dir] + list(args),
                           stdout=subprocess.PIPE, stderr=subprocess.PIPE)
    text = b""
    while text.count(b"\n") < lines:
        ready, _, _ = select.select([sim.stdout], [], [], 20)
        chunk = os.read(sim.stdout.fileno(), 4096) if ready else b""
        if not chunk:
            sim.kill()
            return None, sim.stderr.read().decode()
        text += chunk
    ports = {}
    for line in text.decode().splitlines():
        name, _, endpoint = line.rpartition(" on ")
        ports[name] = int(endpoint.rsplit(":", 1)[1])
    return sim, ports


class FakePortMapper(threading.Thread):
    """The machine's port mapper on 127.0.0.1:111: takes SET and UNSET, answers GETPORT."""

    def __init__(self):
        super().__init__(daemon=True)
        self.listener = socket.create_server(("127.0.0.1", 111))
        self.calls = []
        self.ports = {}

    def run(self):
        while True:
            try:
                conn, _ = self.listener.accept()
            except OSError:
                return
            with conn:
                self.serve(conn)

    def serve(self, conn):
        while True:
            mark = conn.recv(4, socket.MSG_WAITALL)
            if len(mark) < 4:
                return
            record = conn.recv(struct.unpack(">I", mark)[0] & 0x7FFFFFFF, socket.MSG_WAITALL)
            xid, _, _, _, _, proc = struct.unpack(">6I", record[:24])
            prog, vers, prot, port = struct.unpack(">4I", record[40:56])
            self.calls.append((proc, prog, vers, prot, port))
            if proc == 1:
                self.ports[(prog, vers, prot)] = port
                result = 1
            elif proc == 2:
                result = 1 if self.ports.pop((prog, vers, prot), None) is not None else 0
            else:
                result = self.ports.get((prog, vers, prot), 0)
            reply = struct.pack(">7I", xid, 1, 0, 0, 0, 0, result)
            conn.sendall(struct.pack(">I", 0x80000000 | len(reply)) + reply)

    def close(self):
        # Shutting the listener down wakes the accept that a close alone would leave waiting.
        self.listener.shutdown(socket.SHUT_RDWR)
        self.listener.close()
        self.join(5)


def registration(program, data_dir, doc):
    """qensim registers with the machine's port mapper, PyVISA finds it there, and the
    registration goes at the end; with no port mapper, qensim says so and serves all the same."""
    try:
        mapper = FakePortMapper()
    except OSError as e:
        print("port 111 cannot be had (%s): the registration is not checked" % e)
        return False
    mapper.start()
    try:
        sim, ports = start_qensim(program, data_dir, lines=3)
        check("qensim with a port mapper", sim is not None, True)
        vxi11 = ports["qensim VXI-11"]
        check("registered line", ports.get("qensim VXI-11 registered with the port mapper"), 111)
        check("SET", mapper.calls, [(1, CORE_PROG, 1, 6, vxi11)])
        try:
            exec(compile(doc_example(doc), doc + " (VXI-11 example)", "exec"), {"__name__": "doc_example"})
        finally:
            sim.terminate()
            sim.wait(10)
        check("UNSET at the end", mapper.calls[-1], (2, CORE_PROG, 1, 6, vxi11))
        check("nothing left registered", mapper.ports, {})
    finally:
        mapper.close()
    sim, ports = start_qensim(program, data_dir, lines=2)
    try:
        check("qensim without a port mapper", sim is not None, True)
        sim.terminate()
        sim.wait(10)
        check("says it is not registered", "is not registered with a port mapper on 127.0.0.1:111" in
              sim.stderr.read().decode(), True)
    finally:
        sim.kill()
    return True




def doc_example(path):
    text = open(path, encoding="utf-8").read()
    section = text[text.index("## VXI-11"):]
    return re.search(r"```python\n(.*?)```", section, re.S).group(1)


class Rpc:
    """A bare ONC RPC client over TCP that sends a call in the fragments it is given."""

    def __init__(self, port):
        self.sock = socket.create_connection(("127.0.0.1", port), timeout=5)
        self.xid = 0

    def call(self, prog, vers, proc, args=b"", pieces=1):
        self.xid += 1
        body = struct.pack(">IIIIIIIIII", self.xid, 0, 2, prog, vers, proc, 0, 0, 0, 0) + args
        cut = [len(body) * i // pieces for i in range(pieces + 1)]
        for i in range(pieces):
            frag = body[cut[i]:cut[i + 1]]
            last = 0x80000000 if i == pieces - 1 else 0
            self.sock.sendall(struct.pack(">I", last | len(frag)) + frag)
        return self.reply()

    def reply(self):
        mark = struct.unpack(">I", self.recv(4))[0]
        check("one fragment", mark & 0x80000000, 0x80000000)
        record = self.recv(mark & 0x7FFFFFFF)
        xid, mtype, stat = struct.unpack(">III", record[:12])
        check("reply xid", (xid, mtype), (self.xid, 1))
        if stat != 0:
            return ("denied",) + struct.unpack(">%dI" % ((len(record) - 12) // 4), record[12:])
        accept = struct.unpack(">I", record[20:24])[0]
        return accept, record[24:]

    def recv(self, n):
        data = b""
        while len(data) < n:
            chunk = self.sock.recv(n - len(data))
            if not chunk:
                raise AssertionError("qensim closed the RPC connection")
            data += chunk
        return data


def opaque(data):
    return struct.pack(">I", len(data)) + data + b"\0" * ((4 - len(data) % 4) % 4)


def rpc_edges(vxi11_port, mapper_port):
    mapper = Rpc(mapper_port)
    check("GETPORT of the core channel", mapper.call(100000, 2, 3, struct.pack(">IIII", CORE_PROG, 1, 6, 0)),
          (0, struct.pack(">I", vxi11_port)))
    check("GETPORT over UDP", mapper.call(100000, 2, 3, struct.pack(">IIII", CORE_PROG, 1, 17, 0)),
          (0, struct.pack(">I", 0)))
    check("GETPORT of another version", mapper.call(100000, 2, 3, struct.pack(">IIII", CORE_PROG, 2, 6, 0)),
          (0, struct.pack(">I", 0)))
    check("port mapper SET", mapper.call(100000, 2, 1, struct.pack(">IIII", 1, 1, 6, 1))[0], 3)
    check("core program on the mapper", mapper.call(CORE_PROG, 1, 10)[0], 1)

    core = Rpc(vxi11_port)
    check("core program version 3", core.call(CORE_PROG, 3, 10)[0], 2)
    check("create_link truncated", core.call(CORE_PROG, 1, 10, struct.pack(">ii", 1, 0))[0], 4)
    check("unknown procedure", core.call(CORE_PROG, 1, 21)[0], 3)
    check("unknown device", core.call(CORE_PROG, 1, 10, struct.pack(">iiI", 7, 0, 0) + opaque(b"gpib0,5")),
          (0, struct.pack(">iiII", 3, 0, 0, 1024)))
    status, body = core.call(CORE_PROG, 1, 10, struct.pack(">iiI", 7, 0, 0) + opaque(b"inst0"), pieces=3)
    error, link, _, max_recv = struct.unpack(">iiII", body)
    check("create_link in three fragments", (status, error, max_recv), (0, 0, 1024))
    bad = link + 1

    def write(data, flags=8, lid=link):
        return core.call(CORE_PROG, 1, 11, struct.pack(">iIIi", lid, 1000, 0, flags) + opaque(data))

    def read(size, flags=0, term=0, lid=link, timeout=1000):
        status, body = core.call(CORE_PROG, 1, 12, struct.pack(">iIIIii", lid, size, timeout, 0, flags, term))
        error, reason, length = struct.unpack(">iiI", body[:12])
        return status, error, reason, body[12:12 + length]

    def stb():
        return struct.unpack(">iI", core.call(CORE_PROG, 1, 13, struct.pack(">iiII", link, 0, 0, 0))[1])

    check("write on a bad link", write(b"*IDN?", lid=bad), (0, struct.pack(">iI", 4, 0)))
    check("read on a bad link", read(10, lid=bad), (0, 4, 0, b""))
    check("read with nothing to read", read(10), (0, 15, 0, b""))
    check("status byte, nothing waiting", stb(), (0, 0))
    # A message in two writes runs when END comes; a line feed inside ends a message too.
    check("write without END", write(b"*IDN?;*OPC", flags=0), (0, struct.pack(">iI", 0, 10)))
    check("nothing before END", read(100), (0, 15, 0, b""))
    check("END", write(b"?\n*OPC?"), (0, struct.pack(">iI", 0, 7)))
    check("message available", stb(), (0, 0x10))
    idn = read(4)
    check("request count", idn[:3], (0, 0, 1))
    check("identity begins", idn[3], b"Corv")
    rest = read(1000, flags=128, term=ord(","))
    check("termination character", rest[:4], (0, 0, 2, b"ane,"))
    rest = read(1000)
    check("end of the first response", (rest[:3], rest[3].endswith(b";1\n")), ((0, 0, 4), True))
    check("second response whole", read(1000), (0, 0, 4, b"1\n"))
    check("status byte, read out", stb(), (0, 0))
    write(b"CGR1:PER 5")
    check("error queue bit", stb(), (0, 0x04))
    write(b"*IDN?")
    check("device clear", core.call(CORE_PROG, 1, 15, struct.pack(">iiII", link, 0, 0, 0)),
          (0, struct.pack(">i", 0)))
    check("clear drops the response", read(100), (0, 15, 0, b""))
    check("clear keeps the status", stb(), (0, 0x04))
    write(b"SYST:ERR?")
    check("the error through VXI-11", read(100), (0, 0, 4, b'-222,"Data out of range"\n'))
    # A read waits for a parked *OPC? until its io_timeout; a run synchronises for 500 ms.
    write(b"SGEN:GLOB:INIT:CONT ON;*OPC?")
    check("a read waits out a short io_timeout", read(100, timeout=100), (0, 15, 0, b""))
    check("the answer once synchronised", read(100), (0, 0, 4, b"1\n"))
    write(b"SGEN:GLOB:INIT:CONT OFF")
    # A link keeps 1024 responses; the oldest beyond them go, each with -410 queued.
    for _ in range(7):
        write(b"*OPC?\n" * 146, flags=0)
    write(b"*OPC?\n*OPC?\n*OPC?")
    kept = 0
    while read(100) == (0, 0, 4, b"1\n"):
        kept += 1
    check("responses kept", kept, 1024)
    write(b"SYST:ERR?")
    check("interrupted query", read(100), (0, 0, 4, b'-410,"Query INTERRUPTED"\n'))
    write(b"SYST:ERR?")
    check("one interrupted query", read(100), (0, 0, 4, b'0,"No error"\n'))
    check("trigger not supported", core.call(CORE_PROG, 1, 14, struct.pack(">iiII", link, 0, 0, 0)),
          (0, struct.pack(">i", 8)))
    check("destroy_link", core.call(CORE_PROG, 1, 23, struct.pack(">i", link)), (0, struct.pack(">i", 0)))
    check("destroyed link", read(10), (0, 4, 0, b""))
    core.xid += 1
    core.sock.sendall(struct.pack(">I", 0x80000000 | 40) + struct.pack(">IIIIIIIIII", core.xid, 0, 3, CORE_PROG, 1,
                                                                      10, 0, 0, 0, 0))
    check("RPC version 3 denied", core.reply(), ("denied", 0, 2, 2))
    # A record above the limit ends the connection instead of being read without end.
    core.sock.sendall(struct.pack(">I", 0x80000000 | (1 << 30)))
    core.sock.settimeout(5)
    check("oversized record closes", core.sock.recv(1), b"")


def long_block():
    """A message longer than the device's largest write goes in pieces, the last with END."""
    import pyvisa
    rm = pyvisa.ResourceManager("@py")
    inst = rm.open_resource("TCPIP::127.0.0.1::INSTR", read_termination="\n", timeout=5000)
    try:
        block_round_trip(inst, "vxi11/block", 3000)
    finally:
        inst.close()
        rm.close()


def main():
    program, data_dir, doc = sys.argv[1:4]
    registered = registration(program, data_dir, doc)
    sim, ports = start_qensim(program, data_dir, "--portmap-port", "111")
    exact = sim is not None
    if not exact:
        sim, ports = start_qensim(program, data_dir, "--portmap-port", "0")
        if sim is None:
            sys.exit("qensim did not start: " + ports)
        rpc.PMAP_PORT = ports["qensim port mapper"]
    try:
        exec(compile(doc_example(doc), doc + " (VXI-11 example)", "exec"), {"__name__": "doc_example"})
        long_block()
        rpc_edges(ports["qensim VXI-11"], ports["qensim port mapper"])
    finally:
        sim.terminate()
        sim.wait(10)
    print("PyVISA scripted qensim over VXI-11 (port mapper on %d, example %s; registration %s)"
          % (ports["qensim port mapper"], "as written" if exact else "with pyvisa-py pointed at it",
             "checked" if registered else "not checked"))


if __name__ == "__main__":
    main()

"""Soak test of qensim: 8 clients on one server for a given time.

Usage: soak.py QENSIM SECONDS

Each client speaks the framed protocol over its own connection and, at random, reads and
writes parameters (read back in the same frame), writes a page of its own segment and reads
it back, takes the lock to write the sequence and read it back, takes and releases the lock
alone, and writes a system profile value of its own that it checks on the next round. Client
0 is killed (SIGKILL) and started again at random moments. The run ends by itself, prints the
requests, refusals (the lock held by another client) and errors, and qensim's resident memory
at the start, after the warm-up (the first tenth of the run) and at the end. It fails on any
protocol error or lost write, and when the memory grew by more than 10 % after the warm-up.
"""
import multiprocessing
import os
import random
import re
import select
import signal
import socket
import struct
import subprocess
import sys
import time

CLIENTS = 8
TIMEOUT = 30
HEADER = struct.Struct(">2sBBIiI")
LOCKED = -19
TRACES, VECTORS, PAGE = 64, 4096, 256


class ProtocolError(Exception):
    pass


class Client:
    # `counts` are this client's own slots (requests, refused, errors): no lock is shared, so
    # killing a client can never leave one held.
    def __init__(self, port, number, counts, deadline):
        self.sock = socket.create_connection(("127.0.0.1", port), timeout=TIMEOUT)
        self.sock.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
        self.number = number
        self.counts = counts
        self.deadline = deadline + TIMEOUT
        self.next_id = 1
        self.rng = random.Random(os.getpid() ^ int(time.time() * 1e6))
        self.handle = self.create_handle()
        self.profile = None

    # Refused while another client holds the lock; asked again until it is free.
    def create_handle(self):
        while True:
            reply = self.ok(':QEN:INST:HAND:CRE? SOAK%d,"PSX","SOAK"' % self.number, True)
            if reply is not None:
                return reply.decode()
            if time.monotonic() > self.deadline:
                raise ProtocolError("the lock was never free to create a handle")

    def recv_exact(self, n):
        data = b""
        while len(data) < n:
            chunk = self.sock.recv(n - len(data))
            if not chunk:
                raise ProtocolError("connection closed by qensim")
            data += chunk
        return data

    def call(self, text):
        payload = text if isinstance(text, bytes) else text.encode()
        rid = self.next_id
        self.next_id += 1
        self.sock.sendall(HEADER.pack(b"QN", 1, 0, rid, 0, len(payload)) + payload)
        magic, kind, flags, got, status, length = HEADER.unpack(self.recv_exact(HEADER.size))
        if magic != b"QN" or kind != 2 or flags != 0 or got != rid or length > 16 << 20:
            raise ProtocolError("bad reply header for %r" % text[:60])
        reply = self.recv_exact(length)
        self.counts[0] += 1
        if status == LOCKED:
            self.counts[1] += 1
        return status, reply

    # A call that must succeed, or be refused because another client holds the lock.
    def ok(self, text, may_be_locked=False):
        status, reply = self.call(text)
        if status == LOCKED and may_be_locked:
            return None
        if status != 0:
            errors = []
            while status > 0:
                _, entry = self.call(":%s:SYST:ERR?" % self.handle)
                if entry.startswith(b"0,"):
                    break
                errors.append(entry.decode(errors="replace"))
            raise ProtocolError("status %d for %r: %s" % (status, text[:80], errors))
        return reply

    def h(self, rest):
        return ":" + self.handle + rest

    def parameters(self):
        period = self.rng.uniform(1e-10, 1e-6)
        reply = self.ok(self.h(":CGR1:PER %.12E;" % period) + self.h(":CGR1:PER?;") + self.h(":CGR1:FREQ?"), True)
        if reply is None:
            return
        back, freq = (float(x) for x in reply.split(b";"))
        if abs(back - float("%.12E" % period)) > 1e-12 * period or abs(freq * back - 1) > 1e-9:
            raise ProtocolError("parameter write lost: wrote %.12E, read %r" % (period, reply))

    def segment_page(self):
        name = '"soak/c%d"' % self.number
        seg = self.ok(self.h(":EDIT:SEGM:OPEN? " + name), True)
        if seg is None:
            return
        seg = int(seg)
        length = self.ok(self.h(":EDIT:SEGM%d:PATT:LENG?" % seg), True)
        if length is None:
            return
        if int(length) == 0:
            if self.ok(self.h(":EDIT:SEGM%d:PATT:MOD:INS 0,TRAC,BEF,%d;" % (seg, TRACES)) +
                       self.h(":EDIT:SEGM%d:PATT:MOD:INS 0,VECT,BEF,%d" % (seg, VECTORS)), True) is None:
                return
        first = self.rng.randrange(0, VECTORS - PAGE + 1, PAGE)
        rows = bytes(self.rng.getrandbits(8) for _ in range(TRACES * PAGE // 8))
        where = "%d,%d,%d,%d" % (0, first, TRACES - 1, first + PAGE - 1)
        block = b"#5%05d" % len(rows) + rows
        if self.ok(self.h(":EDIT:SEGM%d:PATT:DATA %s," % (seg, where)).encode() + block, True) is None:
            return
        back = self.ok(self.h(":EDIT:SEGM%d:PATT:DATA? %s,BIN" % (seg, where)), True)
        if back is not None and back != block:
            raise ProtocolError("segment page lost at vector %d" % first)
        self.ok(self.h(":EDIT:SEGM%d:CLOS" % seg), True)

    def sequence(self):
        if self.ok(self.h(":SYST:LOCK ON"), True) is None:
            return
        try:
            current = self.ok(self.h(":SGEN:GLOB:SEQ?")).decode()
            label = "c%d-%d" % (self.number, self.rng.getrandbits(30))
            expr, count = re.subn(r'^\(([^,]*),"[^"]*",', '(\\1,"%s",' % label, current)
            if count != 1:
                raise ProtocolError("unexpected sequence %r" % current[:80])
            self.ok(self.h(":SGEN:GLOB:SEQ " + expr))
            if self.ok(self.h(":SGEN:GLOB:SEQ?")).decode() != expr:
                raise ProtocolError("sequence write lost under the lock")
        finally:
            self.ok(self.h(":SYST:LOCK OFF"))

    def lock_alone(self):
        if self.ok(self.h(":SYST:LOCK ON"), True) is None:
            return
        held = self.ok(self.h(":SYST:LOCK?"))
        self.ok(self.h(":SYST:LOCK OFF"))
        if held != b"ON":
            raise ProtocolError("the lock was not held after it was taken")

    def profile_value(self):
        key = '"soak-c%d"' % self.number
        if self.profile is not None:
            back = self.ok(self.h(":CONF:PROF? " + key), True)
            if back is not None and back != self.profile:
                raise ProtocolError("profile write lost: %r, read %r" % (self.profile, back))
        value = b"(%di)" % self.rng.getrandbits(31)
        if self.ok(self.h(":CONF:PROF %s," % key).encode() + value, True) is not None:
            self.profile = value

    def run(self, deadline):
        work = [self.parameters, self.segment_page, self.sequence, self.lock_alone, self.profile_value]
        while time.monotonic() < deadline:
            self.rng.choice(work)()


class Slots:
    """A client's three counters inside the shared array."""

    def __init__(self, array, number):
        self.array = array
        self.base = 3 * number

    def __getitem__(self, i):
        return self.array[self.base + i]

    def __setitem__(self, i, value):
        self.array[self.base + i] = value


def client_main(port, number, array, report, deadline):
    counts = Slots(array, number)
    try:
        Client(port, number, counts, deadline).run(deadline)
    except (ProtocolError, OSError, ValueError) as e:
        counts[2] += 1
        report.send("client %d: %s" % (number, e))


def resident_kb(pid):
    with open("/proc/%d/status" % pid) as f:
        for line in f:
            if line.startswith("VmRSS:"):
                return int(line.split()[1])
    return 0


def start_qensim(program, data_dir):
    sim = subprocess.Popen([program, "--port", "0", "--quiet", "--data-dir", data_dir], stdout=subprocess.PIPE)
    ready, _, _ = select.select([sim.stdout], [], [], 20)
    line = os.read(sim.stdout.fileno(), 4096).decode() if ready else ""
    if not line.startswith("qensim listening on "):
        sim.kill()
        sys.exit("qensim did not start")
    return sim, int(line.split()[-1].rsplit(":", 1)[1])


def main():
    program, seconds = sys.argv[1], float(sys.argv[2])
    data_dir = os.path.join(os.path.dirname(os.path.abspath(program)), "soak-data")
    sim, port = start_qensim(program, data_dir)
    start_kb = resident_kb(sim.pid)
    # Per client: requests, refused (locked), errors. Each client writes only its own slots and
    # its failures into its own pipe, so a client killed at any moment blocks nobody.
    counts = multiprocessing.Array("q", 3 * CLIENTS, lock=False)
    reports = []
    begin = time.monotonic()
    deadline = begin + seconds

    def spawn(number):
        receive, send = multiprocessing.Pipe(duplex=False)
        reports.append(receive)
        p = multiprocessing.Process(target=client_main, args=(port, number, counts, send, deadline))
        p.start()
        send.close()
        return p

    clients = [spawn(n) for n in range(CLIENTS)]
    kills = 0
    warm_kb = None
    rng = random.Random(1)
    while time.monotonic() < deadline:
        time.sleep(min(rng.uniform(0.5, 3.0), max(0.0, deadline - time.monotonic())))
        if warm_kb is None and time.monotonic() - begin >= seconds / 10:
            warm_kb = resident_kb(sim.pid)
        if time.monotonic() < deadline - 1:
            os.kill(clients[0].pid, signal.SIGKILL)
            clients[0].join()
            kills += 1
            clients[0] = spawn(0)
    failures = []
    for p in clients:
        p.join(TIMEOUT + 10)
        if p.is_alive():
            p.kill()
            failures.append("a client did not end")
    for r in reports:
        while r.poll():
            try:
                failures.append(r.recv())
            except EOFError:
                break
    requests, refused = sum(counts[0::3]), sum(counts[1::3])
    errors = sum(counts[2::3]) + sum(1 for f in failures if f == "a client did not end")
    alive = sim.poll() is None
    end_kb = resident_kb(sim.pid) if alive else 0
    sim.terminate()
    sim.wait(10)
    warm_kb = warm_kb or start_kb
    growth = 100.0 * (end_kb - warm_kb) / warm_kb
    print("soak: %d clients, %.0f s, client 0 killed and restarted %d times" % (CLIENTS, seconds, kills))
    print("soak: %d requests, %d refused while another client held the lock, %d errors"
          % (requests, refused, errors))
    print("soak: qensim resident memory %d kB at the start, %d kB after the warm-up, %d kB at the end (%+.1f %%)"
          % (start_kb, warm_kb, end_kb, growth))
    for f in failures:
        print("soak: " + f)
    if not alive:
        sys.exit("soak: FAILED, qensim died")
    if errors > 0 or growth > 10.0:
        sys.exit("soak: FAILED")
    print("soak: passed")


if __name__ == "__main__":
    main()

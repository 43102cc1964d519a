"""What the PyVISA scripts share: a checked comparison and a segment block's round trip."""


def check(what, got, expected):
    if got != expected:
        raise AssertionError("%s: got %r, expected %r" % (what, got, expected))


def block_round_trip(inst, name, vectors):
    """Writes `vectors` rows of 8 traces into a new segment as one IEEE block and reads them back."""
    seg = int(inst.query('EDIT:SEGM:OPEN? "%s"' % name))
    inst.write("EDIT:SEGM%d:PATT:MOD:INS 0,TRAC,BEF,8" % seg)
    inst.write("EDIT:SEGM%d:PATT:MOD:INS 0,VECT,BEF,%d" % (seg, vectors))
    rows = bytes((7 * i + 10) % 256 for i in range(vectors))  # holds line feeds and ';'
    last = vectors - 1
    inst.write_binary_values("EDIT:SEGM%d:PATT:DATA 0,0,7,%d," % (seg, last), rows, datatype="B", header_fmt="ieee")
    back = inst.query_binary_values("EDIT:SEGM%d:PATT:DATA? 0,0,7,%d,BIN" % (seg, last), datatype="B",
                                    container=bytes, header_fmt="ieee")
    check("%d bytes written and read back" % vectors, back, rows)
    check("no error after the block", inst.query("SYST:ERR?"), '0,"No error"')

#!/usr/bin/env python3
"""Writes a gate-level Verilog netlist of about SIZE megabytes for the reader benchmark.

Cell instances with escaped names fill a few block modules; the top module comes last, with
a non-ANSI header of 500 ports, so a run has to index the whole file before it finds it.
Usage: verilog_netlist_gen.py SIZE_MB OUTPUT
"""
import random
import sys

CELLS = [("NAND2X1", ["A", "B"], "Y"), ("NOR2X2", ["A", "B"], "Y"), ("INVX1", ["A"], "Y"),
         ("AOI21X1", ["A0", "A1", "B0"], "Y"), ("DFFRX1", ["D", "CK", "RN"], "Q"),
         ("MUX2X1", ["A", "B", "S0"], "Y")]
TOP_PORTS = 500


def net(rng, block):
    n = rng.randrange(100000)
    if n % 3 == 0:
        return "\\%s/u_alu/n[%d] " % (block, n)
    return "n%d" % n


def block_module(rng, name, budget, out):
    out.write("module %s (clk, rst_n, din, dout);\n" % name)
    out.write("  input clk, rst_n;\n  input [31:0] din;\n  output [31:0] dout;\n")
    out.write("  wire %s;\n" % ", ".join("n%d" % i for i in range(64)))
    written = 0
    i = 0
    while written < budget:
        cell, inputs, output = CELLS[i % len(CELLS)]
        pins = ", ".join(".%s(%s)" % (pin, net(rng, name)) for pin in inputs)
        line = "  %s \\%s/u_core/U%d[%d]  ( %s, .%s(%s) );\n" % (
            cell, name, i, i % 8, pins, output, net(rng, name))
        out.write(line)
        written += len(line)
        i += 1
    out.write("endmodule\n\n")
    return i


def top_module(rng, blocks, out):
    names = ["p%d" % i for i in range(TOP_PORTS)]
    out.write("module top (\n  %s);\n" % ",\n  ".join(names))
    for i, port in enumerate(names):
        direction = ("input", "output", "inout")[i % 3]
        width = "" if i % 4 == 0 else " [%d:0]" % (i % 32)
        out.write("  %s%s %s;\n" % (direction, width, port))
    for i, block in enumerate(blocks):
        out.write("  %s \\u_%s  (.clk(p0), .rst_n(p3), .din(p1[%d:0]), .dout());\n"
                  % (block, block, i % 2))
    out.write("endmodule\n")


def main():
    size = int(float(sys.argv[1]) * 1000000)
    rng = random.Random(1)
    blocks = ["blk%d" % i for i in range(8)]
    with open(sys.argv[2], "w") as out:
        out.write("`timescale 1ns/1ps\n// generated netlist\n")
        for block in blocks:
            block_module(rng, block, size // len(blocks), out)
        top_module(rng, blocks, out)


if __name__ == "__main__":
    main()

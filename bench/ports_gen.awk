# Writes a VHDL entity named ports_bench with N ports (awk -v n=N): a mix of inputs, outputs
# and inouts, single bits and buses of falling and rising ranges.
BEGIN {
  if (n == "") n = 100000
  print "library ieee;"
  print "use ieee.std_logic_1164.all;"
  print ""
  print "entity ports_bench is"
  print "  port ("
  split("in out inout buffer", dirs, " ")
  for (i = 0; i < n; i++) {
    dir = dirs[i % 4 + 1]
    kind = i % 3
    if (kind == 0) type = "std_logic"
    else if (kind == 1) type = sprintf("std_logic_vector(%d downto 0)", i % 32)
    else type = sprintf("std_logic_vector(0 to %d)", i % 16)
    printf "    p%06d : %s %s%s\n", i, dir, type, (i + 1 < n ? ";" : "")
  }
  print "  );"
  print "end entity ports_bench;"
}

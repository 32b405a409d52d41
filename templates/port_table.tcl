# Writes the port table of the design unit to the output file: one row per port with its
# direction, width and range, then the totals.
set out [open $OutputFileName w]
puts $out "Port table of $ModuleName (project $ProjectName)"
puts $out [format "%-12s %-6s %5s  %s" Port Dir Width Range]
set pins 0
for {set i 0} {$i < $TotalPorts} {incr i} {
  set left [lindex $LeftRange $i]
  set right [lindex $RightRange $i]
  if {$left == -1} {
    set width 1
    set range "-"
  } else {
    set width [expr {abs($left - $right) + 1}]
    set range [expr {$left > $right ? "$left downto $right" : "$left to $right"}]
  }
  switch -- [lindex $PortDir $i] {
    I {set dir in}
    B {set dir inout}
    default {set dir out}
  }
  puts $out [format "%-12s %-6s %5d  %s" [lindex $PortName $i] $dir $width $range]
  incr pins $width
}
puts $out "$TotalPorts ports, $pins pins"
close $out

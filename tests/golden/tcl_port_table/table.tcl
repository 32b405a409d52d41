set out [open $OutputFileName w]
puts $out "$ModuleName: $TotalPorts ports (project $ProjectName, from $InputFileName)"
for {set i 0} {$i < $TotalPorts} {incr i} {
  puts $out [format "%-6s %s %4d %4d" [lindex $PortName $i] [lindex $PortDir $i] \
      [lindex $LeftRange $i] [lindex $RightRange $i]]
}
close $out

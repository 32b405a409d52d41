# Every port list and every generic list has one item per port or generic.
set out [open $OutputFileName w]
foreach list {PortName LeftRange RightRange PortDir PortType} {
  puts $out "$list [expr {[llength [set $list]] == $TotalPorts}]"
}
foreach list {GenericName GenericType GenericDefault GenericValue} {
  puts $out "$list [expr {[llength [set $list]] == $TotalGenerics}]"
}
puts $out "$TotalPorts ports, $TotalGenerics generics, $Language"
close $out

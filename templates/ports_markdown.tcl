# Writes a Markdown section documenting the design unit: its generics and its ports as tables.
# A "|" in a name or type is escaped so that it cannot split a table cell.
proc cell {text} {
  if {$text eq ""} { return "" }
  return "`[string map {| \\| ` ' \n " " \r ""} $text]`"
}

proc direction {letter} {
  switch -- $letter {
    I { return in }
    B { return inout }
    default { return out }
  }
}

set out [open $OutputFileName w]
fconfigure $out -translation lf
puts $out "# $ModuleName"
puts $out ""
if {$TotalGenerics > 0} {
  puts $out "## Generics"
  puts $out ""
  puts $out "| Name | Type | Default | Value |"
  puts $out "|---|---|---|---|"
  for {set i 0} {$i < $TotalGenerics} {incr i} {
    puts $out "| [cell [lindex $GenericName $i]] | [cell [lindex $GenericType $i]]\
| [cell [lindex $GenericDefault $i]] | [cell [lindex $GenericValue $i]] |"
  }
  puts $out ""
}
puts $out "## Ports"
puts $out ""
puts $out "| Name | Direction | Type | Width |"
puts $out "|---|---|---|---:|"
for {set i 0} {$i < $TotalPorts} {incr i} {
  set left [lindex $LeftRange $i]
  set right [lindex $RightRange $i]
  if {$left eq "" || $right eq ""} {
    set width "?"
  } elseif {$left == -1 && $right == -1} {
    set width 1
  } else {
    set width [expr {abs($left - $right) + 1}]
  }
  puts $out "| [cell [lindex $PortName $i]] | [direction [lindex $PortDir $i]]\
| [cell [lindex $PortType $i]] | $width |"
}
close $out

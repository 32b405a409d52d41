# Writes one CSV row per port after a header row. Fields are quoted as RFC 4180 asks: a field
# holding a comma, a quote or a line break is enclosed in quotes, its quotes doubled. Lines end
# in CRLF, as the RFC says, so spreadsheet programs read the file on every system.
proc csvField {text} {
  if {[regexp {[",\r\n]} $text]} {
    return "\"[string map {"\"" "\"\""} $text]\""
  }
  return $text
}

proc direction {letter} {
  switch -- $letter {
    I { return in }
    B { return inout }
    default { return out }
  }
}

set out [open $OutputFileName w]
fconfigure $out -translation crlf
puts $out "name,direction,type,left,right,width"
for {set i 0} {$i < $TotalPorts} {incr i} {
  set left [lindex $LeftRange $i]
  set right [lindex $RightRange $i]
  if {$left eq "" || $right eq ""} {
    set width ""
  } elseif {$left == -1 && $right == -1} {
    set left ""
    set right ""
    set width 1
  } else {
    set width [expr {abs($left - $right) + 1}]
  }
  set row {}
  foreach field [list [lindex $PortName $i] [direction [lindex $PortDir $i]] \
                     [lindex $PortType $i] $left $right $width] {
    lappend row [csvField $field]
  }
  puts $out [join $row ,]
}
close $out

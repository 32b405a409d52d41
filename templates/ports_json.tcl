# Writes the design unit as one JSON object: its name, language, context, generics (name, type,
# default, value) and ports (name, direction, declared type, left, right, width). A single-bit
# port has null bounds; a bound that could not be evaluated is null, and so is its width.
proc jsonString {text} {
  set out "\""
  foreach ch [split $text ""] {
    switch -- $ch {
      "\"" { append out "\\\"" }
      "\\" { append out "\\\\" }
      default {
        scan $ch %c code
        if {$code < 0x20 || $code == 0x7f} {
          append out [format "\\u%04x" $code]
        } else {
          append out $ch
        }
      }
    }
  }
  return "$out\""
}

proc jsonNumber {text} {
  if {$text eq ""} { return null }
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
fconfigure $out -translation lf
puts $out "\{"
puts $out "  \"unit\": [jsonString $ModuleName],"
puts $out "  \"language\": [jsonString $Language],"
puts $out "  \"context\": [jsonString $Context],"
puts $out "  \"generics\": \["
for {set i 0} {$i < $TotalGenerics} {incr i} {
  set comma [expr {$i + 1 < $TotalGenerics ? "," : ""}]
  puts $out "    \{\"name\": [jsonString [lindex $GenericName $i]],\
\"type\": [jsonString [lindex $GenericType $i]],\
\"default\": [jsonString [lindex $GenericDefault $i]],\
\"value\": [jsonString [lindex $GenericValue $i]]\}$comma"
}
puts $out "  \],"
puts $out "  \"ports\": \["
for {set i 0} {$i < $TotalPorts} {incr i} {
  set left [lindex $LeftRange $i]
  set right [lindex $RightRange $i]
  if {$left eq "" || $right eq ""} {
    set width null
  } elseif {$left == -1 && $right == -1} {
    set left ""
    set right ""
    set width 1
  } else {
    set width [expr {abs($left - $right) + 1}]
  }
  set comma [expr {$i + 1 < $TotalPorts ? "," : ""}]
  puts $out "    \{\"name\": [jsonString [lindex $PortName $i]],\
\"direction\": [jsonString [direction [lindex $PortDir $i]]],\
\"type\": [jsonString [lindex $PortType $i]],\
\"left\": [jsonNumber $left], \"right\": [jsonNumber $right], \"width\": $width\}$comma"
}
puts $out "  \]"
puts $out "\}"
close $out

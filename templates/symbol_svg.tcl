# Draws the design unit's schematic symbol as SVG: inputs on the left, outputs on the right,
# inouts at the bottom, buses as thick lines labelled with their range, the generics listed under
# the title. Text is monospaced, so the box can be sized to the longest names exactly.
set charWidth 7.2
set pitch 20
set pinLength 30
set margin 10
set titleHeight 24
set lineHeight 16

proc xml {text} {
  return [string map {& &amp; < &lt; > &gt; \" &quot; ' &apos;} $text]
}

proc textWidth {text} {
  global charWidth
  return [expr {[string length $text] * $charWidth}]
}

# Splits the ports by side, keeping declaration order within each.
set sides(I) {}
set sides(O) {}
set sides(B) {}
for {set i 0} {$i < $TotalPorts} {incr i} {
  set dir [lindex $PortDir $i]
  if {$dir ne "I" && $dir ne "B"} { set dir O }
  lappend sides($dir) $i
}

proc rangeLabel {i} {
  global LeftRange RightRange
  set left [lindex $LeftRange $i]
  set right [lindex $RightRange $i]
  if {$left eq "" || $right eq ""} { return {[?]} }
  if {$left == -1 && $right == -1} { return "" }
  return "\[$left:$right\]"
}

proc isBus {i} {
  return [expr {[rangeLabel $i] ne ""}]
}

proc widest {indices} {
  global PortName
  set width 0
  foreach i $indices {
    set width [expr {max($width, [textWidth [lindex $PortName $i]])}]
  }
  return $width
}

set genericLines {}
for {set g 0} {$g < $TotalGenerics} {incr g} {
  set value [lindex $GenericValue $g]
  set line [lindex $GenericName $g]
  if {$value ne ""} { append line " = $value" }
  lappend genericLines $line
}

# The box: wide enough for the title, every generic line, the widest input and output label
# side by side, and the inout pins along the bottom edge.
set headerWidth [textWidth $ModuleName]
foreach line $genericLines {
  set headerWidth [expr {max($headerWidth, [textWidth $line])}]
}
set sideWidth [expr {[widest $sides(I)] + [widest $sides(O)] + 3 * $margin}]
set bottomWidth [expr {([llength $sides(B)] + 1) * $pitch}]
set boxWidth [expr {max($headerWidth + 2 * $margin, $sideWidth, $bottomWidth, 80)}]
set headerHeight [expr {$titleHeight + [llength $genericLines] * $lineHeight + $margin}]
set rows [expr {max([llength $sides(I)], [llength $sides(O)], 1)}]
set bottomLabel [widest $sides(B)]
set boxHeight [expr {$headerHeight + $rows * $pitch + $bottomLabel + $margin}]

# Room outside the box for the pins and the range labels above them.
set rangeRoom 0
for {set i 0} {$i < $TotalPorts} {incr i} {
  set rangeRoom [expr {max($rangeRoom, [textWidth [rangeLabel $i]])}]
}
set outside [expr {max($pinLength, $rangeRoom + 4)}]
set boxX [expr {$margin + $outside}]
set boxY $margin
set width [expr {int(ceil($boxX + $boxWidth + $outside + $margin))}]
set height [expr {int(ceil($boxY + $boxHeight + $outside + $margin))}]

set out [open $OutputFileName w]
fconfigure $out -translation lf
puts $out "<?xml version=\"1.0\" encoding=\"UTF-8\"?>"
puts $out "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"$width\" height=\"$height\"\
viewBox=\"0 0 $width $height\" font-family=\"monospace\" font-size=\"12\">"
puts $out "  <title>[xml $ModuleName]</title>"
puts $out "  <rect x=\"$boxX\" y=\"$boxY\" width=\"$boxWidth\" height=\"$boxHeight\"\
fill=\"#fffbe6\" stroke=\"#000\" stroke-width=\"2\"/>"
set centre [expr {$boxX + $boxWidth / 2.0}]
puts $out "  <text x=\"$centre\" y=\"[expr {$boxY + 17}]\" text-anchor=\"middle\"\
font-weight=\"bold\" font-size=\"14\">[xml $ModuleName]</text>"
set y [expr {$boxY + $titleHeight + 8}]
foreach line $genericLines {
  puts $out "  <text x=\"$centre\" y=\"$y\" text-anchor=\"middle\" fill=\"#555\">[xml $line]</text>"
  set y [expr {$y + $lineHeight}]
}

proc pinLine {x1 y1 x2 y2 bus} {
  set stroke [expr {$bus ? 4 : 1.5}]
  return "  <line x1=\"$x1\" y1=\"$y1\" x2=\"$x2\" y2=\"$y2\" stroke=\"#000\" stroke-width=\"$stroke\"/>"
}

set row 0
foreach i $sides(I) {
  set py [expr {$boxY + $headerHeight + $row * $pitch + $pitch / 2.0}]
  puts $out [pinLine [expr {$boxX - $outside}] $py $boxX $py [isBus $i]]
  puts $out "  <text x=\"[expr {$boxX + 6}]\" y=\"[expr {$py + 4}]\">[xml [lindex $PortName $i]]</text>"
  if {[isBus $i]} {
    puts $out "  <text x=\"[expr {$boxX - 4}]\" y=\"[expr {$py - 5}]\" text-anchor=\"end\"\
font-size=\"10\">[xml [rangeLabel $i]]</text>"
  }
  incr row
}
set row 0
set right [expr {$boxX + $boxWidth}]
foreach i $sides(O) {
  set py [expr {$boxY + $headerHeight + $row * $pitch + $pitch / 2.0}]
  puts $out [pinLine $right $py [expr {$right + $outside}] $py [isBus $i]]
  puts $out "  <text x=\"[expr {$right - 6}]\" y=\"[expr {$py + 4}]\"\
text-anchor=\"end\">[xml [lindex $PortName $i]]</text>"
  if {[isBus $i]} {
    puts $out "  <text x=\"[expr {$right + 4}]\" y=\"[expr {$py - 5}]\"\
font-size=\"10\">[xml [rangeLabel $i]]</text>"
  }
  incr row
}
set column 1
set bottom [expr {$boxY + $boxHeight}]
foreach i $sides(B) {
  set px [expr {$boxX + $column * $boxWidth / ([llength $sides(B)] + 1.0)}]
  puts $out [pinLine $px $bottom $px [expr {$bottom + $outside}] [isBus $i]]
  puts $out "  <text x=\"[expr {$px + 4}]\" y=\"[expr {$bottom - 6}]\"\
transform=\"rotate(-90 [expr {$px + 4}] [expr {$bottom - 6}])\">[xml [lindex $PortName $i]]</text>"
  if {[isBus $i]} {
    puts $out "  <text x=\"[expr {$px + 5}]\" y=\"[expr {$bottom + $outside - 2}]\"\
font-size=\"10\">[xml [rangeLabel $i]]</text>"
  }
  incr column
}
puts $out "</svg>"
close $out

set out [open $OutputFileName w]
puts $out $ProjectName
puts $out $ErrorFileName
puts $out [string length $LibLocation]
close $out

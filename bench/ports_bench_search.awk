# Writes the search template of ports_bench.sh for N ports (awk -v n=N): a name test of every
# kind in the body of an iteration over all ports, then one @MAPSIGNAL per port and the mapped
# list, so that each test and each mapping must find its port among all N.
BEGIN {
  print "@SET SIGDELIM=\n@@ITERATE@%SIGNAL%@IFHAS PORT=p000001@+@ENDIF@" \
        "@IFNHAS IPORT=p1?????@-@ENDIF@@IFHAS BUSPORT=*@b@ENDIF@@ITERATOR@@ENDITERATE@"
  for (i = 0; i < n; i++) printf "@MAPSIGNAL p%06d TO m%06d@\n", i, i
  print "@MAP@%signal%"
}

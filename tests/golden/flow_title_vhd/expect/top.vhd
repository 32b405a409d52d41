title=top
file=top.vhd
ext=vhd
module=top
project=demo
design=demo
tool=pinforge
ver=[]

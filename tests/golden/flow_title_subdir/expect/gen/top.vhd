title=top
file=gen/top.vhd
ext=vhd
module=top
project=demo
design=demo
tool=pinforge
ver=[]

title=top.vhdl
file=top.vhdl
ext=vhdl
module=top
project=demo
design=demo
tool=pinforge
ver=[]

title=top
file=top.v
ext=v
module=top
project=demo
design=demo
tool=pinforge
ver=[]

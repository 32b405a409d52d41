title=my.vendor
file=my.vendor.vhd
ext=vendor.vhd
module=top
project=demo
design=demo
tool=pinforge
ver=[]

# The fuzz entry points and the libraries each one needs. Shared by the libFuzzer build
# (fuzz/) and the corpus replay tests (tests/fuzz/), so both link the same code.
set(PINFORGE_FUZZ_TARGETS template_fuzz verilog_fuzz verilog_pp_fuzz vhdl_fuzz)
set(PINFORGE_FUZZ_LIBS_template_fuzz pinforge_engine)
set(PINFORGE_FUZZ_LIBS_verilog_fuzz pinforge_scan_verilog)
set(PINFORGE_FUZZ_LIBS_verilog_pp_fuzz pinforge_scan_verilog)
set(PINFORGE_FUZZ_LIBS_vhdl_fuzz pinforge_scan_vhdl)

entity top_tb is
end entity top_tb;

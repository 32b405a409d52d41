entity alu is
end entity alu;

package pkg is
end package pkg;

entity other is
end entity other;

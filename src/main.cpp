// TEMPORARY: replaced by the real entry point.
int main() { return 1; }

// Entry of the focusing job: takes the host's command string.
int main() { return 0; }

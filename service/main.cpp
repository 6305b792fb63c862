// The background service: it links the message model that its peers exchange and does no work of its own.
int main() { return 0; }

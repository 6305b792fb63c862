// The background service of the feature for inviting nearby devices into a shared session. It holds the
// message model that its peers exchange and does no work of its own.
int main() { return 0; }

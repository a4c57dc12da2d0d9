/* A program that does nothing: what starting any costs. */

int main(void) { return 0; }

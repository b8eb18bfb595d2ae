int answer(void);
int answer(void) { return 42; }

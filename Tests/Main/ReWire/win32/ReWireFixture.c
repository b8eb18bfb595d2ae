/* A library for the place of ReWire's, with one of its functions. */
__declspec(dllexport) int RWM2OpenImp(void);
int RWM2OpenImp(void) { return 1; }

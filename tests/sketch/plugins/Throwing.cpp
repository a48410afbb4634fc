// A plug-in that throws what no program expects.
extern "C" __attribute__((visibility("default"))) void* createPenInst() {
  throw 5;
}

// A module from another API generation: the program must refuse it before using anything else.
extern "C" {
__attribute__((visibility("default"))) unsigned int apiVersion() {
  return 0x70000;
}
__attribute__((visibility("default"))) unsigned int getNumPlugins() {
  return 0;
}
__attribute__((visibility("default"))) void* getPlugin(int) {
  return nullptr;
}
}

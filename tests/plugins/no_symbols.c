/* A shared object that is no plug-in at all. */
extern int unrelated;
__attribute__((visibility("default"))) int unrelated = 1;

#ifndef SYSTEMCONFIGURATION_EXPORT_H
#define SYSTEMCONFIGURATION_EXPORT_H

// Marks what the shared library gives to its callers; everything else in it is hidden. On a class it also
// keeps the class's run-time type information one object, so that a caller can catch what the library throws.
#define SYSTEMCONFIGURATION_EXPORT __attribute__((visibility("default")))

#endif

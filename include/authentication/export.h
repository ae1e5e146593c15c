/// Marks what libvelmor exports; everything else is hidden.
#ifndef AUTHENTICATION_EXPORT_H
#define AUTHENTICATION_EXPORT_H

#define VELMOR_EXPORT __attribute__((visibility("default")))

#endif  // AUTHENTICATION_EXPORT_H

/// What clang's thread-safety analysis is told; nothing for other compilers.
#ifndef AUTHENTICATION_THREAD_ANNOTATIONS_H
#define AUTHENTICATION_THREAD_ANNOTATIONS_H

#ifdef __clang__
#define VELMOR_THREAD_ATTRIBUTE(attribute) __attribute__((attribute))
#else
#define VELMOR_THREAD_ATTRIBUTE(attribute)
#endif

#define VELMOR_CAPABILITY VELMOR_THREAD_ATTRIBUTE(capability("mutex"))
#define VELMOR_SCOPED_CAPABILITY VELMOR_THREAD_ATTRIBUTE(scoped_lockable)
#define VELMOR_GUARDED_BY(mutex) VELMOR_THREAD_ATTRIBUTE(guarded_by(mutex))
#define VELMOR_ACQUIRE(...) VELMOR_THREAD_ATTRIBUTE(acquire_capability(__VA_ARGS__))
#define VELMOR_RELEASE(...) VELMOR_THREAD_ATTRIBUTE(release_capability(__VA_ARGS__))

#endif  // AUTHENTICATION_THREAD_ANNOTATIONS_H

// TARN_EXPORT marks the classes and functions that TarnCommandBinder.so exports; everything else
// in the library is hidden.
#ifndef TARN_EXPORT_H_
#define TARN_EXPORT_H_

#define TARN_EXPORT __attribute__((visibility("default")))

#endif  // TARN_EXPORT_H_

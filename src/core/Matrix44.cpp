#include "core/Matrix44.h"

// constinit: the identity is ready before any other static initialiser runs, so
// objects built at start-up from it never see an all-zero matrix.
template <> constinit const Matrix44<float> Matrix44<float>::Identity = Matrix44<float>();

// Instantiating every member here makes the library's build check all of them,
// not only those some caller happens to use.
template class Matrix44<float>;
template class Matrix33<float>;

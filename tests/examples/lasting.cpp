#include "marshaller/lasting.cpp" // the marshaller keeps the same here

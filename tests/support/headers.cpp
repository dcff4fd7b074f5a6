// Compiles nothing of its own: the headers that every test includes are precompiled on its behalf.

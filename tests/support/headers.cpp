// Empty: the shared headers are precompiled with this file.

// Pip is new at the lighthouse. Say hello.
greet("Pip")

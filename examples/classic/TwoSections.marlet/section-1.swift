// Pip counts the steps of the lighthouse.
let steps = 12

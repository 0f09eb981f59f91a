while true {
    // The lamp goes round, and you stop it.
    break
}

for turn in 1...4 {
    print("turn \(turn)")
}

public func blink(times: Int) {
    for _ in 1...times { print("*") }
}

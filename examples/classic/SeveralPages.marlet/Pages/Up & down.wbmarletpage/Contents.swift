for step in stride(from: 12, through: 1, by: -1) {
    print(step)
}

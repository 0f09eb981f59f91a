for step in 1...steps {
    print("step \(step)")
}

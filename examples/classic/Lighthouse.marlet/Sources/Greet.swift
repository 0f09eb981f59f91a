public func greet(_ name: String) { print("Hello, \(name)!") }

/// A bird that hops from stair to stair and remembers its way.
public struct Bird {
    /// The stairs that the bird has stood on, in order.
    public private(set) var path: [Int] = []

    public init() {}

    /// Hops to a stair. The lowest stair is number 1.
    public mutating func hop(to stair: Int) {
        path.append(stair)
        print("Pip is on stair \(stair).")
    }
}

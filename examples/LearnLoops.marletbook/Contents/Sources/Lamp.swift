/// The lamp at the top of the lighthouse. It counts its own flashes.
public struct Lamp {
    /// How often the lamp has flashed so far.
    public private(set) var flashes = 0

    public init() {}

    /// Lights the lamp for a moment.
    public mutating func flash() {
        flashes += 1
        print("(flash)")
    }
}

/// How bright the lamp shines, in percent.
public typealias Brightness = Int

/**
	Compiles the raw primitive declarations with nothing else: the conformance
	test reads the resulting bytecode. Built with `-dce full`, so it also shows
	that `@:keep` holds every declaration and every `InitConfig` field.
**/
class RawNatives {
	static function main() {
		// Referenced only so that the class is part of the compilation.
		var natives = tarnwick.Natives;
	}
}

/**
	Declarations the conformance checker must reject: `leave_lobby` takes an
	Int callback in the library, not a Bool one, and `missing_primitive` does not
	exist. `destroy_lobby` is declared correctly and must pass.
**/
@:keep
class WrongNatives {
	@:hlNative("tarnwick", "leave_lobby")
	static function leave_lobby(lobbyId:hl.Bytes, onLeft:Bool -> Void):Void {}

	@:hlNative("tarnwick", "destroy_lobby")
	static function destroy_lobby(lobbyId:hl.Bytes, onDestroyed:Int -> Void):Void {}

	@:hlNative("tarnwick", "missing_primitive")
	static function missing_primitive():Void {}

	static function main() {}
}

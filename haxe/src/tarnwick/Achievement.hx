package tarnwick;

/** One achievement of the local player. A field is null when the record lacks it. **/
class Achievement {
	/** Achievement id, as defined in the developer portal. **/
	public final id:Null<String>;
	/** Whether the player has unlocked it. **/
	public final unlock:Null<Bool>;

	public function new(id:Null<String>, unlock:Null<Bool>) {
		this.id = id;
		this.unlock = unlock;
	}

	public function toString():String {
		return 'Achievement($id, unlock=$unlock)';
	}
}
